#pragma once

#include <string_view>

namespace cimdhcp {

/// Whether a text comes before another one for a person: numbers within them by
/// their value ("eth2" before "eth10"), else byte by byte.
[[nodiscard]] bool comesBefore(std::string_view a, std::string_view b) noexcept;

}  // namespace cimdhcp
