#include "clients/ManagerBuses.h"

#include <cstdint>
#include <optional>
#include <utility>
#include <vector>

#include "clients/JsonValues.h"
#include "clients/NetworkManager.h"
#include "clients/NetworkManagerLease.h"
#include "facts/ClientFacts.h"

namespace ZR::Live {
namespace {

using Json = nlohmann::json;

constexpr const char* service = "org.freedesktop.NetworkManager";
constexpr const char* deviceInterface = "org.freedesktop.NetworkManager.Device";
constexpr const char* connectionInterface = "org.freedesktop.NetworkManager.Connection.Active";
constexpr const char* lease4Interface = "org.freedesktop.NetworkManager.DHCP4Config";
constexpr const char* lease6Interface = "org.freedesktop.NetworkManager.DHCP6Config";
constexpr std::string_view origin = "D-Bus org.freedesktop.NetworkManager";

// NMDeviceState: from preparing a connection to having it.
constexpr std::uint64_t statePrepare = 40;
constexpr std::uint64_t stateActivated = 100;
// NMActivationStateFlags: others have set the device up.
constexpr std::uint64_t flagExternal = 0x80;

bool hasConnection(const Json& device) {
    const std::uint64_t state = numberOf(member(device, "State"));
    return member(device, "Managed") == true && state >= statePrepare && state <= stateActivated;
}

NetworkManagerOptions optionsOf(const Json& objects, const Json& path, const char* interface) {
    NetworkManagerOptions options;
    const Json& object = member(objects, textOf(path).c_str());
    const Json& found = member(member(object, interface), "Options");
    if (found.is_object()) {
        for (const auto& [name, value] : found.items()) {
            options.emplace(name, textOf(value));
        }
    }
    return options;
}

NetworkManagerProfile profileOf(const Json& applied) {
    NetworkManagerProfile profile;
    profile.method4 = textOf(member(member(applied, "ipv4"), "method"));
    profile.method6 = textOf(member(member(applied, "ipv6"), "method"));
    const Json& addresses = member(member(applied, "ipv4"), "address-data");
    if (addresses.is_array()) {
        for (const Json& each : addresses) {
            if (const auto address = IpAddress::ipv4FromText(textOf(member(each, "address")))) {
                profile.addresses4.push_back(*address);
            }
        }
    }
    return profile;
}

/// What is said of one device.
struct Device {
    InterfaceName name;
    LinkConfiguration management;
    std::optional<Lease> lease4;
    std::optional<Lease> lease6;
};

std::optional<Device> deviceOf(const Json& objects, const Json& device, const Json& applied) {
    const auto name = InterfaceName::from(textOf(member(device, "Interface")));
    const std::string active = textOf(member(device, "ActiveConnection"));
    const Json& connection = member(member(objects, active.c_str()), connectionInterface);
    if (!name || !hasConnection(device) ||
        (numberOf(member(connection, "StateFlags")) & flagExternal) != 0) {
        return std::nullopt;
    }
    const Json& config4 = member(device, "Dhcp4Config");
    const Json& config6 = member(device, "Dhcp6Config");
    Device found{.name = *name,
                 .management = networkManagerConfiguration(profileOf(applied)),
                 .lease4 = networkManagerLease4(optionsOf(objects, config4, lease4Interface)),
                 .lease6 = networkManagerLease6(optionsOf(objects, config6, lease6Interface))};
    // It is there from the first request for a lease on, also where this user may not know
    // what was applied. Of DHCPv6, requests for other things than an address have one, too.
    if (textOf(config4).size() > 1) {
        found.management.dhcp4 = true;
    }
    if (found.lease6) {
        found.management.dhcp6 = true;
    }
    return found;
}

}  // namespace

BusResponse askNetworkManager(BusRequests::Deadline deadline) {
    BusRequests requests{"NetworkManager", service, deadline};
    const auto objects = requests.call({.path = "/org/freedesktop",
                                        .interface = "org.freedesktop.DBus.ObjectManager",
                                        .name = "GetManagedObjects"});
    if (!objects || !objects->is_object()) {
        return {.json = {}, .reason = requests.failure()};
    }
    Json kept = Json::object();
    Json applied = Json::object();
    for (const auto& [path, interfaces] : objects->items()) {
        for (const char* const interface :
             {deviceInterface, connectionInterface, lease4Interface, lease6Interface}) {
            if (const Json& properties = member(interfaces, interface); !properties.is_null()) {
                kept[path][interface] = properties;
            }
        }
        if (!hasConnection(member(interfaces, deviceInterface))) {
            continue;
        }
        // It may be gone meanwhile.
        const auto connection =
            requests.call({.path = path,
                           .interface = deviceInterface,
                           .name = "GetAppliedConnection",
                           .argument = 0,
                           .nothing = "org.freedesktop.NetworkManager.Device.NotActive"});
        if (connection) {
            for (const char* const setting : {"ipv4", "ipv6"}) {
                applied[path][setting] = member(*connection, setting);
            }
        }
    }
    if (!requests.failure().empty()) {
        return {.json = {}, .reason = requests.failure()};
    }
    const Json description{{"objects", std::move(kept)}, {"applied", std::move(applied)}};
    return {.json = description.dump(-1, ' ', false, Json::error_handler_t::replace), .reason = {}};
}

std::string_view addNetworkManagerDescription(std::string_view json, ClientFacts& facts) {
    const Json description = Json::parse(json, nullptr, false);
    const Json& objects = member(description, "objects");
    if (!objects.is_object()) {
        return "not an object with objects";
    }
    // Its files say the same, later, and not all of it.
    const auto ofFile = [](const auto& fact) {
        return fact.client == Client::NetworkManager && fact.ifindex != 0;
    };
    std::erase_if(facts.managements, ofFile);
    std::erase_if(facts.leases, ofFile);
    for (const auto& [path, interfaces] : objects.items()) {
        auto device = deviceOf(objects, member(interfaces, deviceInterface),
                               member(member(description, "applied"), path.c_str()));
        if (!device) {
            continue;
        }
        device->management.interfaceName = device->name;
        device->management.origin = origin;
        facts.managements.push_back(std::move(device->management));
        for (auto* const lease : {&device->lease4, &device->lease6}) {
            if (*lease) {
                Lease& added = facts.leases.emplace_back(**lease);
                added.interfaceName = device->name;
                added.clientAlive = true;
                added.pid = pidOfManager(facts, Client::NetworkManager);
                added.origin = origin;
            }
        }
    }
    return {};
}

}  // namespace ZR::Live
