#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace cimom {

/// A CIM datetime in numbers (DSP0004, 5.2.4).
struct DateTime {
    bool interval = false;
    /// Microseconds: since 1970-01-01 UTC (negative before it), or of duration.
    std::int64_t microseconds = 0;

    bool operator==(const DateTime&) const = default;
};

/// Reads the 25-character form of points in time (yyyymmddhhmmss.mmmmmmsutc)
/// and intervals (ddddddddhhmmss.mmmmmm:000). Unknown low-order fields may be
/// asterisks; they count as their smallest value. Nothing for any other text.
[[nodiscard]] std::optional<DateTime> parseDateTime(std::string_view text) noexcept;

/// Writes that form, points in time in UTC. Nothing for a value outside of the
/// years 0 to 9999, a negative interval, or one of more than 99999999 days.
[[nodiscard]] std::optional<std::string> toText(const DateTime& value);

}  // namespace cimom
