#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace cimdhcp {

/// The text as it can be shown to a person: control characters, which could steer
/// a terminal, and bytes that are not UTF-8 become \xNN, other characters that
/// cannot be printed, marks of direction and separators of lines \uNNNN or \UNNNNNNNN.
[[nodiscard]] std::string printable(std::string_view text);

/// How many columns a printable UTF-8 text takes; wide characters take two.
[[nodiscard]] std::size_t displayWidth(std::string_view text);

/// The text, when it fits into `width` (at least 1) columns, else its beginning and "…".
[[nodiscard]] std::string cutToWidth(const std::string& text, std::size_t width);

/// The text in lines of at most `width` (at least 2) columns, broken at blanks
/// where there are some. One line for an empty text.
[[nodiscard]] std::vector<std::string> wrapToWidth(std::string_view text, std::size_t width);

/// How many columns there are to write in: none when the descriptor is not a
/// terminal, since what goes into a pipe or a file is never cut. On a terminal
/// `columns` (the variable COLUMNS, null when not set) counts first, then what the
/// terminal says, then 80.
[[nodiscard]] std::optional<std::size_t> terminalWidth(int descriptor, const char* columns);

/// Whether the environment's locale has UTF-8, so that characters beyond ASCII can be shown.
[[nodiscard]] bool showsUtf8();

}  // namespace cimdhcp
