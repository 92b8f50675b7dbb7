// The clients that leave one small file of lines each.
#include "Ifcfg.h"
#include "Input.h"
#include "Ipconfig.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static_cast<void>(ZR::Live::parseIfcfg(fuzz::text(data, size)));
    static_cast<void>(ZR::Live::parseIpconfig(fuzz::text(data, size)));
    return 0;
}
