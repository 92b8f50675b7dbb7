#pragma once

#include <cstddef>
#include <optional>

namespace cimdhcp {

/// How many columns there are to write in: none when the descriptor is not a
/// terminal, since what goes into a pipe or a file is never cut. On a terminal
/// `columns` (the variable COLUMNS, null when not set) counts first, then what the
/// terminal says, then 80.
[[nodiscard]] std::optional<std::size_t> terminalWidth(int descriptor, const char* columns);

/// Whether the environment's locale has UTF-8, so that characters beyond ASCII can be shown.
[[nodiscard]] bool showsUtf8();

}  // namespace cimdhcp
