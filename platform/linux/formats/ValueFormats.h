#pragma once

#include <charconv>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <system_error>
#include <variant>

namespace ZR::Live {

/// Facts, or the reason why there are none.
template <typename Facts>
using Parsed = std::variant<Facts, std::string_view>;

/// The number that the whole text is; nullopt when it is not a number, has anything
/// around it, or does not fit.
template <typename Number>
[[nodiscard]] std::optional<Number> parseNumber(std::string_view text, int base = 10) noexcept {
    Number value{};
    const char* const end = text.data() + text.size();
    const auto result = std::from_chars(text.data(), end, value, base);
    if (text.empty() || result.ec != std::errc{} || result.ptr != end) {
        return std::nullopt;
    }
    return value;
}

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

/// A time without end, in seconds.
inline constexpr std::uint64_t infiniteTime = UINT64_MAX;

/// Seconds of a time span as systemd writes it: a plain number, "8min 45s", "infinity".
/// The number 4294967295, which means an infinite lease on the wire, is infinite too.
[[nodiscard]] std::optional<std::uint64_t> parseTimeSpan(std::string_view text);

}  // namespace ZR::Live
