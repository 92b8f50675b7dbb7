#include "commands/CimOperations.h"

#include "arguments/ArgumentValue.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "cimom/Requests.h"
#include "client/Client.h"
#include "text/DisplayText.h"
#include "text/Failure.h"

namespace cimdhcp {

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
