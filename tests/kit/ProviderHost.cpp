#include "kit/ProviderHost.h"

#include <dlfcn.h>
#include <unistd.h>

#include <array>
#include <optional>
#include <stdexcept>
#include <type_traits>
#include <utility>
#include <variant>
#include <vector>

#include "broker/Conversion.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerRecords.h"
#include "cimom/ObjectPathText.h"
#include "cimom/Results.h"
#include "manager/ProviderCall.h"

namespace test {
namespace {

cimom::Configuration configuration(const std::string& directory) {
    cimom::Configuration result;
    result.schemaDirectories = {ZR_SOURCE_DIR "/schema"};
    result.registrationFiles = {ZR_SOURCE_DIR "/schema/exact/DHCPClientProvider.registration",
                                ZR_SOURCE_DIR "/schema/exact/DHCPClientNeighbours.registration"};
    result.providerDirectories = {directory};
    return result;
}

std::string hostName() {
    std::array<char, 256> name{};
    if (::gethostname(name.data(), name.size() - 1) != 0) {
        throw std::runtime_error("no host name");
    }
    return name.data();
}

cimom::ObjectPath pathOf(const std::string& text) {
    std::string whole = "root/cimv2:" + text;
    for (std::size_t at = whole.find('@'); at != std::string::npos; at = whole.find('@')) {
        whole.replace(at, 1, hostName());
    }
    return cimom::parseObjectPath(whole);
}

std::string textOf(const cimom::Scalar& scalar) {
    return std::visit(
        [](const auto& value) -> std::string {
            using Value = std::decay_t<decltype(value)>;
            if constexpr (std::is_same_v<Value, std::monostate>) {
                return "null";
            } else if constexpr (std::is_same_v<Value, std::string>) {
                return '"' + value + '"';
            } else if constexpr (std::is_arithmetic_v<Value>) {
                return std::to_string(value);
            } else if constexpr (std::is_same_v<Value, std::shared_ptr<const cimom::ObjectPath>>) {
                return cimom::toText(*value);
            } else {
                return "an instance";
            }
        },
        scalar);
}

std::string textOf(const cimom::Value& value) {
    if (const cimom::Scalar* const scalar = value.scalar()) {
        return textOf(*scalar);
    }
    std::string text = "{";
    if (const cimom::Array* const array = value.array()) {
        for (const cimom::Scalar& element : *array) {
            text += textOf(element) + ',';
        }
    }
    return text + '}';
}

std::string textOf(const std::optional<cimom::ObjectPath>& path) {
    return path ? cimom::toText(*path) : "null";
}

std::string textOf(const std::optional<cimom::Instance>& instance) {
    if (!instance) {
        return "null";
    }
    std::string text = cimom::toText(instance->path) + '\n';
    for (const cimom::NamedValue& property : instance->properties) {
        text += "  " + property.name + '=' + textOf(property.value) + '\n';
    }
    return text;
}

template <typename Objects>
ScriptResponse responseOf(const cimom::Status& status, const Objects& objects) {
    ScriptResponse response{status.code, status.message, {}};
    for (const auto& object : objects) {
        response.objects.push_back(textOf(object));
    }
    return response;
}
ScriptResponse responseOf(const cimom::PathsResult& result) {
    return responseOf(result.status, result.paths);
}
ScriptResponse responseOf(const cimom::InstancesResult& result) {
    return responseOf(result.status, result.instances);
}

}  // namespace

void ProviderHost::Closed::operator()(void* handle) const noexcept {
    ::dlclose(handle);
}

std::string ProviderHost::builtLibraries() {
    return ZR_BINARY_DIR "/lib/cmpi";
}

ProviderHost::ProviderHost(const std::string& directory)
    : manager_(configuration(directory)),
      broker_(manager_.repository(), &manager_),
      handle_(::dlopen((directory + '/' + library).c_str(), RTLD_NOW | RTLD_LOCAL)) {
    using Factory = CMPIInstanceMI* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
    if (!handle_) {
        throw std::runtime_error(::dlerror());
    }
    // The object manager makes the provider's records first: the library keeps the
    // broker that it was given last.
    static_cast<void>(run({"", Operation::enumerateNames, "QVXZR_DHCPCapabilities", ""}));
    static_cast<void>(run({"", Operation::referenceNames, "QVXZR_DHCPCapabilities.InstanceID=\"\"",
                           "QVXZR_DHCPElementCapabilities"}));
    const auto create =
        reinterpret_cast<Factory>(::dlsym(handle_.get(), "DHCPClientProvider_Create_InstanceMI"));
    CMPIStatus status{CMPI_RC_OK, nullptr};
    instance_ = create(broker_.record(), nullptr, &status);
}

ProviderHost::~ProviderHost() = default;

ScriptResponse ProviderHost::run(const ScriptRequest& request) {
    const cimom::ObjectPath path = pathOf(request.path);
    if (request.direct) {
        return runDirectly(request, path);
    }
    cimom::AssociationRequest wanted;
    if (!request.association.empty()) {
        wanted.assocClass = request.association;
    }
    cimom::AssociationRequest referring;
    referring.resultClass = wanted.assocClass;
    switch (request.operation) {
        case Operation::enumerateNames:
            return responseOf(manager_.enumerateInstanceNames(path));
        case Operation::enumerate:
            return responseOf(manager_.enumerateInstances(path));
        case Operation::get:
            return responseOf(manager_.getInstance(path));
        case Operation::modify:
            return responseOf(manager_.modifyInstance(
                {path, {{"ConfigurationName", cimom::Value::ofString("new")}}}));
        case Operation::associatorNames:
            return responseOf(manager_.associatorNames(path, wanted));
        case Operation::associators:
            return responseOf(manager_.associators(path, wanted));
        case Operation::referenceNames:
            return responseOf(manager_.referenceNames(path, referring));
        case Operation::references:
            return responseOf(manager_.references(path, referring));
        case Operation::create:
        case Operation::remove:
        case Operation::query:
            break;
    }
    throw std::logic_error("the object manager has no such operation");
}

ScriptResponse ProviderHost::runDirectly(const ScriptRequest& request,
                                         const cimom::ObjectPath& path) {
    const CMPIInstanceMIFT& table = *instance_->ft;
    const auto ask = [&](const CMPIContext* context, const CMPIResult* result,
                         const CMPIObjectPath* record) -> CMPIStatus {
        switch (request.operation) {
            case Operation::create:
                return table.createInstance(
                    instance_, context, result, record,
                    cimom::broker::toRecord(cimom::broker::RequestScope::current().arena(),
                                            &manager_.repository(), cimom::Instance{path, {}}));
            case Operation::remove:
                return table.deleteInstance(instance_, context, result, record);
            case Operation::query:
                return table.execQuery(instance_, context, result, record, "select *", "WQL");
            default:
                return table.enumerateInstances(instance_, context, result, record, nullptr);
        }
    };
    cimom::CollectedObjects<cimom::Instance> instances;
    const cimom::CallOutcome outcome =
        cimom::callProvider({&manager_.repository(), "", 0}, &instances, "provider", path, ask);
    return responseOf(outcome.status, instances.objects);
}

}  // namespace test
