// The pull operations (DSP0200, 5.4.2): a result is opened, and fetched in portions.
#include <algorithm>
#include <optional>
#include <utility>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimxml/ObjectWriter.h"
#include "cimxml/XmlText.h"
#include "operations/PulledRecords.h"
#include "operations/Request.h"
#include "operations/RequestedQuery.h"

namespace cimom::wbem {

namespace {

using Session = EnumerationSession;

/// No portion has more objects, whatever a client asks for.
constexpr std::uint32_t largestPortion = 100'000;

/// The parameters that all Open operations have.
struct Opening {
    std::chrono::seconds timeout{0};
    std::uint32_t portion = 0;
};

/// What is behind the query of a filter.
Opening readPortions(Request& request) {
    Parameters& parameters = request.parameters;
    const bool continueOnError = parameters.flag("ContinueOnError", false);
    const auto timeout = parameters.number("OperationTimeout");
    const std::uint32_t portion = parameters.number("MaxObjectCount").value_or(0);
    parameters.finish();
    if (continueOnError) {
        throw CimError(CimStatus::continuationOnErrorNotSupported, "");
    }
    return {request.sessions.timeoutFor(timeout), std::min(portion, largestPortion)};
}

Opening readOpening(Request& request) {
    const auto language = request.parameters.text("FilterQueryLanguage");
    const auto query = request.parameters.text("FilterQuery");
    const Opening opening = readPortions(request);
    if (language || query) {
        throw CimError(CimStatus::filteredEnumerationNotSupported, "");
    }
    return opening;
}

/// The objects of one response.
struct Portion {
    RecordReader reader;
    std::string context;  ///< to go on with; empty: these were the last
};

/// The next objects of a session, at most `count`.
Portion takePortion(Session& session, std::size_t count, const std::string& context) {
    RecordReader rest(session.records, session.position, session.records->size());
    if (count >= session.left) {
        session.left = 0;
        return {std::move(rest), ""};
    }
    RecordReader behind = rest;
    behind.skip(count);
    const std::size_t begin = session.position;
    session.position = behind.position();
    session.left -= count;
    return {RecordReader(session.records, begin, session.position), context};
}

std::string sequenceState(const std::string& context) {
    std::string text = R"(<PARAMVALUE NAME="EnumerationContext" PARAMTYPE="string"><VALUE>)";
    appendText(text, context);
    text += R"(</VALUE></PARAMVALUE><PARAMVALUE NAME="EndOfSequence" PARAMTYPE="boolean"><VALUE>)";
    text += context.empty() ? "TRUE" : "FALSE";
    return text + "</VALUE></PARAMVALUE>";
}

enum class Form { path, instance, instanceWithPath };

/// `further`: output parameters in front of the others.
ResponseBody portionResponse(Request& request, Portion portion, Form form,
                             const std::string& further = "") {
    return {
        responseHead(request.call) + "<IRETURNVALUE>",
        [reader = std::move(portion.reader), form](std::string& out) mutable {
            const auto record = reader.next();
            if (!record) {
                return false;
            }
            const bool both = form == Form::instanceWithPath;
            out += both ? "<VALUE.INSTANCEWITHPATH>" : "";
            out += form == Form::instance ? "" : record->path;
            out += record->object;
            out += both ? "</VALUE.INSTANCEWITHPATH>" : "";
            return true;
        },
        "</IRETURNVALUE>" + further + sequenceState(portion.context) + responseTail(request.call)};
}

/// Responds with the first portion, and keeps what is left.
ResponseBody begin(Request& request, const Opening& opening, Session::Kind kind, Form form,
                   const SpooledResult& result, const std::string& further = "") {
    Session session{kind,
                    result.spool,
                    0,
                    result.count,
                    opening.timeout,
                    request.caller.user,
                    request.caller.address};
    Portion portion = takePortion(session, opening.portion, "");
    if (session.left > 0) {
        portion.context = request.sessions.open(std::move(session));
    }
    return portionResponse(request, std::move(portion), form, further);
}

template <typename Ask>
ResponseBody openPaths(Request& request, const Opening& opening, Ask&& ask) {
    return begin(request, opening, Session::Kind::paths, Form::path,
                 spooled<ObjectPath>(
                     request,
                     [&host = request.manager.host(), text = std::string()](
                         std::string& out, const ObjectPath& path) mutable {
                         text.clear();
                         writeInstancePath(text, path, host);
                         appendRecord(out, text, "");
                     },
                     std::forward<Ask>(ask)));
}

/// Writes instances as records, with class origins if there is a repository to tell them.
/// `cut`: the class to whose properties they are cut; null: all are shown.
SpoolingReceiver<Instance>::Write recordWriter(const Request& request,
                                               const ClassRepository* origins,
                                               const ClassDeclaration* cut) {
    return [&host = request.manager.host(), origins, cut, path = std::string(),
            text = std::string()](std::string& out, Instance& instance) mutable {
        cutToClass(instance, cut);
        path.clear();
        text.clear();
        writeInstancePath(path, instance.path, host);
        writeInstanceOf(text, instance, origins);
        appendRecord(out, path, text);
    };
}

template <typename Ask>
ResponseBody openInstances(Request& request, const Opening& opening, bool classOrigin,
                           const ClassDeclaration* cut, Ask&& ask) {
    const ClassRepository* const origins = classOrigin ? &request.manager.repository() : nullptr;
    return begin(
        request, opening, Session::Kind::instances, Form::instanceWithPath,
        spooled<Instance>(request, recordWriter(request, origins, cut), std::forward<Ask>(ask)));
}

ResponseBody openQueryInstances(Request& request) {
    const RequestedQuery query = requiredQuery(request, "FilterQueryLanguage", "FilterQuery");
    const bool wantsClass = request.parameters.flag("ReturnQueryResultClass", false);
    const Opening opening = readPortions(request);
    std::string resultClass;
    if (wantsClass) {
        ClassForm form;
        form.propertyList = query.query.properties();
        resultClass = R"(<PARAMVALUE NAME="QueryResultClass">)";
        writeClass(resultClass, query.declaration, form);
        resultClass += "</PARAMVALUE>";
    }
    return begin(request, opening, Session::Kind::instances, Form::instance,
                 spooled<Instance>(request, recordWriter(request, nullptr, nullptr),
                                   [&](auto& receiver) {
                                       return request.manager.execQuery(
                                           request.call.nameSpace, query.query,
                                           {std::nullopt, request.caller.user.value_or("")},
                                           receiver);
                                   }),
                 resultClass);
}

ResponseBody openEnumerateInstances(Request& request) {
    const std::string className = request.parameters.requiredClassName("ClassName");
    const bool deep = request.parameters.flag("DeepInheritance", true);
    const bool classOrigin = request.parameters.flag("IncludeClassOrigin", false);
    const InstanceRequest reading{request.parameters.texts("PropertyList"),
                                  request.caller.user.value_or("")};
    const Opening opening = readOpening(request);
    const ClassDeclaration* const cut =
        deep ? nullptr : request.manager.repository().find(className);
    return openInstances(request, opening, classOrigin, cut, [&](auto& receiver) {
        return request.manager.enumerateInstances(classPath(request, className), reading, receiver);
    });
}

ResponseBody openEnumerateInstancePaths(Request& request) {
    const std::string className = request.parameters.requiredClassName("ClassName");
    const Opening opening = readOpening(request);
    const InstanceRequest reading{std::nullopt, request.caller.user.value_or("")};
    return openPaths(request, opening, [&](auto& receiver) {
        return request.manager.enumerateInstanceNames(classPath(request, className), reading,
                                                      receiver);
    });
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

ResponseBody openAssociated(Request& request, bool associators) {
    const Source source = readSource(request, associators, true);
    const Opening opening = readOpening(request);
    return openInstances(request, opening, source.classOrigin, nullptr, [&](auto& receiver) {
        return associators ? request.manager.associators(source.path, source.filter, receiver)
                           : request.manager.references(source.path, source.filter, receiver);
    });
}

ResponseBody openAssociatedPaths(Request& request, bool associators) {
    const Source source = readSource(request, associators, false);
    const Opening opening = readOpening(request);
    return openPaths(request, opening, [&](auto& receiver) {
        return associators ? request.manager.associatorNames(source.path, source.filter, receiver)
                           : request.manager.referenceNames(source.path, source.filter, receiver);
    });
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

/// Responds with the next portion of a session with objects of that kind.
ResponseBody pull(Request& request, Session::Kind kind, Form form) {
    const Pulling pulling = readPulling(request);
    std::optional<Portion> portion;
    request.sessions.use(pulling.context, request.caller.user, [&](Session& session) {
        if (session.kind != kind) {
            throw CimError(CimStatus::invalidEnumerationContext,
                           "this enumeration was opened for another kind of pull");
        }
        portion = takePortion(session, pulling.portion, pulling.context);
    });
    return portionResponse(request, *std::move(portion), form);
}

ResponseBody pullInstancesWithPath(Request& request) {
    return pull(request, Session::Kind::instances, Form::instanceWithPath);
}

ResponseBody pullInstancePaths(Request& request) {
    return pull(request, Session::Kind::paths, Form::path);
}

/// DSP0200 defines this operation for queries. Here a client may use it for any instances
/// whose paths it does not need.
ResponseBody pullInstances(Request& request) {
    return pull(request, Session::Kind::instances, Form::instance);
}

ResponseBody closeEnumeration(Request& request) {
    const std::string context = request.parameters.requiredText("EnumerationContext");
    request.parameters.finish();
    request.sessions.close(context, request.caller.user);
    return plainResponse(request.call, "");
}

ResponseBody enumerationCount(Request& request) {
    const std::string context = request.parameters.requiredText("EnumerationContext");
    request.parameters.finish();
    std::size_t count = 0;
    request.sessions.use(context, request.caller.user,
                         [&count](const Session& session) { count = session.left; });
    return plainResponse(
        request.call, "<IRETURNVALUE><VALUE>" + std::to_string(count) + "</VALUE></IRETURNVALUE>");
}

}  // namespace

std::vector<NamedOperation> pullOperations() {
    return {
        {"OpenEnumerateInstances", openEnumerateInstances},
        {"OpenEnumerateInstancePaths", openEnumerateInstancePaths},
        {"OpenQueryInstances", openQueryInstances},
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
