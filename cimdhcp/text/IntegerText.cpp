#include "text/IntegerText.h"

#include <charconv>
#include <system_error>

namespace cimdhcp {

std::optional<Integer> readInteger(std::string_view text) noexcept {
    Integer result;
    if (text.starts_with('-') || text.starts_with('+')) {
        result.negative = text.front() == '-';
        text.remove_prefix(1);
    }
    int base = 10;
    if (text.starts_with("0x") || text.starts_with("0X")) {
        base = 16;
        text.remove_prefix(2);
    } else if (text.ends_with('b') || text.ends_with('B')) {
        base = 2;
        text.remove_suffix(1);
    } else if (text.starts_with('0') && text.size() > 1) {
        base = 8;
        text.remove_prefix(1);
    }
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, result.magnitude, base);
    if (text.empty() || error != std::errc() || stop != end) {
        return std::nullopt;
    }
    if (result.magnitude == 0) {
        result.negative = false;
    }
    return result;
}

}  // namespace cimdhcp
