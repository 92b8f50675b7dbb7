#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

#include "clients/Lease.h"
#include "formats/Roots.h"

namespace ZR::Live {

/// The sockets on UDP port 68 in a text of the form of /proc/net/udp. Lines that are
/// none are skipped.
[[nodiscard]] std::vector<PortSocket> parseUdpSockets(std::string_view text);

/// The links of the packet sockets that hear IPv4 in a text of the form of
/// /proc/net/packet, each once. Such a socket alone proves nothing: it may be a sniffer's.
[[nodiscard]] std::vector<std::uint32_t> parsePacketLinks(std::string_view text);

/// Adds the sockets of this network namespace. Anybody may read them, also where the
/// processes that have them are hidden.
void readSockets(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
