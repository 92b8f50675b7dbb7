#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "Input.h"
#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"

namespace fuzz {

/// The text of an address, which must read back as that address.
inline std::string textOf(const ZR::Live::IpAddress& address) {
    std::string text = address.text();
    require(ZR::Live::IpAddress::fromText(address.family(), text) == address,
            "an address survives being written");
    return text;
}

/// Empty for none.
inline std::string textOf(const std::optional<ZR::Live::IpAddress>& address) {
    return address ? textOf(*address) : std::string();
}

/// Empty for none.
inline std::string textOf(const std::optional<ZR::Live::InterfaceName>& name) {
    return name ? std::string(name->view()) : std::string();
}

inline std::vector<std::uint8_t> addressBytes(const ZR::Live::IpAddress& address) {
    std::vector<std::uint8_t> bytes;
    for (const std::byte byte : address.bytes()) {
        bytes.push_back(std::to_integer<std::uint8_t>(byte));
    }
    return bytes;
}

/// NAME='value' as a shell reads it back, with a line feed.
inline std::string shellLine(const std::string& name, const std::string& value) {
    std::string line = name + "='";
    for (const char letter : value) {
        line += letter == '\'' ? std::string("'\\''") : std::string(1, letter);
    }
    return line + "'\n";
}

}  // namespace fuzz
