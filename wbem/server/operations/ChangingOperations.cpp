// Operations that change instances, create and delete them (DSP0200, 5.4.2). Each attempt
// is logged, also one that is refused.
#include <algorithm>
#include <utility>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Names.h"
#include "cimom/Results.h"
#include "cimxml/ObjectReader.h"
#include "cimxml/ObjectWriter.h"
#include "operations/Modification.h"
#include "operations/Request.h"

namespace cimom::wbem {

namespace {

/// Whether a value may be set to a property of that declaration.
bool agrees(const Value& value, const PropertyDeclaration& property) noexcept {
    const bool embedded = value.type == Type::instance && property.type == Type::string;
    return value.isArray == property.isArray && (value.type == property.type || embedded);
}

/// What a client sends is compared with the class, so that no provider has to.
void checkProperties(const Instance& instance, const ClassDeclaration& declaration,
                     const std::optional<std::vector<std::string>>& propertyList) {
    const auto unknown = [&declaration](const std::string& name) {
        throw CimError(CimStatus::noSuchProperty,
                       declaration.name + " has no property \"" + name + "\"");
    };
    for (const NamedValue& named : instance.properties) {
        const PropertyDeclaration* const property = declaration.property(named.name);
        if (property == nullptr) {
            unknown(named.name);
        } else if (!agrees(named.value, *property)) {
            throw CimError(CimStatus::typeMismatch, "property " + property->name + " is of type " +
                                                        std::string(typeName(property->type)) +
                                                        (property->isArray ? "[]" : ""));
        }
    }
    for (const std::string& name : propertyList.value_or(std::vector<std::string>())) {
        if (declaration.property(name) == nullptr) {
            unknown(name);
        }
    }
}

bool isListed(const std::string& name,
              const std::optional<std::vector<std::string>>& propertyList) {
    return !propertyList ||
           std::any_of(propertyList->begin(), propertyList->end(),
                       [&name](const std::string& listed) { return sameName(listed, name); });
}

/// The instance as it is, if it can be read.
std::optional<Instance> readBack(Request& request, const ObjectPath& path) {
    auto now = request.manager.getInstance(path, {std::nullopt, request.caller.user.value_or("")});
    return now.status.ok() && now.instances.size() == 1 ? std::move(now.instances.front())
                                                        : std::nullopt;
}

std::vector<Modification::Change> changesOf(const Instance& instance, const InstanceRequest& how,
                                            Request& request) {
    std::vector<Modification::Change> changes;
    const auto before = readBack(request, instance.path);
    for (const NamedValue& property : instance.properties) {
        if (!isListed(property.name, how.propertyList)) {
            continue;
        }
        Modification::Change change{property.name, std::nullopt, property.value};
        if (before) {
            const Value* const old = before->property(property.name);
            change.oldValue =
                old != nullptr ? *old : Value::null(property.value.type, property.value.isArray);
        }
        changes.push_back(std::move(change));
    }
    return changes;
}

/// What differs from the changes that a provider says it has made. Providers may take a value
/// and keep another one.
std::optional<std::string> doubtAbout(const std::vector<Modification::Change>& changes,
                                      const std::optional<Instance>& now) {
    if (!now) {
        return "the instance cannot be read";
    }
    for (const Modification::Change& change : changes) {
        const Value* const value = now->property(change.property);
        const bool same = value == nullptr ? change.newValue.isNull() : *value == change.newValue;
        // Clients send back what they have read, which no provider has to keep.
        if (!same && change.oldValue != change.newValue) {
            return change.property + " is " + (value == nullptr ? "null" : valueText(*value));
        }
    }
    return std::nullopt;
}

/// The properties that the client gave, as long as nothing is known of what was before.
std::vector<Modification::Change> givenBy(const Instance& instance) {
    std::vector<Modification::Change> changes;
    for (const NamedValue& property : instance.properties) {
        changes.push_back({property.name, std::nullopt, property.value});
    }
    return changes;
}

/// Runs `change` if the client may change anything, and logs the attempt however it ends.
template <typename Change>
void logged(Request& request, Modification& modification, Change&& change) {
    try {
        if (!request.caller.mayModify) {
            throw CimError(CimStatus::accessDenied, "this needs the right to modify");
        }
        std::forward<Change>(change)();
    } catch (const CimError& error) {
        modification.status = error.code;
        modification.description = error.what();
        request.log(modification);
        throw;
    }
    request.log(modification);
}

void modify(Request& request, const Instance& instance, const InstanceRequest& how,
            Modification& modification) {
    checkProperties(instance,
                    requireClass(request, instance.path.className, CimStatus::invalidClass),
                    how.propertyList);
    modification.changes = changesOf(instance, how, request);
    requireOk(request.manager.modifyInstance(instance, how).status);
    modification.doubt = doubtAbout(modification.changes, readBack(request, instance.path));
}

ResponseBody modifyInstance(Request& request) {
    Instance instance = request.parameters.requiredNamedInstance("ModifiedInstance");
    instance.path = located(request, std::move(instance.path));
    // Deprecated, and about qualifiers of instances, which do not exist here.
    static_cast<void>(request.parameters.flag("IncludeQualifiers", true));
    const InstanceRequest how{request.parameters.texts("PropertyList"),
                              request.caller.user.value_or("")};
    request.parameters.finish();
    Modification modification{request.caller, instance.path, givenBy(instance), 0, ""};
    logged(request, modification, [&] { modify(request, instance, how, modification); });
    return plainResponse(request.call, "");
}

/// The path of the new instance.
ObjectPath create(Request& request, const Instance& instance) {
    const ClassDeclaration& declaration =
        requireClass(request, instance.path.className, CimStatus::invalidClass);
    try {
        checkProperties(instance, declaration, std::nullopt);
    } catch (const CimError& error) {
        // DSP0200 has one status for whatever is wrong with a new instance.
        throw CimError(CimStatus::invalidParameter, error.what());
    }
    auto made =
        request.manager.createInstance(instance, {std::nullopt, request.caller.user.value_or("")});
    requireOk(made.status);
    if (made.paths.empty() || !made.paths.front()) {
        throw CimError(CimStatus::failed, "the new instance has no path");
    }
    return *std::move(made.paths.front());
}

ResponseBody createInstance(Request& request) {
    Instance instance = request.parameters.requiredInstance("NewInstance");
    request.parameters.finish();
    locate(instance, request.call.nameSpace);
    Modification modification{
        request.caller, instance.path, givenBy(instance), 0, "", Modification::Kind::create};
    ObjectPath path;
    logged(request, modification, [&] {
        path = create(request, instance);
        modification.object = path;
        if (!readBack(request, path)) {
            modification.doubt = "the instance cannot be read";
        }
    });
    std::string content = "<IRETURNVALUE>";
    writeInstanceName(content, path);
    return plainResponse(request.call, content + "</IRETURNVALUE>");
}

ResponseBody deleteInstance(Request& request) {
    const ObjectPath path =
        located(request, request.parameters.requiredInstanceName("InstanceName"));
    request.parameters.finish();
    Modification modification{request.caller, path, {}, 0, "", Modification::Kind::remove};
    logged(request, modification, [&] {
        requireOk(
            request.manager.deleteInstance(path, {std::nullopt, request.caller.user.value_or("")}));
        if (readBack(request, path)) {
            modification.doubt = "the instance can still be read";
        }
    });
    return plainResponse(request.call, "");
}

}  // namespace

std::vector<NamedOperation> changingOperations() {
    return {{"ModifyInstance", modifyInstance},
            {"CreateInstance", createInstance},
            {"DeleteInstance", deleteInstance}};
}

}  // namespace cimom::wbem
