#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

namespace ZR::Live {

/// A time without end, in seconds.
inline constexpr std::uint64_t infiniteTime = UINT64_MAX;

/// Seconds of a time span as systemd writes it: a plain number, "8min 45s", "infinity".
/// The number 4294967295, which means an infinite lease on the wire, is infinite too.
[[nodiscard]] std::optional<std::uint64_t> parseTimeSpan(std::string_view text);

}  // namespace ZR::Live
