#include "commands/CimOperations.h"

#include <utility>

#include "arguments/PathArgument.h"
#include "arguments/ValueReading.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "cimom/Requests.h"
#include "client/Client.h"
#include "text/DisplayText.h"
#include "text/Failure.h"

namespace cimdhcp {

namespace {

std::pair<std::string, std::string> splitAssignment(const std::string& text) {
    const std::size_t sign = text.find('=');
    if (sign == std::string::npos || sign == 0) {
        throw Failure(ExitStatus::usage, "\"" + printable(text) +
                                             "\" is not an assignment of the form PROPERTY=VALUE");
    }
    return {text.substr(0, sign), text.substr(sign + 1)};
}

/// The response of an object manager to a property that the class does not have. There
/// is no type to send the value in.
Response noSuchProperty(const cimom::ClassDeclaration& declaration, const std::string& name) {
    Response response;
    response.operation = "ModifyInstance";
    response.status = {CMPI_RC_ERR_NO_SUCH_PROPERTY,
                       declaration.name + " has no property \"" + name + "\""};
    return response;
}

}  // namespace

CimOperation carryOut(const NamesCommand& command, Client& client) {
    const cimom::ObjectPath path = readClassArgument(command.className, client.nameSpace());
    return {path, client.enumerateNames(path)};
}

CimOperation carryOut(const InstancesCommand& command, Client& client) {
    const cimom::ObjectPath path = readClassArgument(command.className, client.nameSpace());
    return {path, client.enumerate(path)};
}

CimOperation carryOut(const GetCommand& command, Client& client) {
    const cimom::ObjectPath path =
        readPathArgument(command.path, client.nameSpace(), client.classes());
    return {path, client.get(path)};
}

CimOperation carryOut(const ModifyCommand& command, Client& client) {
    cimom::Instance instance;
    instance.path = readPathArgument(command.path, client.nameSpace(), client.classes());
    const cimom::ClassDeclaration* const declaration =
        client.classes().find(instance.path.className);
    for (const std::string& assignment : command.assignments) {
        const auto [name, value] = splitAssignment(assignment);
        if (instance.property(name) != nullptr) {
            throw Failure(ExitStatus::usage, printable(name) + " is given twice");
        }
        if (declaration == nullptr) {
            // The class is not known: the object manager will say so.
            instance.properties.push_back({name, cimom::Value::ofString(value)});
            continue;
        }
        const cimom::PropertyDeclaration* const property = declaration->property(name);
        if (property == nullptr) {
            return {instance.path, noSuchProperty(*declaration, name)};
        }
        instance.properties.push_back({property->name, readValue(*property, value)});
    }
    return {instance.path, client.modify(instance)};
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
