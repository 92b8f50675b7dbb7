#pragma once

#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace cimdhcp {

/// The one of the names that a person who typed `wanted` most likely meant: that differs by
/// few letters, or begins with it. Case does not count. None when no name is near enough; the
/// first of several that are as near.
[[nodiscard]] std::optional<std::string> nearestTo(std::string_view wanted,
                                                   std::span<const std::string> names);

/// "; did you mean NAME?", printable, or an empty text.
[[nodiscard]] std::string didYouMean(std::string_view wanted, std::span<const std::string> names);

}  // namespace cimdhcp
