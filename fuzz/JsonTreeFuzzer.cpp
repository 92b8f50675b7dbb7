#include "sources/JsonTree.h"

#include "Input.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static_cast<void>(ZR::parseJsonTree(fuzz::text(data, size), "host"));
    return 0;
}
