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

/// Whether a name comes back from a configuration file as it was put in: it is one
/// line without blanks at its ends or quotation marks around it.
[[nodiscard]] bool canBeConfigurationName(const std::string& name);

/// Makes the data directory, mode 0755, unless it exists. True when it was made.
/// Throws Failure.
bool createDataDirectory(const std::string& dataDir);

/// Makes a new configuration file, mode 0644, that names its interface and the
/// configuration. Throws Failure, also when there is such a file already; no
/// half-written file stays.
void createConfigurationFile(const std::string& path, const std::string& interfaceName,
                             const std::string& name);

/// Gives the last line of a file its end. Throws Failure.
void endLastLine(const std::string& path);

/// Why the provider could not change a file, as far as this process can see.
[[nodiscard]] std::string whyUnchanged(const std::string& path);

/// What a configuration file says of the name now, or why that cannot be told.
[[nodiscard]] std::string nameInFile(const std::string& path);

}  // namespace cimdhcp
