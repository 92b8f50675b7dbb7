#pragma once

#include <string>

namespace cimdhcp {

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
