#include "Wicked.h"

#include "Input.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static_cast<void>(ZR::Live::parseWickedLease(fuzz::text(data, size)));
    return 0;
}
