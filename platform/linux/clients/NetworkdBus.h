#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "facts/ClientFacts.h"
#include "formats/IpAddress.h"
#include "formats/Parsed.h"

namespace ZR::Live {

/// What networkd says of one address of a link.
struct NetworkdAddress {
    std::uint32_t ifindex = 0;
    IpAddress address;
    std::string source;                 ///< "DHCPv4", "DHCPv6", "static", "IPv4LL", "foreign", ...
    std::optional<IpAddress> provider;  ///< the server that gave it

    bool operator==(const NetworkdAddress&) const = default;
};

/// Parses networkd's description of itself, or of one link. Any text gives facts or a
/// reason; what is not an address is skipped.
[[nodiscard]] Parsed<std::vector<NetworkdAddress>> parseNetworkdDescription(std::string_view json);

/// A description as text, or the reason why there is none; both empty where there is
/// no bus or no networkd.
struct NetworkdResponse {
    std::string json;
    std::string reason;

    bool operator==(const NetworkdResponse&) const = default;
};

/// Asks the networkd of this machine over the system bus. Starts nothing, and returns
/// at the deadline at the latest, whatever the bus and networkd do. Never throws apart
/// from std::bad_alloc.
[[nodiscard]] NetworkdResponse askNetworkd(std::chrono::steady_clock::time_point deadline);

/// Adds to the facts what the state files do not tell: the servers of DHCPv6 leases,
/// which networkd alone of all clients knows by address, and the addresses that it was
/// told. Of a lease that is there already nothing is added.
void addNetworkdDescription(const std::vector<NetworkdAddress>& addresses, ClientFacts& facts);

}  // namespace ZR::Live
