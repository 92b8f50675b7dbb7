#include "client/MachineInterfaces.h"

#include <algorithm>
#include <cstdint>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <utility>
#include <variant>

#include "client/Client.h"
#include "text/InstanceMeanings.h"

namespace cimdhcp {

namespace {

using ZR::NodeLexicon::NodeType;
using ZR::NodeLexicon::Properties;

constexpr std::string_view host = "Computer";
constexpr std::string_view serviceProcessor = "BMC";
constexpr std::uint64_t activeInterface = 1;

/// An interface lies in a network, which lies in its computer.
std::string systemOf(const ZR::Snapshot& snapshot, ZR::Snapshot::Index interface) {
    const ZR::Snapshot::Index network = snapshot.node(interface).parent;
    const ZR::Snapshot::Index computer =
        network == ZR::Snapshot::none ? network : snapshot.node(network).parent;
    const bool known = computer != ZR::Snapshot::none;
    return std::string(
        known && snapshot.node(computer).description == serviceProcessor ? serviceProcessor : host);
}

template <typename Kind>
const Kind* read(const ZR::Snapshot& snapshot, ZR::Snapshot::Index node, Properties id) {
    const ZR::SnapshotProperty* const property = snapshot.find(node, id);
    return property == nullptr ? nullptr : std::get_if<Kind>(&property->value);
}

std::string textOf(const std::string* text) {
    return text == nullptr ? std::string() : *text;
}

std::string text(const cimom::Instance& instance, std::string_view property) {
    const cimom::Value* const value = instance.property(property);
    const cimom::Scalar* const scalar = value == nullptr ? nullptr : value->scalar();
    return textOf(scalar == nullptr ? nullptr : std::get_if<std::string>(scalar));
}

std::string systemOf(const cimom::Instance& instance) {
    return std::string(text(instance, "SystemCreationClassName") == "QVXZR_SPComputerSystem"
                           ? serviceProcessor
                           : host);
}

bool isZero(const cimom::Value& value) {
    const cimom::Scalar* const scalar = value.scalar();
    const auto* const number = scalar == nullptr ? nullptr : std::get_if<std::uint64_t>(scalar);
    return number != nullptr && *number == 0;
}

/// The meaning of an enumerated property in small letters, its number when it has
/// none; empty when it is not set.
std::string words(const cimom::Instance& instance, const cimom::ClassDeclaration* declaration,
                  const std::string& property) {
    const cimom::Value* const value = instance.property(property);
    if (value == nullptr || value->isNull()) {
        return {};
    }
    std::string result = meaningOf(declaration, {property, *value});
    std::transform(result.begin(), result.end(), result.begin(), [](char letter) {
        return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
    });
    return result.empty() ? valueWithMeaning(nullptr, {property, *value}) : result;
}

/// The state of the client; while it has none, whether it is enabled.
std::string stateOf(const cimom::Instance& endpoint, const ClassLookup& classes) {
    const cimom::ClassDeclaration* const declaration = classes.find(endpoint.path.className);
    const cimom::Value* const client = endpoint.property("ClientState");
    const bool told = client != nullptr && !client->isNull() && !isZero(*client);
    return words(endpoint, declaration, told ? "ClientState" : "EnabledState");
}

}  // namespace

std::vector<InterfaceOverview> interfacesOf(const ZR::Snapshot& snapshot) {
    std::vector<InterfaceOverview> interfaces;
    for (ZR::Snapshot::Index node = snapshot.first(NodeType::NetworkInterface);
         node != ZR::Snapshot::none; node = snapshot.node(node).nextOfType) {
        InterfaceOverview overview;
        overview.system = systemOf(snapshot, node);
        overview.name = textOf(read<std::string>(snapshot, node, Properties::Name));
        overview.address = textOf(read<std::string>(snapshot, node, Properties::IPv4Address));
        const auto* const state = read<std::uint64_t>(snapshot, node, Properties::InterfaceState);
        if (state != nullptr) {
            overview.state = *state == activeInterface ? "active" : "inactive";
        }
        interfaces.push_back(std::move(overview));
    }
    return interfaces;
}

std::vector<InterfaceOverview> interfacesOf(const std::vector<cimom::Instance>& settings,
                                            const std::vector<cimom::Instance>& ipEndpoints,
                                            const std::vector<std::string>& processors) {
    const std::unordered_set<std::string> processorNames(processors.begin(), processors.end());
    std::unordered_map<std::string, std::string> addresses;  // by "SYSTEM%NAME"
    for (const cimom::Instance& endpoint : ipEndpoints) {
        const bool processor = processorNames.contains(text(endpoint, "SystemName"));
        addresses[std::string(processor ? serviceProcessor : host) + '%' + text(endpoint, "Name")] =
            text(endpoint, "IPv4Address");
    }
    std::vector<InterfaceOverview> interfaces;
    for (const cimom::Instance& setting : settings) {
        const std::string id = text(setting, "InstanceID");
        // No system's name has the sign, an interface's may.
        const std::size_t sign = id.find('%');
        if (sign == std::string::npos) {
            continue;
        }
        InterfaceOverview overview;
        overview.system = id.substr(0, sign);
        overview.name = id.substr(sign + 1);
        if (const auto found = addresses.find(id); found != addresses.end()) {
            overview.address = found->second;
        }
        interfaces.push_back(std::move(overview));
    }
    return interfaces;
}

std::optional<std::vector<cimom::Instance>> instancesOf(Client& client, const char* className) {
    // An enumeration of a class that is known and not registered is empty.
    if (!client.mayServe(className)) {
        return std::nullopt;
    }
    const cimom::ObjectPath path = client.classPath(className);
    Answer answer = client.enumerate(path);
    if (answer.status.code == CMPI_RC_ERR_INVALID_CLASS ||
        answer.status.code == CMPI_RC_ERR_NOT_SUPPORTED) {
        return std::nullopt;
    }
    if (!answer.status.ok()) {
        throw client.failure(answer, path);
    }
    std::vector<cimom::Instance> instances;
    for (auto& instance : answer.instances) {
        if (instance) {
            instances.push_back(*std::move(instance));
        }
    }
    return instances;
}

ServedInstances askProvider(Client& client) {
    return {instancesOf(client, "QVXZR_DHCPProtocolEndpoint"),
            instancesOf(client, "QVXZR_DHCPRemoteServiceAccessPoint"),
            instancesOf(client, "QVXZR_DHCPSettingData")};
}

void addServed(const ServedInstances& served, const ClassLookup& classes,
               std::vector<InterfaceOverview>& interfaces) {
    // By "SYSTEM%NAME". No system's name has the sign.
    std::unordered_map<std::string, const cimom::Instance*> endpoints;
    std::unordered_map<std::string, std::vector<std::string>> servers;
    std::unordered_map<std::string, const cimom::Instance*> settings;
    const std::vector<cimom::Instance> nothing;
    for (const cimom::Instance& endpoint : served.endpoints ? *served.endpoints : nothing) {
        endpoints[systemOf(endpoint) + '%' + text(endpoint, "Name")] = &endpoint;
    }
    for (const cimom::Instance& point : served.accessPoints ? *served.accessPoints : nothing) {
        // Its name is the interface's with the kind of address behind it.
        const std::string name = text(point, "Name");
        servers[systemOf(point) + '%' + name.substr(0, name.rfind('_'))].push_back(
            text(point, "AccessInfo"));
    }
    for (const cimom::Instance& setting : served.settings ? *served.settings : nothing) {
        settings[text(setting, "InstanceID")] = &setting;
    }
    for (InterfaceOverview& interface : interfaces) {
        const std::string id = interface.system + '%' + interface.name;
        if (served.endpoints) {
            const auto endpoint = endpoints.find(id);
            interface.dhcp = endpoint != endpoints.end();
            if (*interface.dhcp) {
                interface.state = stateOf(*endpoint->second, classes);
            }
        }
        if (const auto found = servers.find(id); found != servers.end()) {
            interface.servers = found->second;
        }
        if (const auto found = settings.find(id); found != settings.end()) {
            interface.configurationName = text(*found->second, "ConfigurationName");
        }
    }
}

}  // namespace cimdhcp
