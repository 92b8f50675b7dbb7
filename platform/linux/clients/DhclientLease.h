#pragma once

#include <cstdint>
#include <optional>
#include <string_view>
#include <vector>

#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"

namespace ZR::Live {

/// One address of a lease block.
struct DhclientAddress {
    IpAddress address;
    std::optional<std::int64_t> expires;  ///< epoch seconds, or Lease::never

    bool operator==(const DhclientAddress&) const = default;
};

/// One block "lease { }" or "lease6 { }" of ISC dhclient.
struct DhclientLease {
    bool ipv6 = false;
    InterfaceName interfaceName;
    std::vector<DhclientAddress> addresses;
    std::optional<IpAddress> server;  ///< DHCP option 54; DHCPv6 names servers by DUID only
    bool bootp = false;
    bool released = false;

    bool operator==(const DhclientLease&) const = default;
};

/// The leases of a lease file: of each interface and protocol the last block, which is
/// the newest, in the order in which the interfaces first appear. Any text gives facts:
/// what is not understood is skipped, and so is a block within which the file ends.
[[nodiscard]] std::vector<DhclientLease> parseDhclientLeases(std::string_view text);

}  // namespace ZR::Live
