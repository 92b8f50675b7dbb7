#include "kernel/Sockets.h"

#include <linux/if_ether.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <optional>
#include <span>
#include <string>

#include "formats/Files.h"
#include "formats/Trust.h"
#include "formats/ValueFormats.h"

namespace ZR::Live {
namespace {

constexpr std::uint16_t clientPort = 68;  // RFC 2131, section 4.1
constexpr int base16 = 16;
constexpr std::uint16_t everyProtocol = ETH_P_ALL;
constexpr std::uint16_t ipv4Protocol = ETH_P_IP;

/// The words of a line, as many as there is room for.
template <std::size_t size>
std::size_t split(std::string_view line, std::array<std::string_view, size>& words) {
    std::size_t count = 0;
    while (count < size) {
        line.remove_prefix(std::min(line.find_first_not_of(' '), line.size()));
        if (line.empty()) {
            break;
        }
        words.at(count) = line.substr(0, line.find(' '));
        line.remove_prefix(words.at(count).size());
        ++count;
    }
    return count;
}

template <std::size_t size, typename Action>
void forEachLine(std::string_view text, Action action) {
    while (!text.empty()) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        std::array<std::string_view, size> words{};
        if (split(text.substr(0, end), words) == size) {
            action(words);
        }
        text.remove_prefix(std::min(end + 1, text.size()));
    }
}

struct EndPoint {
    std::optional<IpAddress> address;
    std::uint16_t port = 0;
};

/// "016433C6:0044": the address as the machine keeps it in memory, read as a number.
std::optional<EndPoint> parseEndPoint(std::string_view text) {
    const std::size_t colon = text.find(':');
    if (colon == std::string_view::npos) {
        return std::nullopt;
    }
    const auto address = parseNumber<std::uint32_t>(text.substr(0, colon), base16);
    const auto port = parseNumber<std::uint16_t>(text.substr(colon + 1), base16);
    if (!address || !port) {
        return std::nullopt;
    }
    EndPoint point{.address = {}, .port = *port};
    if (*address != INADDR_ANY) {
        point.address = IpAddress::fromBytes(AF_INET, std::as_bytes(std::span{&*address, 1}));
    }
    return point;
}

/// A table of this network namespace.
std::string ownNetwork(const Roots& roots, std::string_view table) {
    // Of this thread: namespaces belong to threads, not to processes.
    return pathIn(roots.proc + "/thread-self/net", table);
}

/// Whether only root, and who has the capability for it, may bind the clients' port.
bool isPrivileged(const Roots& roots, std::vector<Diagnostic>& diagnostics) {
    constexpr std::uint32_t alwaysSo = 1024;  // before Linux 4.11, which made it a setting
    const auto text =
        readOptionalFile(roots.proc + "/sys/net/ipv4/ip_unprivileged_port_start", diagnostics);
    if (!text) {
        return true;
    }
    return parseNumber<std::uint32_t>(text->substr(0, text->find('\n'))).value_or(alwaysSo) >
           clientPort;
}

void removeUntrusted(const Roots& roots, std::span<const uid_t> users,
                     std::vector<PortSocket>& sockets, std::vector<Diagnostic>& diagnostics) {
    const auto isDoubtful = [&](const PortSocket& socket) {
        return socket.user != 0 &&
               std::find(users.begin(), users.end(), socket.user) == users.end();
    };
    if (std::none_of(sockets.begin(), sockets.end(), isDoubtful) ||
        isPrivileged(roots, diagnostics)) {
        return;
    }
    std::erase_if(sockets, [&](const PortSocket& socket) {
        const bool doubtful = isDoubtful(socket);
        if (doubtful) {
            diagnostics.push_back(
                untrusted("a socket of user " + std::to_string(socket.user) + " on UDP port 68",
                          "every user may open one here"));
        }
        return doubtful;
    });
}

}  // namespace

std::vector<PortSocket> parseUdpSockets(std::string_view text) {
    std::vector<PortSocket> sockets;
    // Number, own end, other end, state, queues, timer, retransmissions, user.
    forEachLine<8>(text, [&](const std::array<std::string_view, 8>& words) {
        const auto own = parseEndPoint(words[1]);
        const auto other = parseEndPoint(words[2]);
        const auto user = parseNumber<std::uint32_t>(words[7]);
        if (own && other && user && own->port == clientPort) {
            sockets.push_back({.address = own->address, .peer = other->address, .user = *user});
        }
    });
    return sockets;
}

std::vector<PacketSocket> parsePacketSockets(std::string_view text) {
    std::vector<PacketSocket> sockets;
    // Address, references, type, protocol, link, running, memory, user, inode.
    forEachLine<9>(text, [&](const std::array<std::string_view, 9>& words) {
        const std::uint16_t protocol = parseNumber<std::uint16_t>(words[3], base16).value_or(0);
        const auto link = parseNumber<std::uint32_t>(words[4]);
        const auto inode = parseNumber<std::uint64_t>(words[8]);
        const bool heard = protocol == everyProtocol || protocol == ipv4Protocol;
        if (heard && link && *link != 0 && inode) {
            sockets.push_back({.link = *link, .inode = *inode});
        }
    });
    return sockets;
}

std::vector<PacketSocket> readPacketSockets(const Roots& roots,
                                            std::vector<Diagnostic>& diagnostics) {
    return parsePacketSockets(
        readOptionalFile(ownNetwork(roots, "packet"), diagnostics).value_or(""));
}

ClientSockets readSockets(const Roots& roots, std::vector<Diagnostic>& diagnostics,
                          std::span<const uid_t> users) {
    ClientSockets sockets;
    const auto udp = readOptionalFile(ownNetwork(roots, "udp"), diagnostics);
    sockets.bound = parseUdpSockets(udp.value_or(""));
    removeUntrusted(roots, users, sockets.bound, diagnostics);
    sockets.packets = readPacketSockets(roots, diagnostics);
    if (!sockets.bound.empty()) {
        for (const PacketSocket& socket : sockets.packets) {
            auto& links = sockets.packetLinks;
            if (std::find(links.begin(), links.end(), socket.link) == links.end()) {
                links.push_back(socket.link);
            }
        }
    }
    return sockets;
}

}  // namespace ZR::Live
