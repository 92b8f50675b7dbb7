#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

#include "formats/IpAddress.h"
#include "formats/Parsed.h"

namespace ZR::Live {

/// What a server's BOOTP or DHCP reply says (RFC 951, RFC 2131).
struct DhcpReply {
    std::optional<IpAddress> address;        ///< "your" address
    std::optional<IpAddress> server;         ///< option 54
    bool bootp = false;                      ///< no DHCP message type (option 53)
    std::optional<std::uint32_t> leaseTime;  ///< option 51, seconds; UINT32_MAX: for ever

    bool operator==(const DhcpReply&) const = default;
};

/// Parses the message that a server sent, from its first byte to its end option.
/// Options that are split (RFC 3396) or overflow into the file and server name fields
/// (option 52) are put together.
[[nodiscard]] Parsed<DhcpReply> parseDhcpReply(std::span<const std::byte> message);

/// One address of a DHCPv6 reply.
struct Dhcp6Address {
    IpAddress address;
    std::uint32_t validLifetime = 0;  ///< seconds; UINT32_MAX: for ever

    bool operator==(const Dhcp6Address&) const = default;
};

/// What a server's DHCPv6 reply says (RFC 8415). It names its server by a DUID only,
/// which is not an address.
struct Dhcp6Reply {
    std::vector<Dhcp6Address> addresses;

    bool operator==(const Dhcp6Reply&) const = default;
};
[[nodiscard]] Parsed<Dhcp6Reply> parseDhcp6Reply(std::span<const std::byte> message);

}  // namespace ZR::Live
