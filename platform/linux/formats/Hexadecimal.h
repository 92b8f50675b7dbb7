#pragma once

#include <cstddef>
#include <span>
#include <string>
#include <string_view>

namespace ZR::Live {

/// Bytes in hexadecimal with ":" between, as in "01:52:54", or with another separator.
[[nodiscard]] inline std::string hexadecimal(std::span<const std::byte> bytes,
                                             std::string_view separator = ":") {
    constexpr std::string_view digits = "0123456789abcdef";
    std::string text;
    for (const std::byte byte : bytes) {
        if (!text.empty()) {
            text += separator;
        }
        text += digits[std::to_integer<unsigned>(byte) >> 4U];
        text += digits[std::to_integer<unsigned>(byte) & 0xFU];
    }
    return text;
}

}  // namespace ZR::Live
