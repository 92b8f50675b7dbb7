#pragma once

#include <sys/types.h>

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "formats/Files.h"
#include "formats/IpAddress.h"
#include "zrclient/Diagnostic.h"

namespace ZR::Live {

/// A UDP socket on the port of DHCP clients (68, RFC 2131 section 4.1).
struct PortSocket {
    std::optional<IpAddress> address;  ///< of IPv4; nullopt: of all links
    std::optional<IpAddress> peer;     ///< the one address that it talks to
    uid_t user = 0;                    ///< who opened it

    bool operator==(const PortSocket&) const = default;
};

/// The sockets on UDP port 68 in a text of the form of /proc/net/udp. Lines that are not
/// of that form are skipped.
[[nodiscard]] std::vector<PortSocket> parseUdpSockets(std::string_view text);

/// A packet socket of one link that hears IPv4 there. Such a socket alone proves nothing: it
/// may be a sniffer's.
struct PacketSocket {
    std::uint32_t link = 0;   ///< index, never 0
    std::uint64_t inode = 0;  ///< the number in "socket:[NUMBER]" of /proc/PID/fd

    bool operator==(const PacketSocket&) const = default;
};

/// The sockets that may be those of a DHCP client.
struct ClientSockets {
    std::vector<PortSocket> bound;           ///< on the port of DHCP clients
    std::vector<std::uint32_t> packetLinks;  ///< links that one of `packets` hears; none
                                             ///< without a bound one
    std::vector<PacketSocket> packets;       ///< all, whoever has them

    bool operator==(const ClientSockets&) const = default;
};

/// Those in a text of the form of /proc/net/packet. Lines that are not of that form are
/// skipped.
[[nodiscard]] std::vector<PacketSocket> parsePacketSockets(std::string_view text);

/// Those of this network namespace.
[[nodiscard]] std::vector<PacketSocket> readPacketSockets(const Roots& roots,
                                                          std::vector<Diagnostic>& diagnostics);

/// The sockets of this network namespace. Any user may read them, also where the
/// processes that have them are hidden. Each table is read once.
///
/// Where every user may bind the port (net.ipv4.ip_unprivileged_port_start, ip(7)), only the
/// sockets of root and of `users`, those of the running clients and managers, are believed.
/// The others give a diagnostic.
[[nodiscard]] ClientSockets readSockets(const Roots& roots, std::vector<Diagnostic>& diagnostics,
                                        std::span<const uid_t> users = {});

}  // namespace ZR::Live
