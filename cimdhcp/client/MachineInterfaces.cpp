#include "client/MachineInterfaces.h"

#include <algorithm>
#include <cstdint>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <utility>
#include <variant>

#include "cimom/ClassDeclaration.h"
#include "text/ValueMeaning.h"

namespace cimdhcp {

namespace {

using ZR::NodeLexicon::NodeType;
using ZR::NodeLexicon::Properties;

constexpr std::uint64_t activeInterface = 1;

/// An interface lies in a network, which lies in its computer.
std::string_view systemOf(const ZR::Snapshot& snapshot, ZR::Snapshot::Index interface) {
    const ZR::Snapshot::Index network = snapshot.node(interface).parent;
    const ZR::Snapshot::Index computer =
        network == ZR::Snapshot::none ? network : snapshot.node(network).parent;
    const bool known = computer != ZR::Snapshot::none;
    return known && snapshot.node(computer).description == serviceProcessorSystem
               ? serviceProcessorSystem
               : hostSystem;
}

template <typename Kind>
const Kind* read(const ZR::Snapshot& snapshot, ZR::Snapshot::Index node, Properties id) {
    const ZR::SnapshotProperty* const property = snapshot.find(node, id);
    return property == nullptr ? nullptr : std::get_if<Kind>(&property->value);
}

std::string textOf(const ZR::Snapshot& snapshot, ZR::Snapshot::Index node, Properties id) {
    const auto* const text = read<std::string>(snapshot, node, id);
    return text == nullptr ? std::string() : *text;
}

std::string text(const cimom::Instance& instance, std::string_view property) {
    return heldText(instance.property(property));
}

/// The key of tables about interfaces: the InstanceID of the interface's setting.
std::string idOf(std::string_view system, const std::string& name) {
    return std::string(system) + '%' + name;
}

std::string_view systemOf(const cimom::Instance& instance) {
    return text(instance, "SystemCreationClassName") == "QVXZR_SPComputerSystem"
               ? serviceProcessorSystem
               : hostSystem;
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

std::optional<InterfaceId> readInterfaceId(const std::string& text) {
    // No system's name has the sign, an interface's may.
    const std::size_t sign = text.find('%');
    if (sign == std::string::npos) {
        return std::nullopt;
    }
    return InterfaceId{text.substr(0, sign), text.substr(sign + 1)};
}

std::vector<InterfaceOverview> interfacesOf(const ZR::Snapshot& snapshot) {
    std::vector<InterfaceOverview> interfaces;
    for (ZR::Snapshot::Index node = snapshot.first(NodeType::NetworkInterface);
         node != ZR::Snapshot::none; node = snapshot.node(node).nextOfType) {
        InterfaceOverview overview;
        overview.system = systemOf(snapshot, node);
        overview.name = textOf(snapshot, node, Properties::Name);
        overview.address = textOf(snapshot, node, Properties::IPv4Address);
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
    std::unordered_map<std::string, std::string> addresses;  // by idOf()
    for (const cimom::Instance& endpoint : ipEndpoints) {
        const bool processor = processorNames.contains(text(endpoint, "SystemName"));
        addresses[idOf(processor ? serviceProcessorSystem : hostSystem, text(endpoint, "Name"))] =
            text(endpoint, "IPv4Address");
    }
    std::vector<InterfaceOverview> interfaces;
    for (const cimom::Instance& setting : settings) {
        const std::string whole = text(setting, "InstanceID");
        auto id = readInterfaceId(whole);
        if (!id) {
            continue;
        }
        InterfaceOverview overview;
        overview.system = std::move(id->system);
        overview.name = std::move(id->name);
        if (const auto found = addresses.find(whole); found != addresses.end()) {
            overview.address = found->second;
        }
        interfaces.push_back(std::move(overview));
    }
    return interfaces;
}

void addServed(const ServedInstances& served, const ClassLookup& classes,
               std::vector<InterfaceOverview>& interfaces) {
    // By idOf().
    std::unordered_map<std::string, const cimom::Instance*> endpoints;
    std::unordered_map<std::string, std::vector<std::string>> servers;
    std::unordered_map<std::string, const cimom::Instance*> settings;
    const std::vector<cimom::Instance> nothing;
    for (const cimom::Instance& endpoint : served.endpoints ? *served.endpoints : nothing) {
        endpoints[idOf(systemOf(endpoint), text(endpoint, "Name"))] = &endpoint;
    }
    for (const cimom::Instance& point : served.accessPoints ? *served.accessPoints : nothing) {
        // Its name is the interface's with the kind of address behind it.
        const std::string name = text(point, "Name");
        servers[idOf(systemOf(point), name.substr(0, name.rfind('_')))].push_back(
            text(point, "AccessInfo"));
    }
    for (const cimom::Instance& setting : served.settings ? *served.settings : nothing) {
        settings[text(setting, "InstanceID")] = &setting;
    }
    for (InterfaceOverview& interface : interfaces) {
        const std::string id = idOf(interface.system, interface.name);
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
