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
#include "formats/Numbers.h"

namespace ZR::Live {
namespace {

constexpr std::uint16_t clientPort = 68;  // RFC 2131, section 4.1
constexpr int hexadecimal = 16;
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
    const auto address = parseNumber<std::uint32_t>(text.substr(0, colon), hexadecimal);
    const auto port = parseNumber<std::uint16_t>(text.substr(colon + 1), hexadecimal);
    if (!address || !port) {
        return std::nullopt;
    }
    EndPoint point{.address = {}, .port = *port};
    if (*address != INADDR_ANY) {
        point.address = IpAddress::fromBytes(AF_INET, std::as_bytes(std::span{&*address, 1}));
    }
    return point;
}

}  // namespace

std::vector<PortSocket> parseUdpSockets(std::string_view text) {
    std::vector<PortSocket> sockets;
    // Number, own end, other end.
    forEachLine<3>(text, [&](const std::array<std::string_view, 3>& words) {
        const auto own = parseEndPoint(words[1]);
        const auto other = parseEndPoint(words[2]);
        if (own && other && own->port == clientPort) {
            sockets.push_back({.address = own->address, .peer = other->address});
        }
    });
    return sockets;
}

std::vector<std::uint32_t> parsePacketLinks(std::string_view text) {
    std::vector<std::uint32_t> links;
    // Address, references, type, protocol, link.
    forEachLine<5>(text, [&](const std::array<std::string_view, 5>& words) {
        const std::uint16_t protocol =
            parseNumber<std::uint16_t>(words[3], hexadecimal).value_or(0);
        const auto link = parseNumber<std::uint32_t>(words[4]);
        const bool heard = protocol == everyProtocol || protocol == ipv4Protocol;
        if (heard && link && *link != 0 &&
            std::find(links.begin(), links.end(), *link) == links.end()) {
            links.push_back(*link);
        }
    });
    return links;
}

ClientSockets readSockets(const Roots& roots, std::vector<Diagnostic>& diagnostics) {
    // Of this thread: namespaces belong to threads, not to processes.
    const std::string directory = roots.proc + "/thread-self/net";
    ClientSockets sockets;
    const auto udp = readOptionalFile(pathIn(directory, "udp"), diagnostics);
    sockets.bound = parseUdpSockets(udp.value_or(""));
    if (!sockets.bound.empty()) {
        const auto packet = readOptionalFile(pathIn(directory, "packet"), diagnostics);
        sockets.packetLinks = parsePacketLinks(packet.value_or(""));
    }
    return sockets;
}

}  // namespace ZR::Live
