#include "Hosts.h"

#include <stdexcept>
#include <utility>

#include "cimom/ObjectManager.h"
#include "cimom/Results.h"
#include "cimxml/OperationRequest.h"
#include "cimxml/OperationResponse.h"
#include "kit/StrictHost.h"
#include "kit/WireSupport.h"

namespace conformance {

namespace {

const std::string schema = ZR_SOURCE_DIR "/schema";
const std::string registrations = ZR_SOURCE_DIR "/schema/DHCPClient.registration";
const std::string libraries = ZR_BINARY_DIR "/lib/cmpi";

cimom::Configuration configuration() {
    return {{schema}, {registrations}, {libraries}, "testhost"};
}

const char* cString(const Name& name) {
    return name ? name->c_str() : nullptr;
}

class StrictManager : public Host {
  public:
    StrictManager(const strict::Traits& traits, const std::string& classes)
        : host_(classes, {registrations}, libraries, traits) {}

    Response ask(const Request& request) override {
        std::vector<const char*> list = charactersOf(request.properties);
        return responseOf(call(request, request.properties ? list.data() : nullptr));
    }

    Response modify(const cimom::Instance& instance,
                    const std::optional<Texts>& properties) override {
        std::vector<const char*> list = charactersOf(properties);
        return responseOf(host_.modify(instance, properties ? list.data() : nullptr));
    }

  private:
    static Response responseOf(const strict::StrictHost::Response& given) {
        return {given.code, given.message, given.paths, given.instances};
    }

    /// As CMPI has it, ended by a null pointer. They belong to the list.
    static std::vector<const char*> charactersOf(const std::optional<Texts>& list) {
        std::vector<const char*> characters;
        if (list) {
            for (const std::string& each : *list) {
                characters.push_back(each.c_str());
            }
        }
        characters.push_back(nullptr);
        return characters;
    }

    strict::StrictHost::Response call(const Request& request, const char** properties) {
        const strict::StrictHost::Filter filter{cString(request.association),
                                                cString(request.resultClass), cString(request.role),
                                                cString(request.resultRole)};
        switch (request.operation) {
            case Operation::enumerateNames:
                return host_.enumerateNames(request.path);
            case Operation::enumerate:
                return host_.enumerate(request.path, properties);
            case Operation::get:
                return host_.get(request.path, properties);
            case Operation::associatorNames:
                return host_.associatorNames(request.path, filter);
            case Operation::associators:
                return host_.associators(request.path, filter, properties);
            case Operation::referenceNames:
                return host_.referenceNames(request.path, filter);
            case Operation::references:
                return host_.references(request.path, filter, properties);
        }
        throw std::logic_error("no such operation");
    }

    strict::StrictHost host_;
};

template <typename Object>
std::vector<Object> present(const std::vector<std::optional<Object>>& objects) {
    std::vector<Object> all;
    for (const auto& object : objects) {
        all.push_back(object.value());
    }
    return all;
}

Response responseOf(const cimom::PathsResult& result) {
    return {result.status.code, result.status.message, present(result.paths), {}};
}

Response responseOf(const cimom::InstancesResult& result) {
    return {result.status.code, result.status.message, {}, present(result.instances)};
}

class EmbeddedManager : public Host {
  public:
    Response modify(const cimom::Instance& instance,
                    const std::optional<Texts>& properties) override {
        return responseOf(manager_.modifyInstance(instance, {properties, ""}));
    }

    Response ask(const Request& request) override {
        const cimom::InstanceRequest instances{request.properties, ""};
        cimom::AssociationRequest associations;
        associations.role = request.role;
        associations.propertyList = request.properties;
        const bool ofReferences = request.operation == Operation::referenceNames ||
                                  request.operation == Operation::references;
        (ofReferences ? associations.resultClass : associations.assocClass) = request.association;
        if (!ofReferences) {
            associations.resultClass = request.resultClass;
            associations.resultRole = request.resultRole;
        }
        switch (request.operation) {
            case Operation::enumerateNames:
                return responseOf(manager_.enumerateInstanceNames(request.path, instances));
            case Operation::enumerate:
                return responseOf(manager_.enumerateInstances(request.path, instances));
            case Operation::get:
                return responseOf(manager_.getInstance(request.path, instances));
            case Operation::associatorNames:
                return responseOf(manager_.associatorNames(request.path, associations));
            case Operation::associators:
                return responseOf(manager_.associators(request.path, associations));
            case Operation::referenceNames:
                return responseOf(manager_.referenceNames(request.path, associations));
            case Operation::references:
                return responseOf(manager_.references(request.path, associations));
        }
        throw std::logic_error("no such operation");
    }

