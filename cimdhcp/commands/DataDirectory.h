#pragma once

#include <filesystem>
#include <string>
#include <vector>

#include "commands/Findings.h"

namespace cimdhcp {

/// Directories whose files shells or network scripts read.
[[nodiscard]] const std::vector<std::filesystem::path>& sourcedDirectories();

/// Examines the directory of the ifcfg-INTERFACE files: that it is there, can be read and
/// written by this user, and is none of those given, nor inside one, by whatever name.
void lookAtDataDirectory(const std::string& directory, std::vector<Finding>& findings,
                         const std::vector<std::filesystem::path>& sourced = sourcedDirectories());

}  // namespace cimdhcp
