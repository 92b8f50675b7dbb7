#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "formats/IpAddress.h"
#include "formats/Roots.h"
#include "zrclient/Diagnostic.h"

namespace ZR::Live {

/// A UDP socket on the port of DHCP clients (68, RFC 2131 section 4.1).
struct PortSocket {
    std::optional<IpAddress> address;  ///< of IPv4; nullopt: of all links
    std::optional<IpAddress> peer;     ///< the one address that it talks to

    bool operator==(const PortSocket&) const = default;
};

/// The sockets that may be those of a DHCP client.
struct ClientSockets {
    std::vector<PortSocket> bound;           ///< on the port of DHCP clients
    std::vector<std::uint32_t> packetLinks;  ///< links where a packet socket hears IPv4

    bool operator==(const ClientSockets&) const = default;
};

/// The sockets on UDP port 68 in a text of the form of /proc/net/udp. Lines that are not
/// of that form are skipped.
[[nodiscard]] std::vector<PortSocket> parseUdpSockets(std::string_view text);

/// The links of the packet sockets that hear IPv4 in a text of the form of
/// /proc/net/packet, each once. Such a socket alone proves nothing: it may be a sniffer's.
[[nodiscard]] std::vector<std::uint32_t> parsePacketLinks(std::string_view text);

/// The sockets of this network namespace. Any user may read them, also where the
/// processes that have them are hidden. Packet sockets are looked at only where there is
/// a bound one.
[[nodiscard]] ClientSockets readSockets(const Roots& roots, std::vector<Diagnostic>& diagnostics);

}  // namespace ZR::Live
