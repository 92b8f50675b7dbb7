#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace cimdhcp {

// What a rename would do that no one means. The provider writes "CONFIG_NAME=", the name
// as it is, and a line feed, in place of every piece of the file that contains the key,
// where a piece is a line, or 511 bytes of a longer one.

/// Why a name should not be written, each with what would happen; empty: it is harmless.
/// Harmless is a name that a shell that reads the line takes for just that name, and that
/// leaves the line short enough for the next rename.
[[nodiscard]] std::vector<std::string> refusalsOfName(std::string_view name);

/// Why a file with this content should not be changed, each with the number and the text
/// of a line, and with what would happen to it.
[[nodiscard]] std::vector<std::string> refusalsOfContent(std::string_view content);

/// Whether what is added to a content would be glued to its last line.
[[nodiscard]] bool lacksLineEnd(std::string_view content);

/// The lines of a content that give a configuration name: "CONFIG_NAME=office in line 2".
[[nodiscard]] std::string namesIn(std::string_view content);

}  // namespace cimdhcp
