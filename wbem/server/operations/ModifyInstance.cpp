#include <algorithm>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Names.h"
#include "cimom/Results.h"
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

std::vector<Modification::Change> changesOf(const Instance& instance, const InstanceRequest& how,
                                            ObjectManager& manager) {
    std::vector<Modification::Change> changes;
    const auto before = manager.getInstance(instance.path, {std::nullopt, how.principal});
    const bool readable =
        before.status.ok() && before.instances.size() == 1 && before.instances.front();
    for (const NamedValue& property : instance.properties) {
        if (!isListed(property.name, how.propertyList)) {
            continue;
        }
        Modification::Change change{property.name, std::nullopt, property.value};
        if (readable) {
            const Value* const old = before.instances.front()->property(property.name);
            change.oldValue =
                old != nullptr ? *old : Value::null(property.value.type, property.value.isArray);
        }
        changes.push_back(std::move(change));
    }
    return changes;
}

void modify(Request& request, const Instance& instance, const InstanceRequest& how,
            Modification& modification) {
    if (!request.caller.mayModify) {
        throw CimError(CimStatus::accessDenied, "this needs the right to modify");
    }
    checkProperties(instance,
                    requireClass(request, instance.path.className, CimStatus::invalidClass),
                    how.propertyList);
    modification.changes = changesOf(instance, how, request.manager);
    requireOk(request.manager.modifyInstance(instance, how).status);
}

}  // namespace

ResponseBody modifyInstance(Request& request) {
    Instance instance = request.parameters.requiredNamedInstance("ModifiedInstance");
    instance.path = located(request, std::move(instance.path));
    // Deprecated, and about qualifiers of instances, which do not exist here.
    static_cast<void>(request.parameters.flag("IncludeQualifiers", true));
    const InstanceRequest how{request.parameters.texts("PropertyList"),
                              request.caller.user.value_or("")};
    request.parameters.finish();
    Modification modification{request.caller, instance.path, {}, 0, ""};
    for (const NamedValue& property : instance.properties) {
        modification.changes.push_back({property.name, std::nullopt, property.value});
    }
    try {
        modify(request, instance, how, modification);
    } catch (const CimError& error) {
        modification.status = error.code;
        modification.description = error.what();
        request.log(modification);
        throw;
    }
    request.log(modification);
    return plainResponse(request.call, "");
}

}  // namespace cimom::wbem
