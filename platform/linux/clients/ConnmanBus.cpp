#include "clients/ManagerBuses.h"

#include <optional>
#include <string>
#include <utility>

#include "clients/JsonValues.h"
#include "facts/ClientFacts.h"
#include "formats/InterfaceName.h"

namespace ZR::Live {
namespace {

using Json = nlohmann::json;

constexpr std::string_view origin = "D-Bus net.connman";

/// What is configured counts while connman uses the service, from its first try on. After
/// "failure" it tries again.
bool isUsed(const std::string& state) {
    return state == "association" || state == "configuration" || state == "ready" ||
           state == "online" || state == "failure";
}

void addService(const Json& service, ClientFacts& facts) {
    const auto name = InterfaceName::from(textOf(member(member(service, "Ethernet"), "Interface")));
    if (!name || !isUsed(textOf(member(service, "State")))) {
        return;
    }
    const std::string method = textOf(member(member(service, "IPv4.Configuration"), "Method"));
    const Json& ipv4 = member(service, "IPv4");
    const auto address = IpAddress::ipv4FromText(textOf(member(ipv4, "Address")));
    LinkConfiguration management{.client = Client::Connman,
                                 .interfaceName = name,
                                 .dhcp4 = {},
                                 .dhcp6 = {},
                                 .staticAddresses = {},
                                 .origin = std::string{origin}};
    if (method == "dhcp") {
        management.dhcp4 = true;
    } else if (method == "manual" || method == "fixed" || method == "off") {
        management.dhcp4 = false;
    }
    if (method == "manual" && address) {
        management.staticAddresses.push_back(*address);
    }
    facts.managements.push_back(std::move(management));
    // Without a server connman takes an address of the link alone, and tells so here.
    if (address && textOf(member(ipv4, "Method")) == "dhcp") {
        facts.leases.push_back({.client = Client::Connman,
                                .interfaceName = name,
                                .address = *address,
                                .server = {},
                                .clientAlive = true,
                                .expires = {},
                                .pid = pidOfManager(facts, Client::Connman),
                                .origin = std::string{origin}});
    }
}

}  // namespace

BusResponse askConnman(BusRequests::Deadline deadline) {
    BusRequests requests{"connman", "net.connman", deadline};
    const auto services =
        requests.call({.path = "/", .interface = "net.connman.Manager", .name = "GetServices"});
    return {.json = services ? services->dump(-1, ' ', false, Json::error_handler_t::replace)
                             : std::string{},
            .reason = requests.failure()};
}

std::string_view addConnmanServices(std::string_view json, ClientFacts& facts) {
    const Json services = Json::parse(json, nullptr, false);
    if (!services.is_array()) {
        return "not an array of services";
    }
    // Its files tell of former addresses, and not of which links.
    std::erase_if(facts.leases, [](const Lease& lease) {
        return lease.client == Client::Connman && !lease.interfaceName;
    });
    for (const Json& service : services) {
        if (service.is_array() && service.size() == 2) {
            addService(service[1], facts);
        }
    }
    return {};
}

}  // namespace ZR::Live
