#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace cimdhcp {

/// Whether a text comes before another one for a person: numbers within them by
/// their value ("eth2" before "eth10"), else byte by byte.
[[nodiscard]] bool comesBefore(std::string_view a, std::string_view b) noexcept;

/// Which of the names a person means: without regard to case, and with hyphens or
/// underscores in place of blanks. Throws Failure when it is none of them.
[[nodiscard]] std::size_t columnNamed(const std::string& wanted,
                                      const std::vector<std::string>& names);

}  // namespace cimdhcp
