#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "formats/IpAddress.h"
#include "formats/ValueFormats.h"

namespace ZR::Live {

/// What a server's BOOTP or DHCP reply says (RFC 951, RFC 2131).
struct DhcpReply {
    std::optional<IpAddress> address;          ///< "your" address
    std::optional<IpAddress> server;           ///< option 54
    bool bootp = false;                        ///< no DHCP message type (option 53)
    std::optional<std::uint32_t> leaseTime;    ///< option 51, seconds; UINT32_MAX: for ever
    std::optional<std::uint32_t> renewal{};    ///< option 58 (T1), likewise
    std::optional<std::uint32_t> rebinding{};  ///< option 59 (T2), likewise
    std::vector<std::uint16_t> options{};      ///< codes, in their order, each once
    std::string
        clientIdentifier{};  ///< option 61 (RFC 6842), bytes in hexadecimal with ":" between

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
    /// T1 and T2 of its association, likewise; nullopt where the server leaves them to
    /// the client.
    std::optional<std::uint32_t> renewal{};
    std::optional<std::uint32_t> rebinding{};

    bool operator==(const Dhcp6Address&) const = default;
};

/// What a server's DHCPv6 reply says (RFC 8415). It names its server by a DUID only,
/// which is not an address.
struct Dhcp6Reply {
    std::vector<Dhcp6Address> addresses;
    std::vector<std::uint16_t> options{};  ///< codes, in their order, each once
    std::string clientIdentifier{};        ///< the client's DUID, as DhcpReply has it

    bool operator==(const Dhcp6Reply&) const = default;
};
[[nodiscard]] Parsed<Dhcp6Reply> parseDhcp6Reply(std::span<const std::byte> message);

}  // namespace ZR::Live
