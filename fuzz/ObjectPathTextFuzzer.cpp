#include "cimom/ObjectPathText.h"

#include "Input.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    try {
        const cimom::ObjectPath path = cimom::parseObjectPath(fuzz::text(data, size));
        // The host is not written; everything else comes back as it was.
        cimom::ObjectPath again = cimom::parseObjectPath(cimom::toText(path));
        fuzz::require(again == path);
    } catch (const cimom::ObjectPathError&) {
        return 0;
    }
    return 0;
}
