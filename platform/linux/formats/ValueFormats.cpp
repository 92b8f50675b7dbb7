#include "formats/ValueFormats.h"

#include <algorithm>
#include <array>
#include <cstddef>

#include "zrcommon/Strings.h"

namespace ZR::Live {
namespace {

struct TimeUnit {
    std::string_view name;
    std::uint64_t microseconds;
};
constexpr std::uint64_t second = 1'000'000;
constexpr std::array<TimeUnit, 10> timeUnits{{
    {"us", 1},
    {"ms", 1'000},
    {"s", second},
    {"", second},
    {"min", 60 * second},
    {"h", 3'600 * second},
    {"d", 86'400 * second},
    {"w", 604'800 * second},
    {"month", 2'629'800 * second},  // 30.44 days, a twelfth of a year
    {"y", 31'557'600 * second},     // 365.25 days
}};
constexpr std::uint64_t infiniteOnTheWire = UINT32_MAX;

constexpr std::string_view digits = "0123456789";
constexpr std::string_view blanks = " \t";

}  // namespace

std::optional<std::uint64_t> parseTimeSpan(std::string_view text) {
    text = trim(text);
    if (text == "infinity") {
        return infiniteTime;
    }
    if (text.empty()) {
        return std::nullopt;
    }
    std::uint64_t total = 0;
    while (!text.empty()) {
        const std::size_t numberEnd = std::min(text.find_first_not_of(digits), text.size());
        const auto count = parseNumber<std::uint64_t>(text.substr(0, numberEnd));
        text.remove_prefix(numberEnd);
        text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
        const std::size_t unitEnd = std::min(text.find_first_of(" \t0123456789"), text.size());
        const std::string_view name = text.substr(0, unitEnd);
        text.remove_prefix(unitEnd);
        text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
        const auto* const unit =
            std::find_if(timeUnits.begin(), timeUnits.end(),
                         [&](const TimeUnit& known) { return known.name == name; });
        if (!count || unit == timeUnits.end() ||
            *count > (UINT64_MAX - total) / unit->microseconds) {
            return std::nullopt;
        }
        total += *count * unit->microseconds;
    }
    const std::uint64_t seconds = total / second;
    return seconds == infiniteOnTheWire ? infiniteTime : seconds;
}

}  // namespace ZR::Live
