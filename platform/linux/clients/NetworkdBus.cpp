#include "clients/NetworkdBus.h"

#include <sys/socket.h>

#include <algorithm>
#include <cstddef>
#include <ctime>
#include <optional>
#include <utility>

#include "clients/JsonValues.h"
#include "facts/ClientFacts.h"
#include "formats/ValueFormats.h"

namespace ZR::Live {
namespace {

using Json = nlohmann::json;
using Microseconds = std::optional<std::uint64_t>;

constexpr std::string_view origin = "D-Bus org.freedesktop.network1";
constexpr std::int64_t second = 1'000'000;

/// The bytes in an array of their numbers; empty for anything else.
std::vector<std::byte> bytesOf(const Json& value) {
    std::vector<std::byte> bytes;
    if (!value.is_array()) {
        return {};
    }
    for (const Json& number : value) {
        if (!number.is_number_unsigned() || number.get<std::uint64_t>() > UINT8_MAX) {
            return {};
        }
        bytes.push_back(static_cast<std::byte>(number.get<std::uint8_t>()));
    }
    return bytes;
}

/// A time, by either of the spellings that versions have of its name. 0 and the largest
/// number stand for none.
Microseconds timeOf(const Json& object, const char* name, const char* olderName = "") {
    for (const char* const each : {name, olderName}) {
        const std::uint64_t time = numberOf(member(object, each));
        if (time != 0 && time != UINT64_MAX) {
            return time;
        }
    }
    return std::nullopt;
}

void addAddresses(const Json& list, std::uint32_t ifindex,
                  std::vector<NetworkdAddress>& addresses) {
    if (!list.is_array()) {
        return;
    }
    for (const Json& each : list) {
        const Json& number = member(each, "Family");
        if (number != AF_INET && number != AF_INET6) {
            continue;
        }
        const int family = number.get<std::uint8_t>();
        if (const auto address = IpAddress::fromBytes(family, bytesOf(member(each, "Address")))) {
            addresses.push_back(
                {.ifindex = ifindex,
                 .address = *address,
                 .source = textOf(member(each, "ConfigSource")),
                 .provider = IpAddress::fromBytes(family, bytesOf(member(each, "ConfigProvider"))),
                 .validUntil = timeOf(each, "ValidLifetimeUSec", "ValidLifetimeUsec")});
        }
    }
}

void addClient(const Json& client, std::uint32_t ifindex, bool ipv6,
               std::vector<NetworkdClient>& clients) {
    if (!client.is_object()) {
        return;
    }
    const Json& lease = member(client, "Lease");
    clients.push_back(
        {.ifindex = ifindex,
         .ipv6 = ipv6,
         .obtained = timeOf(lease, "LeaseTimestampUSec"),
         .renews = timeOf(lease, "Timeout1USec"),
         .rebinds = timeOf(lease, "Timeout2USec"),
         .identifier = hexadecimal(bytesOf(member(client, ipv6 ? "DUID" : "ClientIdentifier")))});
}

void addLink(const Json& link, NetworkdDescription& description) {
    const Json& index = member(link, "Index");
    if (!index.is_number_unsigned() || index.get<std::uint64_t>() > UINT32_MAX) {
        return;
    }
    const auto ifindex = index.get<std::uint32_t>();
    addAddresses(member(link, "Addresses"), ifindex, description.addresses);
    addClient(member(link, "DHCPv4Client"), ifindex, false, description.clients);
    addClient(member(link, "DHCPv6Client"), ifindex, true, description.clients);
}

/// Seconds since the epoch, to the nearest: the two clocks are not read at the same moment.
std::optional<std::int64_t> since(std::int64_t start, const Microseconds& time) {
    constexpr std::uint64_t largest = std::uint64_t{1} << 61U;
    if (!time || *time > largest) {
        return std::nullopt;
    }
    return (start + static_cast<std::int64_t>(*time) + second / 2) / second;
}

void addLease(const NetworkdAddress& address, const NetworkdDescription& description,
              std::int64_t start, ClientFacts& facts) {
    const auto known =
        std::find_if(facts.leases.begin(), facts.leases.end(), [&](const Lease& lease) {
            return lease.client == Client::Networkd && lease.ifindex == address.ifindex &&
                   lease.address == address.address;
        });
    Lease& lease = known != facts.leases.end()
                       ? *known
                       : facts.leases.emplace_back(Lease{.client = Client::Networkd,
                                                         .interfaceName = {},
                                                         .ifindex = address.ifindex,
                                                         .address = address.address,
                                                         .server = address.provider,
                                                         .expires = {},
                                                         .origin = std::string{origin}});
    lease.clientAlive = true;
    lease.pid = pidOfManager(facts, Client::Networkd);
    if (!lease.expires) {
        lease.expires = since(start, address.validUntil);
    }
    const auto client = std::find_if(
        description.clients.begin(), description.clients.end(), [&](const NetworkdClient& each) {
            return each.ifindex == address.ifindex && each.ipv6 != address.address.isIPv4();
        });
    if (client != description.clients.end()) {
        lease.obtained = since(start, client->obtained);
        lease.renews = since(start, client->renews);
        lease.rebinds = since(start, client->rebinds);
        if (lease.clientIdentifier.empty()) {
            lease.clientIdentifier = client->identifier;
        }
    }
}

}  // namespace

Parsed<NetworkdDescription> parseNetworkdDescription(std::string_view json) {
    const Json document = Json::parse(json, nullptr, false);
    if (!document.is_object()) {
        return std::string_view{"not a JSON object"};
    }
    NetworkdDescription description;
    const Json& links = member(document, "Interfaces");
    if (links.is_array()) {
        for (const Json& link : links) {
            addLink(link, description);
        }
    } else {
        addLink(document, description);
    }
    return description;
}

BusResponse askNetworkd(BusRequests::Deadline deadline) {
    BusRequests requests{"systemd-networkd", "org.freedesktop.network1", deadline};
    // Before version 250 there is no such method.
    const auto description = requests.call({.path = "/org/freedesktop/network1",
                                            .interface = "org.freedesktop.network1.Manager",
                                            .name = "Describe"});
    return {.json = description ? textOf(*description) : std::string{},
            .reason = requests.failure()};
}

std::int64_t startOfSystem() {
    const auto read = [](clockid_t clock) {
        timespec time{};
        // Cannot fail: both clocks are there on every kernel since 2.6.39.
        static_cast<void>(::clock_gettime(clock, &time));
        return std::int64_t{time.tv_sec} * second + time.tv_nsec / 1'000;
    };
    return read(CLOCK_REALTIME) - read(CLOCK_BOOTTIME);
}

void addNetworkdDescription(const NetworkdDescription& description, std::int64_t start,
                            ClientFacts& facts) {
    const auto managementOf = [&](std::uint32_t ifindex) {
        const auto found = std::find_if(
            facts.managements.begin(), facts.managements.end(), [&](const LinkConfiguration& each) {
                return each.client == Client::Networkd && each.ifindex == ifindex;
            });
        return found == facts.managements.end() ? nullptr : &*found;
    };
    // A client is there while the link is under DHCP, whatever its file says by now. That of
    // DHCPv6 may ask for other things than an address.
    for (const NetworkdClient& client : description.clients) {
        if (auto* const management = client.ipv6 ? nullptr : managementOf(client.ifindex)) {
            management->dhcp4 = true;
        }
    }
    for (const NetworkdAddress& address : description.addresses) {
        auto* const management = managementOf(address.ifindex);
        if (address.source == "DHCPv4" || address.source == "DHCPv6") {
            addLease(address, description, start, facts);
            if (management != nullptr) {
                (address.address.isIPv4() ? management->dhcp4 : management->dhcp6) = true;
            }
        } else if (address.source == "static" && address.address.isIPv4() &&
                   management != nullptr) {
            auto& told = management->staticAddresses;
            if (std::find(told.begin(), told.end(), address.address) == told.end()) {
                told.push_back(address.address);
            }
        }
    }
}

}  // namespace ZR::Live
