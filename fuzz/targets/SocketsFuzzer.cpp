// The tables of sockets under /proc/net.
#include "kernel/Sockets.h"

#include <array>
#include <set>

#include "Input.h"
#include "support/Addresses.h"

namespace {

std::string endPoint(const std::optional<ZR::Live::IpAddress>& address, unsigned port) {
    std::uint32_t number = 0;  // in the order in which the machine keeps it
    if (address) {
        const auto bytes = fuzz::addressBytes(*address);
        std::memcpy(&number, bytes.data(), sizeof number);
    }
    std::array<char, 16> text{};
    static_cast<void>(std::snprintf(text.data(), text.size(), "%08X:%04X", number, port));
    return text.data();
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text = fuzz::text(data, size);
    const auto sockets = ZR::Live::parseUdpSockets(text);
    std::string again = "  sl  local_address rem_address   st\n";
    for (const auto& socket : sockets) {
        for (const auto& address : {socket.address, socket.peer}) {
            fuzz::require(!address || address->isIPv4(), "an end is an IPv4 address");
        }
        again +=
            "  11: " + endPoint(socket.address, 68) + ' ' + endPoint(socket.peer, 67) + " 07\n";
    }
    fuzz::require(ZR::Live::parseUdpSockets(again) == sockets, "sockets survive being written");

    const auto links = ZR::Live::parsePacketLinks(text);
    again = "sk               RefCnt Type Proto  Iface R Rmem   User   Inode\n";
    for (const std::uint32_t link : links) {
        again += "0000000000000000 3      3    0003   " + std::to_string(link) + "     1 0 0 1\n";
    }
    fuzz::require(ZR::Live::parsePacketLinks(again) == links, "links survive being written");
    fuzz::require(std::set(links.begin(), links.end()).size() == links.size(),
                  "each link is there once");
    return 0;
}
