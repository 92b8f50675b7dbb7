// Operations on instances that only read (DSP0200, 5.4.2).
#include <algorithm>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Interop.h"
#include "cimom/Names.h"
#include "cimom/Results.h"
#include "cimxml/ObjectWriter.h"
#include "operations/Request.h"

namespace cimom::wbem {

namespace {

/// Class origins for those who ask for them.
const ClassRepository* originsWanted(Request& request) {
    return request.parameters.flag("IncludeClassOrigin", false) ? &request.manager.repository()
                                                                : nullptr;
}

/// Parameters that DSP0200 deprecates for instances: LocalOnly, whose definitions
/// contradict each other and which counts as false, and IncludeQualifiers, which a
/// server may pass over. They still must be booleans.
void passOverDeprecated(Request& request) {
    static_cast<void>(request.parameters.flag("LocalOnly", true));
    static_cast<void>(request.parameters.flag("IncludeQualifiers", false));
}

InstanceRequest readingRequest(Request& request) {
    return {request.parameters.texts("PropertyList"), request.caller.user.value_or("")};
}

/// Adds what the class has and the provider left out, as null: clients that modify
/// an instance want to see what there is to set.
void addNulls(Instance& instance, const ClassRepository& repository,
              const std::optional<std::vector<std::string>>& propertyList) {
    const ClassDeclaration* const declaration = repository.find(instance.path.className);
    if (declaration == nullptr) {
        return;
    }
    for (const PropertyDeclaration& property : declaration->properties) {
        const bool listed = !propertyList || std::any_of(propertyList->begin(), propertyList->end(),
                                                         [&](const std::string& name) {
                                                             return sameName(name, property.name);
                                                         });
        if (listed && instance.property(property.name) == nullptr) {
            instance.properties.push_back(
                {property.name, Value::null(property.type, property.isArray)});
        }
    }
}

/// Whether the enumerations of the request's namespace show what GetInstance shows: clients
/// compare the two for what they find of the server in the interop namespace, where instances
/// are few.
bool showsNulls(const Request& request) {
    const std::string* const nameSpace = request.manager.findNameSpace(request.call.nameSpace);
    return nameSpace != nullptr && sameName(*nameSpace, interopNameSpace);
}

ResponseBody enumerateInstances(Request& request) {
    const std::string className = request.parameters.requiredClassName("ClassName");
    const bool deep = request.parameters.flag("DeepInheritance", true);
    passOverDeprecated(request);
    const ClassRepository* const origins = originsWanted(request);
    const InstanceRequest reading = readingRequest(request);
    request.parameters.finish();
    const ClassDeclaration* const cut =
        deep ? nullptr : request.manager.repository().find(className);
    return spooledResponse(request.call,
                           spooled<Instance>(
                               request,
                               [&request, &reading, nulls = showsNulls(request), origins, cut](
                                   std::string& out, Instance& instance) {
                                   if (nulls) {
                                       addNulls(instance, request.manager.repository(),
                                                reading.propertyList);
                                   }
                                   cutToClass(instance, cut);
                                   out += "<VALUE.NAMEDINSTANCE>";
                                   writeInstanceName(out, instance.path);
                                   writeInstanceOf(out, instance, origins);
                                   out += "</VALUE.NAMEDINSTANCE>";
                               },
                               [&](auto& receiver) {
                                   return request.manager.enumerateInstances(
                                       classPath(request, className), reading, receiver);
                               }));
}

ResponseBody enumerateInstanceNames(Request& request) {
    const std::string className = request.parameters.requiredClassName("ClassName");
    request.parameters.finish();
    const InstanceRequest reading{std::nullopt, request.caller.user.value_or("")};
    return spooledResponse(request.call,
                           spooled<ObjectPath>(request, writeInstanceName, [&](auto& receiver) {
                               return request.manager.enumerateInstanceNames(
                                   classPath(request, className), reading, receiver);
                           }));
}

ResponseBody getInstance(Request& request) {
    const ObjectPath path =
        located(request, request.parameters.requiredInstanceName("InstanceName"));
    passOverDeprecated(request);
    const ClassRepository* const origins = originsWanted(request);
    const InstanceRequest reading = readingRequest(request);
    request.parameters.finish();
    auto result = request.manager.getInstance(path, reading);
    requireOk(result.status);
    if (result.instances.empty() || !result.instances.front()) {
        throw CimError(CimStatus::notFound, "");
    }
    Instance& instance = *result.instances.front();
    addNulls(instance, request.manager.repository(), reading.propertyList);
    std::string content = "<IRETURNVALUE>";
    writeInstanceOf(content, instance, origins);
    return plainResponse(request.call, content + "</IRETURNVALUE>");
}

}  // namespace

std::vector<NamedOperation> instanceOperations() {
    return {{"EnumerateInstances", enumerateInstances},
            {"EnumerateInstanceNames", enumerateInstanceNames},
            {"GetInstance", getInstance}};
}

}  // namespace cimom::wbem
