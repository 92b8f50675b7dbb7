#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "clients/BusRequest.h"
#include "facts/ClientFacts.h"
#include "formats/IpAddress.h"
#include "formats/ValueFormats.h"

namespace ZR::Live {

/// What networkd says of one address of a link.
struct NetworkdAddress {
    std::uint32_t ifindex = 0;
    IpAddress address;
    std::string source;                 ///< "DHCPv4", "DHCPv6", "static", "IPv4LL", "foreign", ...
    std::optional<IpAddress> provider;  ///< the server that gave it
    /// Its end, in microseconds since the start of the system (CLOCK_BOOTTIME); nullopt
    /// where it has none.
    std::optional<std::uint64_t> validUntil{};

    bool operator==(const NetworkdAddress&) const = default;
};

/// What versions since 257 say of a client of one link. Times are as in an address, and
/// nullopt without a lease.
struct NetworkdClient {
    std::uint32_t ifindex = 0;
    bool ipv6 = false;
    std::optional<std::uint64_t> obtained{};
    std::optional<std::uint64_t> renews{};
    std::optional<std::uint64_t> rebinds{};
    std::string identifier{};  ///< its DUID, or of IPv4 its client identifier, in hexadecimal

    bool operator==(const NetworkdClient&) const = default;
};

struct NetworkdDescription {
    std::vector<NetworkdAddress> addresses;
    std::vector<NetworkdClient> clients;

    bool operator==(const NetworkdDescription&) const = default;
};

/// Parses networkd's description of itself, or of one link. Any text gives facts or a
/// reason; what is not an address is skipped.
[[nodiscard]] Parsed<NetworkdDescription> parseNetworkdDescription(std::string_view json);

/// Asks the networkd of this machine over the system bus.
[[nodiscard]] BusResponse askNetworkd(BusRequests::Deadline deadline);

/// When the system started, in microseconds since the epoch.
[[nodiscard]] std::int64_t startOfSystem();

/// Adds to the facts what the state files do not tell: the servers of DHCPv6 leases,
/// which networkd alone of all clients knows by address, the ends of leases, and the
/// addresses that it was told. `start`: of the system, as startOfSystem() tells it.
void addNetworkdDescription(const NetworkdDescription& description, std::int64_t start,
                            ClientFacts& facts);

}  // namespace ZR::Live
