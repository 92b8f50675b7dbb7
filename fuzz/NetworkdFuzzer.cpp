#include "Networkd.h"

#include "Input.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static_cast<void>(ZR::Live::parseTimeSpan(fuzz::text(data, size)));
    static_cast<void>(ZR::Live::parseNetworkdLink(fuzz::text(data, size)));
    static_cast<void>(ZR::Live::parseNetworkdLease(fuzz::text(data, size)));
    return 0;
}
