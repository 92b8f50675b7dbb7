#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace ZR::Live {

/// One address of a lease block.
struct DhclientAddress {
    std::string address;                  ///< canonical text
    std::optional<std::int64_t> expires;  ///< epoch seconds, or Lease::never

    bool operator==(const DhclientAddress&) const = default;
};

/// One block "lease { }" or "lease6 { }" of ISC dhclient.
struct DhclientLease {
    bool ipv6 = false;
    std::string interfaceName;
    std::vector<DhclientAddress> addresses;
    std::string server;  ///< DHCP option 54, canonical text; DHCPv6 names servers by DUID only
    bool bootp = false;
    bool released = false;

    bool operator==(const DhclientLease&) const = default;
};

/// The content of a lease file.
struct DhclientLeases {
    /// Of each interface and protocol the last block, which is the newest; in the
    /// order in which the interfaces first appear.
    std::vector<DhclientLease> leases;
    bool torn = false;  ///< the file ends within a statement, which was left out

    bool operator==(const DhclientLeases&) const = default;
};

/// Parses a lease file. Any text gives facts: what is not understood is skipped.
[[nodiscard]] DhclientLeases parseDhclientLeases(std::string_view text);

}  // namespace ZR::Live
