#include "commands/classes/CimOperations.h"

#include <algorithm>
#include <optional>
#include <utility>
#include <vector>

#include "arguments/ArgumentValue.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimom/Requests.h"
#include "client/Client.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/Likeness.h"

namespace cimdhcp {

namespace {

std::vector<std::string> propertyNames(const cimom::ClassDeclaration& declaration) {
    std::vector<std::string> names;
    for (const cimom::PropertyDeclaration& each : declaration.properties) {
        names.push_back(each.name);
    }
    return names;
}

/// A property that none of the classes has would be passed over in silence.
void refuseUnknown(const std::string& property, const CimOperation& operation,
                   const ClassLookup& classes) {
    const cimom::ClassDeclaration* const asked = classes.find(operation.path.className);
    if (asked == nullptr || asked->property(property) != nullptr) {
        return;
    }
    for (const auto& instance : operation.response.instances) {
        const auto* const own = instance ? classes.find(instance->path.className) : nullptr;
        if (own != nullptr && own->property(property) != nullptr) {
            return;
        }
    }
    throw Failure(ExitStatus::notDone,
                  std::string(cimom::statusName(CMPI_RC_ERR_NO_SUCH_PROPERTY)) + ": " +
                      noPropertyText(*asked, property));
}

/// Leaves the instances those properties, in that order: providers may give more.
void keepOnly(const std::vector<std::string>& properties, CimOperation& operation,
              const ClassLookup& classes) {
    if (!operation.response.status.ok()) {
        return;
    }
    for (const std::string& property : properties) {
        refuseUnknown(property, operation, classes);
    }
    for (auto& instance : operation.response.instances) {
        if (!instance) {
            continue;
        }
        std::vector<cimom::NamedValue> kept;
        for (const std::string& property : properties) {
            const auto found = std::find_if(
                instance->properties.begin(), instance->properties.end(),
                [&property](const auto& each) { return cimom::sameName(each.name, property); });
            if (found != instance->properties.end()) {
                kept.push_back(*found);
            }
        }
        instance->properties = std::move(kept);
    }
}

std::vector<std::string> classNames(Client& client) {
    std::vector<std::string> names;
    for (const ClassEntry& entry : client.servedClasses()) {
        names.push_back(entry.name);
    }
    return names;
}

/// "; its keys are A, B", unless the path has exactly those.
std::string keysText(const cimom::ObjectPath& path, const cimom::ClassDeclaration& declaration) {
    std::vector<std::string> keys;
    bool same = true;
    for (const cimom::PropertyDeclaration& each : declaration.properties) {
        if (each.isKey()) {
            keys.push_back(each.name);
            same = same && path.key(each.name) != nullptr;
        }
    }
    if ((same && path.keys.size() == keys.size()) || path.keys.empty()) {
        return {};
    }
    std::string text = "; " + declaration.name +
                       (keys.empty()       ? " has no keys"
                        : keys.size() == 1 ? " has the key "
                                           : " has the keys ");
    for (std::size_t index = 0; index < keys.size(); ++index) {
        text += (index == 0 ? "" : ", ") + keys[index];
    }
    return text;
}

[[noreturn]] void refuseName(const std::string& what, const std::string& name,
                             const std::vector<std::string>& known) {
    throw Failure(ExitStatus::notDone,
                  std::string(cimom::statusName(CMPI_RC_ERR_INVALID_PARAMETER)) + ": " + what +
                      " \"" + printable(name) + '"' + didYouMean(name, known));
}

void refuseUnknownClass(const std::optional<std::string>& name, Client& client) {
    if (name && client.classes().find(*name) == nullptr) {
        refuseName("there is no class", *name, classNames(client));
    }
}

void refuseUnknownRole(const std::optional<std::string>& role,
                       const std::optional<std::string>& assocClass, Client& client) {
    if (!role) {
        return;
    }
    const std::vector<std::string> roles = rolesOf(assocClass, client);
    const bool known = std::any_of(roles.begin(), roles.end(), [&role](const std::string& each) {
        return cimom::sameName(each, *role);
    });
    if (!known) {
        refuseName(
            assocClass ? *assocClass + " has no reference" : "no association has a reference",
            *role, roles);
    }
}

bool isEmpty(const CimOperation& operation) {
    const Response& response = operation.response;
    return response.status.ok() && response.paths.empty() && response.instances.empty();
}

void refuseMissingInstance(const CimOperation& operation, Client& client) {
    Response response = client.get(operation.path);
    if (response.status.code == CMPI_RC_ERR_NOT_FOUND ||
        response.status.code == CMPI_RC_ERR_INVALID_PARAMETER) {
        throw explainedFailure({operation.path, std::move(response)}, client);
    }
}

}  // namespace

std::vector<std::string> rolesOf(const std::optional<std::string>& assocClass, Client& client) {
    std::vector<std::string> roles;
    const ClassLookup classes = client.classes();
    const auto add = [&roles](const cimom::ClassDeclaration* declaration) {
        if (declaration == nullptr) {
            return;
        }
        for (const cimom::PropertyDeclaration& each : declaration->properties) {
            if (each.type == cimom::Type::reference &&
                std::find(roles.begin(), roles.end(), each.name) == roles.end()) {
                roles.push_back(each.name);
            }
        }
    };
    if (assocClass) {
        add(classes.find(*assocClass));
        return roles;
    }
    for (const ClassEntry& entry : client.servedClasses()) {
        if (entry.association) {
            add(classes.find(entry.name));
        }
    }
    return roles;
}

std::string noPropertyText(const cimom::ClassDeclaration& declaration, const std::string& name) {
    return declaration.name + " has no property \"" + name + '"' +
           didYouMean(name, propertyNames(declaration));
}

Failure explainedFailure(const CimOperation& operation, Client& client) {
    Failure failure = client.failure(operation.response, operation.path);
    const std::string& className = operation.path.className;
    try {
        const cimom::ClassDeclaration* const declaration = client.classes().find(className);
        const bool keysMayBeWrong = operation.response.status.code == CMPI_RC_ERR_NOT_FOUND ||
                                    operation.response.status.code == CMPI_RC_ERR_INVALID_PARAMETER;
        if (declaration == nullptr) {
            return {failure.status(), failure.what() + didYouMean(className, classNames(client))};
        }
        if (keysMayBeWrong) {
            return {failure.status(), failure.what() + keysText(operation.path, *declaration)};
        }
    } catch (const Failure&) {
        // What went wrong stands without it.
    }
    return failure;
}

void refuseMissingSource(const AssociatorsCommand& command, const CimOperation& operation,
                         Client& client) {
    if (operation.response.status.code == CMPI_RC_ERR_INVALID_PARAMETER) {
        refuseUnknownClass(command.assocClass, client);
        refuseUnknownClass(command.resultClass, client);
    }
    if (isEmpty(operation)) {
        refuseMissingInstance(operation, client);
        refuseUnknownClass(command.assocClass, client);
        refuseUnknownClass(command.resultClass, client);
        refuseUnknownRole(command.role, command.assocClass, client);
        refuseUnknownRole(command.resultRole, command.assocClass, client);
    }
}

void refuseMissingSource(const ReferencesCommand& command, const CimOperation& operation,
                         Client& client) {
    if (operation.response.status.code == CMPI_RC_ERR_INVALID_PARAMETER) {
        refuseUnknownClass(command.resultClass, client);
    }
    if (isEmpty(operation)) {
        refuseMissingInstance(operation, client);
        refuseUnknownClass(command.resultClass, client);
        refuseUnknownRole(command.role, command.resultClass, client);
    }
}

CimOperation carryOut(const NamesCommand& command, Client& client) {
    const cimom::ObjectPath path = readClassArgument(command.className, client.nameSpace());
    return {path, client.enumerateNames(path)};
}

CimOperation carryOut(const InstancesCommand& command, Client& client) {
    const cimom::ObjectPath path = readClassArgument(command.className, client.nameSpace());
    if (command.properties.empty()) {
        return {path, client.enumerate(path)};
    }
    CimOperation operation{path, client.enumerateWith(path, command.properties)};
    keepOnly(command.properties, operation, client.classes());
    return operation;
}

CimOperation carryOut(const GetCommand& command, Client& client) {
    const cimom::ObjectPath path =
        readPathArgument(command.path, client.nameSpace(), client.classes());
    if (command.properties.empty()) {
        return {path, client.get(path)};
    }
    CimOperation operation{path, client.getWith(path, command.properties)};
    keepOnly(command.properties, operation, client.classes());
    return operation;
}

CimOperation carryOut(const AssociatorsCommand& command, Client& client) {
    const cimom::ObjectPath path =
        readPathArgument(command.path, client.nameSpace(), client.classes());
    cimom::AssociationRequest request;
    request.assocClass = command.assocClass;
    request.resultClass = command.resultClass;
    request.role = command.role;
    request.resultRole = command.resultRole;
    return {path, command.names ? client.associatorNames(path, request)
                                : client.associators(path, request)};
}

CimOperation carryOut(const ReferencesCommand& command, Client& client) {
    const cimom::ObjectPath path =
        readPathArgument(command.path, client.nameSpace(), client.classes());
    cimom::AssociationRequest request;
    request.resultClass = command.resultClass;
    request.role = command.role;
    return {path, command.names ? client.referenceNames(path, request)
                                : client.references(path, request)};
}

}  // namespace cimdhcp
