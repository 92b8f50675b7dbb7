#pragma once

#include <charconv>
#include <optional>
#include <string_view>
#include <system_error>

namespace ZR::Live {

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

}  // namespace ZR::Live
