#include "DhcpPacket.h"

#include "Input.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static_cast<void>(ZR::Live::parseDhcpReply(fuzz::bytes(data, size)));
    static_cast<void>(ZR::Live::parseDhcp6Reply(fuzz::bytes(data, size)));
    return 0;
}
