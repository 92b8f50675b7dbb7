#pragma once

#include <optional>
#include <string>

namespace cimdhcp {

/// The path of an interface's configuration file in the data directory, which ends
/// with "/". None when the name cannot be part of a file's name.
[[nodiscard]] std::optional<std::string> configurationFilePath(const std::string& dataDir,
                                                               const std::string& interfaceName);

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

/// Why a file could not be changed, as far as it can be told from outside.
[[nodiscard]] std::string whyUnchanged(const std::string& path);

}  // namespace cimdhcp
