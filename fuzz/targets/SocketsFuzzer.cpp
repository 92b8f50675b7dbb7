// The tables of sockets under /proc/net, and the status of a process beside them.
#include "kernel/Sockets.h"

#include <array>

#include "Input.h"
#include "clients/Processes.h"
#include "support/Texts.h"

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
        again += "  11: " + endPoint(socket.address, 68) + ' ' + endPoint(socket.peer, 67) +
                 " 07 00000000:00000000 00:00000000 00000000 " + std::to_string(socket.user) + "\n";
    }
    fuzz::require(ZR::Live::parseUdpSockets(again) == sockets, "sockets survive being written");

    const auto heard = ZR::Live::parsePacketSockets(text);
    again = "sk               RefCnt Type Proto  Iface R Rmem   User   Inode\n";
    for (const auto& socket : heard) {
        fuzz::require(socket.link != 0, "a socket hears a link");
        again += "0000000000000000 3      3    0003   " + std::to_string(socket.link) +
                 "     1 0 0 " + std::to_string(socket.inode) + "\n";
    }
    fuzz::require(ZR::Live::parsePacketSockets(again) == heard, "sockets survive being written");

    const auto status = ZR::Live::parseProcessStatus(text);
    fuzz::require(!status || status->state != '\0', "a process has a state");
    return 0;
}
