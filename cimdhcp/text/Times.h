#pragma once

#include <chrono>
#include <cstdint>
#include <string>

namespace cimdhcp {

/// Since the epoch.
[[nodiscard]] std::int64_t secondsNow();

/// "0.123 s"
[[nodiscard]] std::string durationText(std::chrono::duration<double> duration);

/// A moment as it lies from another one: "in 4 h", "12 min ago"; one that is more than a
/// hundred days away by its date (UTC), "2027-03-01". Both in seconds since the epoch.
[[nodiscard]] std::string relativeText(std::int64_t moment, std::int64_t now);

/// "2026-11-20T08:15:30Z"; moments outside the years 1970 to 9999 as the nearest within.
[[nodiscard]] std::string isoText(std::int64_t moment);

}  // namespace cimdhcp
