#include "cimdhcp/MachineOverview.h"

#include <algorithm>
#include <cstdint>
#include <string_view>
#include <utility>
#include <variant>

#include "cimdhcp/InstanceMeanings.h"

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
std::string stateOf(const cimom::Instance& endpoint, const cimom::ClassRepository& repository) {
    const cimom::ClassDeclaration* const declaration = repository.find(endpoint.path.className);
    const cimom::Value* const client = endpoint.property("ClientState");
    const bool told = client != nullptr && !client->isNull() && !isZero(*client);
    return words(endpoint, declaration, told ? "ClientState" : "EnabledState");
}

bool isServed(const Client& client, std::string_view className) {
    return std::any_of(client.registrations().begin(), client.registrations().end(),
                       [className](const cimom::Registration& registration) {
                           return registration.instance &&
                                  cimom::sameName(registration.className, className);
                       });
}

/// None for a class that is not registered (of which an enumeration is empty, as of
/// any class that is known), or that its provider refuses.
std::optional<std::vector<cimom::Instance>> instancesOf(Client& client, const char* className) {
    if (!isServed(client, className)) {
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

ServedInstances askProvider(Client& client) {
    return {instancesOf(client, "QVXZR_DHCPProtocolEndpoint"),
            instancesOf(client, "QVXZR_DHCPRemoteServiceAccessPoint"),
            instancesOf(client, "QVXZR_DHCPSettingData")};
}

void addServed(const ServedInstances& served, const cimom::ClassRepository& repository,
               std::vector<InterfaceOverview>& interfaces) {
    for (InterfaceOverview& interface : interfaces) {
        if (served.endpoints) {
            interface.dhcp = false;
            for (const cimom::Instance& endpoint : *served.endpoints) {
                if (systemOf(endpoint) == interface.system &&
                    text(endpoint, "Name") == interface.name) {
                    interface.dhcp = true;
                    interface.state = stateOf(endpoint, repository);
                }
            }
        }
        for (const cimom::Instance& point :
             served.accessPoints.value_or(std::vector<cimom::Instance>())) {
            // Its name is the interface's with the kind of address behind it.
            const std::string name = text(point, "Name");
            if (systemOf(point) == interface.system &&
                name.substr(0, name.rfind('_')) == interface.name) {
                interface.servers.push_back(text(point, "AccessInfo"));
            }
        }
        const std::string id = interface.system + '%' + interface.name;
        for (const cimom::Instance& setting :
             served.settings.value_or(std::vector<cimom::Instance>())) {
            if (text(setting, "InstanceID") == id) {
                interface.configurationName = text(setting, "ConfigurationName");
            }
        }
    }
}

}  // namespace cimdhcp
