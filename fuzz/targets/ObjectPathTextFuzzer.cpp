// Object paths, as people and clients type them.
#include "cimom/ObjectPathText.h"

#include "Input.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    try {
        const cimom::ObjectPath path = cimom::parseObjectPath(fuzz::text(data, size));
        // The host is not written; everything else comes back as it was.
        const std::string text = cimom::toText(path);
        const cimom::ObjectPath again = cimom::parseObjectPath(text);
        fuzz::require(again == path, "a path survives being written");
        fuzz::require(cimom::toText(again) == text, "a path has one text");
        fuzz::require(again.keys.size() == path.keys.size(), "every key is written");
    } catch (const cimom::ObjectPathError&) {
        return 0;
    }
    return 0;
}
