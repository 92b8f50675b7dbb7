#include "client/RemoteClient.h"

#include <algorithm>
#include <unordered_set>
#include <utility>

#include "cimom/ClassDeclaration.h"
#include "cimom/Names.h"
#include "cimom/Requests.h"
#include "cimxml/Errors.h"
#include "cimxml/HttpStatus.h"
#include "cimxml/ObjectReader.h"
#include "cimxml/OperationRequest.h"
#include "cimxml/OperationResponse.h"
#include "client/Response.h"
#include "text/DisplayText.h"
#include "text/ValueMeaning.h"

namespace cimdhcp {

namespace {

using cimom::wbem::OperationRequest;
using cimom::wbem::OperationResponse;
namespace http = cimom::wbem::http;

constexpr std::size_t deepestXml = 64;
/// The schema of the standard's own classes, none of which an implementation serves.
constexpr std::string_view standardSchema = "CIM_";
/// How the names of an object manager's own classes begin, like that of __Namespace.
constexpr std::string_view systemClass = "__";

[[noreturn]] void fail(const std::string& message) {
    throw Failure(ExitStatus::notLoaded, message);
}

/// Text of a server in a message of one line.
std::string excerpt(const std::string& text) {
    constexpr std::size_t shown = 200;
    return printable(text.size() > shown ? text.substr(0, shown) + "..." : text);
}

void checkStatus(const cimom::wbem::ReceivedResponse& response, const HttpSettings& settings) {
    if (response.status == http::ok) {
        return;
    }
    if (response.status == http::unauthorized) {
        fail(settings.credential
                 ? "HTTP 401: it refuses user " + printable(settings.credential->user) +
                       " with that password"
                 : "HTTP 401: it wants a user and a password; --credentials FILE holds them");
    }
    if (response.status == http::forbidden) {
        fail("HTTP 403: it does not permit this");
    }
    const std::string* const cimError = response.header("CIMError");
    fail("HTTP " + std::to_string(response.status) + " in place of a response" +
         (cimError == nullptr || cimError->empty() ? "" : ": " + excerpt(*cimError)));
}

/// The status of a response. A code that CMPI's type has no room for is a failure.
cimom::Status statusOf(const OperationResponse& response) {
    constexpr unsigned last = 255;
    std::string words = response.description;
    if (cimom::sameName(words, cimom::wbem::cimStatusName(response.code))) {
        words.clear();  // the message explains the status instead
    }
    if (response.code > last) {
        return {CMPI_RC_ERR_FAILED,
                "status " + std::to_string(response.code) + (words.empty() ? "" : ": " + words)};
    }
    return {static_cast<CMPIrc>(response.code), std::move(words)};
}

OperationRequest reading(const char* method, const cimom::ObjectPath& path) {
    return {method, path.nameSpace};
}

/// The parameters about the form of instances, the same in every operation.
void addForm(OperationRequest& request) {
    request.flag("IncludeQualifiers", false).flag("IncludeClassOrigin", false);
}

OperationRequest aboutAssociations(const char* method, const cimom::ObjectPath& path,
                                   const cimom::AssociationRequest& filter) {
    OperationRequest request(method, path.nameSpace);
    request.instanceName("ObjectName", path)
        .className("AssocClass", filter.assocClass)
        .className("ResultClass", filter.resultClass)
        .text("Role", filter.role)
        .text("ResultRole", filter.resultRole);
    return request;
}

/// The path of an instance that came without one, as from GetInstance: the path of the
/// request. Where that lacks keys of the class, the keys come from the instance instead,
/// in its order.
cimom::ObjectPath wholePath(const cimom::Instance& instance, const cimom::ObjectPath& asked,
                            const cimom::ClassDeclaration* declaration) {
    cimom::ObjectPath path = asked;
    path.className = instance.path.className;
    const auto isMissing = [&](const cimom::PropertyDeclaration& property) {
        return property.isKey() && path.key(property.name) == nullptr;
    };
    if (declaration == nullptr ||
        std::none_of(declaration->properties.begin(), declaration->properties.end(), isMissing)) {
        return path;
    }
    std::vector<cimom::NamedValue> keys;
    for (const cimom::NamedValue& property : instance.properties) {
        const cimom::PropertyDeclaration* const declared = declaration->property(property.name);
        if (declared != nullptr && declared->isKey() && !property.value.isNull()) {
            keys.push_back(property);
        }
    }
    path.keys = std::move(keys);
    return path;
}

/// The classes without subclasses that are not the standard's own. A subclass of an
/// association is an association.
std::vector<ClassEntry> leavesOf(const std::vector<ClassEntry>& classes) {
    constexpr int deepest = 64;  // a hierarchy that goes round in circles has no end
    std::unordered_map<std::string_view, const ClassEntry*> byName;
    std::unordered_set<std::string_view> parents;
    for (const ClassEntry& entry : classes) {
        byName[entry.name] = &entry;
        parents.insert(entry.superclass);
    }
    std::vector<ClassEntry> leaves;
    for (const ClassEntry& entry : classes) {
        if (parents.contains(entry.name) || entry.name.starts_with(standardSchema) ||
            entry.name.starts_with(systemClass)) {
            continue;
        }
        leaves.push_back(entry);
        auto above = byName.find(entry.name);
        for (int depth = 0; above != byName.end() && depth < deepest; ++depth) {
            leaves.back().association = leaves.back().association || above->second->association;
            above = byName.find(above->second->superclass);
        }
    }
    return leaves;
}

}  // namespace

Failure failureOf(const cimom::wbem::ConnectionError& error) {
    using Kind = cimom::wbem::ConnectionError::Kind;
    std::string message = printable(error.what());
    if (error.kind == Kind::tooLate) {
        message += "; --timeout gives it longer";
    } else if (error.kind == Kind::notTrusted) {
        message += "; --cacert FILE names who vouches for it";
    } else if (error.kind == Kind::badCertificates) {
        message += "; they are those of --cacert";
    }
    return {ExitStatus::notLoaded, message};
}

RemoteClient::RemoteClient(const ServerUrl& url, HttpSettings settings, const Deadline& deadline,
                           std::string nameSpace)
    : Client(std::move(nameSpace)), connection_(url, std::move(settings), deadline) {}

RemoteClient::~RemoteClient() = default;

OperationResponse RemoteClient::ask(const OperationRequest& request) {
    try {
        const cimom::wbem::ReceivedResponse response = connection_.post(
            {"Content-Type: application/xml; charset=\"utf-8\"",
             "Accept: application/xml, text/xml", "CIMOperation: MethodCall",
             "CIMMethod: " + request.method(), "CIMObject: " + request.objectHeader()},
            request.body());
        checkStatus(response, connection_.settings());
        return cimom::wbem::readResponse(response.body, request.method(), deepestXml);
    } catch (const cimom::wbem::ConnectionError& error) {
        throw failureOf(error);
    } catch (const cimom::wbem::XmlError& error) {
        fail("the response is not XML: " + excerpt(error.what()));
    } catch (const cimom::wbem::NotValid& error) {
        fail("the response is not CIM-XML: " + excerpt(error.what()));
    }
}

template <typename Read>
Response RemoteClient::responseTo(const OperationRequest& request, const Read& read) {
    OperationResponse message = ask(request);
    Response response;
    response.operation = request.method();
    response.status = statusOf(message);
    response.returnDoneCalls.reset();
    try {
        for (const cimom::wbem::XmlElement& element : message.returned) {
            read(element, response);
        }
    } catch (const cimom::wbem::NotValid& error) {
        fail("the response is not CIM-XML: " + excerpt(error.what()));
    } catch (const cimom::wbem::CimError& error) {
        fail("a value in the response is not valid: " + excerpt(error.what()));
    }
    return response;
}

Response RemoteClient::pathsOf(const OperationRequest& request) {
    return responseTo(request, [&request](const cimom::wbem::XmlElement& element,
                                          Response& response) {
        response.paths.emplace_back(cimom::wbem::readReturnedPath(element, request.nameSpace()));
    });
}

Response RemoteClient::instancesOf(const OperationRequest& request) {
    return responseTo(request,
                      [&request](const cimom::wbem::XmlElement& element, Response& response) {
                          auto& instance = response.instances.emplace_back(
                              cimom::wbem::readReturnedInstance(element, request.nameSpace()));
                          leaveOutNulls(*instance);
                      });
}

Response RemoteClient::enumerateNames(const cimom::ObjectPath& path) {
    return pathsOf(reading("EnumerateInstanceNames", path).className("ClassName", path.className));
}

Response RemoteClient::enumerate(const cimom::ObjectPath& path) {
    return enumerateAsked(path, nullptr);
}

Response RemoteClient::enumerateWith(const cimom::ObjectPath& path,
                                     const std::vector<std::string>& properties) {
    return enumerateAsked(path, &properties);
}

Response RemoteClient::enumerateAsked(const cimom::ObjectPath& path,
                                      const std::vector<std::string>* properties) {
    OperationRequest request = reading("EnumerateInstances", path);
    request.className("ClassName", path.className)
        .flag("LocalOnly", false)
        .flag("DeepInheritance", true);
    addForm(request);
    if (properties != nullptr) {
        request.texts("PropertyList", *properties);
    }
    return instancesOf(request);
}

Response RemoteClient::get(const cimom::ObjectPath& path) {
    return getAsked(path, nullptr);
}

Response RemoteClient::getWith(const cimom::ObjectPath& path,
                               const std::vector<std::string>& properties) {
    return getAsked(path, &properties);
}

Response RemoteClient::getAsked(const cimom::ObjectPath& path,
                                const std::vector<std::string>* properties) {
    OperationRequest request = reading("GetInstance", path);
    request.instanceName("InstanceName", path).flag("LocalOnly", false);
    addForm(request);
    if (properties != nullptr) {
        request.texts("PropertyList", *properties);
    }
    Response response = instancesOf(request);
    for (auto& instance : response.instances) {
        instance->path = wholePath(*instance, path, findClass(instance->path.className));
    }
    return response;
}

Response RemoteClient::modify(const cimom::Instance& instance,
                              const std::vector<std::string>& properties) {
    OperationRequest request("ModifyInstance", instance.path.nameSpace);
    request.namedInstance("ModifiedInstance", instance)
        .flag("IncludeQualifiers", false)
        .texts("PropertyList", properties);
    return instancesOf(request);
}

Response RemoteClient::createInstance(const cimom::Instance& instance) {
    OperationRequest request("CreateInstance", instance.path.nameSpace);
    request.instance("NewInstance", instance);
    return pathsOf(request);
}

Response RemoteClient::deleteInstance(const cimom::ObjectPath& path) {
    OperationRequest request("DeleteInstance", path.nameSpace);
    request.instanceName("InstanceName", path);
    return pathsOf(request);
}

Response RemoteClient::associatorNames(const cimom::ObjectPath& path,
                                       const cimom::AssociationRequest& request) {
    return pathsOf(aboutAssociations("AssociatorNames", path, request));
}

Response RemoteClient::associators(const cimom::ObjectPath& path,
                                   const cimom::AssociationRequest& request) {
    OperationRequest message = aboutAssociations("Associators", path, request);
    addForm(message);
    return instancesOf(message);
}

Response RemoteClient::referenceNames(const cimom::ObjectPath& path,
                                      const cimom::AssociationRequest& request) {
    return pathsOf(aboutAssociations("ReferenceNames", path, request));
}

Response RemoteClient::references(const cimom::ObjectPath& path,
                                  const cimom::AssociationRequest& request) {
    OperationRequest message = aboutAssociations("References", path, request);
    addForm(message);
    return instancesOf(message);
}

const cimom::ClassDeclaration* RemoteClient::findClass(std::string_view className) {
    const std::string name(className);
    const auto known = classes_.find(name);
    if (known != classes_.end()) {
        return known->second.get();
    }
    OperationRequest request("GetClass", nameSpace());
    request.className("ClassName", name)
        .flag("LocalOnly", false)
        .flag("IncludeQualifiers", true)
        .flag("IncludeClassOrigin", false);
    std::unique_ptr<const cimom::ClassDeclaration> declaration;
    // Without a declaration, for whatever reason, values are shown without their meanings.
    static_cast<void>(
        responseTo(request, [&declaration](const cimom::wbem::XmlElement& element, Response&) {
            declaration =
                std::make_unique<const cimom::ClassDeclaration>(cimom::wbem::readClass(element));
        }));
    return classes_.emplace(name, std::move(declaration)).first->second.get();
}

ClassLookup RemoteClient::classes() {
    return ClassLookup([this](std::string_view name) { return findClass(name); });
}

std::vector<ClassEntry> RemoteClient::servedClasses() {
    OperationRequest request("EnumerateClasses", nameSpace());
    request.flag("DeepInheritance", true)
        .flag("LocalOnly", true)
        .flag("IncludeQualifiers", false)
        .flag("IncludeClassOrigin", false);
    std::vector<ClassEntry> classes;
    const Response response =
        responseTo(request, [&](const cimom::wbem::XmlElement& element, Response& /*response*/) {
            cimom::ClassDeclaration declaration = cimom::wbem::readClass(element);
            // Only associations have references (DSP0004, 5.1.2.7).
            const bool association =
                std::any_of(declaration.properties.begin(), declaration.properties.end(),
                            [](const auto& each) { return each.type == cimom::Type::reference; });
            classes.push_back({std::move(declaration.name),
                               std::move(declaration.superclass),
                               association,
                               "",
                               {nameSpace()}});
        });
    if (!response.status.ok()) {
        throw failure(response, classPath(""));
    }
    return leavesOf(classes);
}

bool RemoteClient::mayServe(std::string_view /*className*/) const {
    return true;
}

std::optional<std::string> RemoteClient::dataDir() const {
    return std::nullopt;
}

Failure RemoteClient::failure(const Response& response, const cimom::ObjectPath& asked) const {
    return {ExitStatus::notDone, statusMessage(response, asked)};
}

}  // namespace cimdhcp
