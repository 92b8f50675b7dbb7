#pragma once

#include <cstdint>
#include <vector>

#include "arguments/Commands.h"
#include "client/Installation.h"
#include "commands/check/Findings.h"

namespace cimdhcp {

/// Examines everything that a response depends on, from the settings file to one
/// enumeration of each served class, and explains why something is empty. Later
/// parts are examined as far as the failure of earlier ones allows. Hands the
/// options to the platform (see setUpPlatform). `now` in seconds since the epoch. Each class
/// is a step.
[[nodiscard]] std::vector<Finding> check(const Options& options,
                                         const std::vector<Directories>& installations,
                                         std::int64_t now, const TellStep& tell);

}  // namespace cimdhcp
