// The pull operations (DSP0200, 5.4.2): a result is opened, and fetched in portions.
#include <algorithm>

#include "Request.h"
#include "wbem/ObjectWriter.h"
#include "wbem/XmlText.h"

namespace cimom::wbem {

namespace {

using Session = EnumerationSession;

/// More objects come in no portion, whatever a client asks for.
constexpr std::uint32_t largestPortion = 100'000;

/// The parameters that all Open operations have.
struct Opening {
    std::chrono::seconds timeout{0};
    std::uint32_t portion = 0;
};

Opening readOpening(Request& request) {
    Parameters& parameters = request.parameters;
    const auto language = parameters.text("FilterQueryLanguage");
    const auto query = parameters.text("FilterQuery");
    const bool continueOnError = parameters.flag("ContinueOnError", false);
    const auto timeout = parameters.number("OperationTimeout");
    const std::uint32_t portion = parameters.number("MaxObjectCount").value_or(0);
    parameters.finish();
    if (language || query) {
        throw CimError(CimStatus::filteredEnumerationNotSupported, "");
    }
    if (continueOnError) {
        throw CimError(CimStatus::continuationOnErrorNotSupported, "");
    }
    return {request.sessions.timeoutFor(timeout), std::min(portion, largestPortion)};
}

template <typename Object>
std::vector<Object> takePortion(std::vector<Object>& rest, std::size_t count) {
    std::vector<Object> portion;
    portion.reserve(std::min(count, rest.size()));
    while (!rest.empty() && portion.size() < count) {
        portion.push_back(std::move(rest.back()));
        rest.pop_back();
    }
    return portion;
}

std::string sequenceState(const std::string& context) {
    std::string text = R"(<PARAMVALUE NAME="EnumerationContext" PARAMTYPE="string"><VALUE>)";
    appendText(text, context);
    text += R"(</VALUE></PARAMVALUE><PARAMVALUE NAME="EndOfSequence" PARAMTYPE="boolean"><VALUE>)";
    text += context.empty() ? "TRUE" : "FALSE";
    return text + "</VALUE></PARAMVALUE>";
}

Answer pathsPortion(Request& request, Session::Paths paths, const std::string& context) {
    return listAnswer(
        request.call, std::move(paths),
        [host = request.manager.host()](std::string& out, const ObjectPath& path) {
            writeInstancePath(out, path, host);
        },
        sequenceState(context));
}

Answer instancesPortion(Request& request, Session::Instances instances, bool classOrigin,
                        const std::string& context) {
    const ClassRepository* const origins = classOrigin ? &request.manager.repository() : nullptr;
    return listAnswer(
        request.call, std::move(instances),
        [origins, host = request.manager.host()](std::string& out, const Instance& instance) {
            out += "<VALUE.INSTANCEWITHPATH>";
            writeInstancePath(out, instance.path, host);
            writeInstanceOf(out, instance, origins);
            out += "</VALUE.INSTANCEWITHPATH>";
        },
        sequenceState(context));
}

/// Answers the first portion, and keeps what is left.
template <typename Object>
std::pair<std::vector<Object>, std::string> begin(Request& request, const Opening& opening,
                                                  std::vector<Object> objects, bool classOrigin) {
    std::reverse(objects.begin(), objects.end());
    std::vector<Object> portion = takePortion(objects, opening.portion);
    std::string context;
    if (!objects.empty()) {
        context = request.sessions.open(
            {std::move(objects), classOrigin, opening.timeout, request.caller.user});
    }
    return {std::move(portion), std::move(context)};
}

Answer openPaths(Request& request, const Opening& opening, PathsResult result) {
    requireOk(result.status);
    auto [portion, context] = begin(request, opening, present(std::move(result.paths)), false);
    return pathsPortion(request, std::move(portion), context);
}

Answer openInstances(Request& request, const Opening& opening, std::vector<Instance> instances,
                     bool classOrigin) {
    auto [portion, context] = begin(request, opening, std::move(instances), classOrigin);
    return instancesPortion(request, std::move(portion), classOrigin, context);
}

Answer openEnumerateInstances(Request& request) {
    const std::string className = request.parameters.requiredClassName("ClassName");
    const bool deep = request.parameters.flag("DeepInheritance", true);
    const bool classOrigin = request.parameters.flag("IncludeClassOrigin", false);
    const InstanceRequest reading{request.parameters.texts("PropertyList"),
                                  request.caller.user.value_or("")};
    const Opening opening = readOpening(request);
    auto result = request.manager.enumerateInstances(classPath(request, className), reading);
    requireOk(result.status);
    std::vector<Instance> instances = present(std::move(result.instances));
    if (!deep) {
        cutToClass(instances, requireClass(request, className, CimStatus::invalidClass));
    }
    return openInstances(request, opening, std::move(instances), classOrigin);
}

Answer openEnumerateInstancePaths(Request& request) {
    const std::string className = request.parameters.requiredClassName("ClassName");
    const Opening opening = readOpening(request);
    return openPaths(
        request, opening,
        request.manager.enumerateInstanceNames(classPath(request, className),
                                               {std::nullopt, request.caller.user.value_or("")}));
}

/// The parameters of the Open operations about associations; there the source is
/// always an instance.
struct Source {
    ObjectPath path;
    AssociationRequest filter;
    bool classOrigin = false;
};

Source readSource(Request& request, bool associators, bool instances) {
    Parameters& parameters = request.parameters;
    Source source;
    source.path = located(request, parameters.requiredInstanceName("InstanceName"));
    source.filter.resultClass = parameters.className("ResultClass");
    source.filter.role = parameters.text("Role");
    if (associators) {
        source.filter.assocClass = parameters.className("AssocClass");
        source.filter.resultRole = parameters.text("ResultRole");
    }
    if (instances) {
        source.classOrigin = parameters.flag("IncludeClassOrigin", false);
        source.filter.propertyList = parameters.texts("PropertyList");
    }
    source.filter.principal = request.caller.user.value_or("");
    return source;
}

Answer openAssociated(Request& request, bool associators) {
    const Source source = readSource(request, associators, true);
    const Opening opening = readOpening(request);
    auto result = associators ? request.manager.associators(source.path, source.filter)
                              : request.manager.references(source.path, source.filter);
    requireOk(result.status);
    return openInstances(request, opening, present(std::move(result.instances)),
                         source.classOrigin);
}

Answer openAssociatedPaths(Request& request, bool associators) {
    const Source source = readSource(request, associators, false);
    const Opening opening = readOpening(request);
    return openPaths(request, opening,
                     associators ? request.manager.associatorNames(source.path, source.filter)
                                 : request.manager.referenceNames(source.path, source.filter));
}

/// What a Pull operation asks for.
struct Pulling {
    std::string context;
    std::size_t portion = 0;
};

Pulling readPulling(Request& request) {
    Pulling pulling;
    pulling.context = request.parameters.requiredText("EnumerationContext");
    pulling.portion = std::min(request.parameters.requiredNumber("MaxObjectCount"), largestPortion);
    request.parameters.finish();
    return pulling;
}

/// The next portion of a session with such objects, and the context to go on with.
template <typename Objects>
std::pair<Objects, std::string> pull(Request& request, bool* classOrigin) {
    const Pulling pulling = readPulling(request);
    Objects portion;
    std::string context = pulling.context;
    request.sessions.use(pulling.context, request.caller.user, [&](Session& session) {
        auto* const rest = std::get_if<Objects>(&session.objects);
        if (rest == nullptr) {
            throw CimError(CimStatus::invalidEnumerationContext,
                           "this enumeration was opened for another kind of pull");
        }
        portion = takePortion(*rest, pulling.portion);
        if (classOrigin != nullptr) {
            *classOrigin = session.classOrigin;
        }
        if (rest->empty()) {
            context.clear();
        }
    });
    return {std::move(portion), std::move(context)};
}

Answer pullInstancesWithPath(Request& request) {
    bool classOrigin = false;
    auto [portion, context] = pull<Session::Instances>(request, &classOrigin);
    return instancesPortion(request, std::move(portion), classOrigin, context);
}

Answer pullInstancePaths(Request& request) {
    auto [portion, context] = pull<Session::Paths>(request, nullptr);
    return pathsPortion(request, std::move(portion), context);
}

/// DSP0200 has this for queries, which are not served; a client that does not need
/// the paths may use it for any instances.
Answer pullInstances(Request& request) {
    bool classOrigin = false;
    auto [portion, context] = pull<Session::Instances>(request, &classOrigin);
    const ClassRepository* const origins = classOrigin ? &request.manager.repository() : nullptr;
    return listAnswer(
        request.call, std::move(portion),
        [origins](std::string& out, const Instance& instance) {
            writeInstanceOf(out, instance, origins);
        },
        sequenceState(context));
}

Answer closeEnumeration(Request& request) {
    const std::string context = request.parameters.requiredText("EnumerationContext");
    request.parameters.finish();
    request.sessions.close(context, request.caller.user);
    return plainAnswer(request.call, "");
}

Answer enumerationCount(Request& request) {
    const std::string context = request.parameters.requiredText("EnumerationContext");
    request.parameters.finish();
    std::size_t count = 0;
    request.sessions.use(context, request.caller.user,
                         [&count](const Session& session) { count = session.size(); });
    return plainAnswer(request.call,
                       "<IRETURNVALUE><VALUE>" + std::to_string(count) + "</VALUE></IRETURNVALUE>");
}

}  // namespace

std::vector<NamedOperation> pullOperations() {
    return {
        {"OpenEnumerateInstances", openEnumerateInstances},
        {"OpenEnumerateInstancePaths", openEnumerateInstancePaths},
        {"OpenAssociatorInstances", [](Request& request) { return openAssociated(request, true); }},
        {"OpenAssociatorInstancePaths",
         [](Request& request) { return openAssociatedPaths(request, true); }},
        {"OpenReferenceInstances", [](Request& request) { return openAssociated(request, false); }},
        {"OpenReferenceInstancePaths",
         [](Request& request) { return openAssociatedPaths(request, false); }},
        {"PullInstancesWithPath", pullInstancesWithPath},
        {"PullInstancePaths", pullInstancePaths},
        {"PullInstances", pullInstances},
        {"CloseEnumeration", closeEnumeration},
        {"EnumerationCount", enumerationCount},
    };
}

}  // namespace cimom::wbem
