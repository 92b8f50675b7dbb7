#pragma once

#include <vector>

#include "arguments/CommandLine.h"
#include "client/Installation.h"
#include "commands/Findings.h"

namespace cimdhcp {

/// Looks at everything that an answer needs, from the settings file to one
/// enumeration of each served class, and tells why something is empty. Later
/// parts are looked at as far as the failure of earlier ones allows. Hands the
/// options to the platform (see setUpPlatform).
[[nodiscard]] std::vector<Finding> check(const Options& options,
                                         const std::vector<Directories>& installations);

}  // namespace cimdhcp