  private:
    cimom::ObjectManager manager_{configuration()};
};

const char* methodOf(Operation operation) {
    switch (operation) {
        case Operation::enumerateNames:
            return "EnumerateInstanceNames";
        case Operation::enumerate:
            return "EnumerateInstances";
        case Operation::get:
            return "GetInstance";
        case Operation::associatorNames:
            return "AssociatorNames";
        case Operation::associators:
            return "Associators";
        case Operation::referenceNames:
            return "ReferenceNames";
        case Operation::references:
            return "References";
    }
    throw std::logic_error("no such operation");
}

cimom::wbem::OperationRequest messageFor(const Request& request) {
    cimom::wbem::OperationRequest message(methodOf(request.operation), request.path.nameSpace);
    switch (request.operation) {
        case Operation::enumerateNames:
            message.className("ClassName", request.path.className);
            break;
        case Operation::enumerate:
            message.className("ClassName", request.path.className).flag("LocalOnly", false);
            break;
        case Operation::get:
            message.instanceName("InstanceName", request.path).flag("LocalOnly", false);
            break;
        case Operation::associatorNames:
        case Operation::associators:
            message.instanceName("ObjectName", request.path)
                .className("AssocClass", request.association)
                .className("ResultClass", request.resultClass)
                .text("Role", request.role)
                .text("ResultRole", request.resultRole);
            break;
        case Operation::referenceNames:
        case Operation::references:
            message.instanceName("ObjectName", request.path)
                .className("ResultClass", request.association)
                .text("Role", request.role);
            break;
    }
    if (!asksForNames(request.operation)) {
        message.texts("PropertyList", request.properties);
    }
    return message;
}

class Server : public Host {
  public:
    Response modify(const cimom::Instance& instance,
                    const std::optional<Texts>& properties) override {
        cimom::wbem::OperationRequest message("ModifyInstance", instance.path.nameSpace);
        message.namedInstance("ModifiedInstance", instance).texts("PropertyList", properties);
        const auto read = send(message);
        return {static_cast<CMPIrc>(read.code), read.description, {}, {}};
    }

    Response ask(const Request& request) override {
        const auto read = send(messageFor(request));
        Response response{static_cast<CMPIrc>(read.code), read.description, {}, {}};
        for (const cimom::wbem::XmlElement& element : read.returned) {
            if (asksForNames(request.operation)) {
                response.paths.push_back(
                    cimom::wbem::readReturnedPath(element, request.path.nameSpace));
                continue;
            }
            response.instances.push_back(
                cimom::wbem::readReturnedInstance(element, request.path.nameSpace));
            if (request.operation == Operation::get) {
                // The response has the class alone.
                cimom::Instance& instance = response.instances.back();
                const std::string className = instance.path.className;
                instance.path = request.path;
                instance.path.className = className;
            }
        }
        return response;
    }

  private:
    cimom::wbem::OperationResponse send(const cimom::wbem::OperationRequest& message) {
        std::string http = cimom::test::httpRequest(message.method(), message.body());
        const std::string object = "CIMObject: root%2Ftest";
        http.replace(http.find(object), object.size(), "CIMObject: " + message.objectHeader());
        client_.send(http);
        const auto received = client_.receive();
        if (!received || received->status != 200) {
            throw std::runtime_error("no good response to " + message.method());
        }
        constexpr std::size_t depth = 64;
        return cimom::wbem::readResponse(received->body, message.method(), depth);
    }

    cimom::test::TestServer server_{{}, configuration()};
    cimom::test::RawClient client_{server_.port()};
};

}  // namespace

std::vector<HostKind> hostKinds() {
    std::vector<HostKind> kinds;
    for (const strict::NamedTraits& each : strict::namedTraits) {
        // Only the whole schema has superclasses with defaults.
        const bool whole = each.traits.parentsDefaults || each.traits.filledModifications;
        kinds.push_back({each.name,
                         [=] {
                             return std::make_unique<StrictManager>(
                                 each.traits, whole ? strict::wholeSchema : schema);
                         },
                         true});
    }
    kinds.push_back({"EmbeddedManager", [] { return std::make_unique<EmbeddedManager>(); }});
    kinds.push_back({"Server", [] { return std::make_unique<Server>(); }});
    return kinds;
}

}  // namespace conformance
