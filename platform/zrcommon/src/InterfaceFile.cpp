#include "zrcommon/InterfaceFile.h"

#include <algorithm>
#include <cstdint>

namespace ZR {

std::optional<std::string> InterfaceFile::path(const std::string& directory,
                                               const std::string& interfaceName) {
    const bool unusable = std::any_of(interfaceName.begin(), interfaceName.end(), [](char c) {
        const auto byte = static_cast<std::uint8_t>(c);
        return c == '/' || byte < 0x20 || byte == 0x7F;
    });
    if (unusable || interfaceName.empty() || interfaceName == "." || interfaceName == "..") {
        return std::nullopt;
    }
    return directory + std::string(prefix) + interfaceName;
}

}  // namespace ZR
