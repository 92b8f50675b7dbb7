#pragma once

#include <vector>

#include "arguments/Commands.h"
#include "client/Installation.h"

namespace cimdhcp {

/// The first installation with a schema; what the options name takes the place of
/// its parts. The registrations of the exact provider are in a directory of their own
/// among the others. Throws Failure that names the places looked at when there is none,
/// or when a directory that an option names does not exist.
[[nodiscard]] Directories findDirectories(const Options& options,
                                          const std::vector<Directories>& installations);

}  // namespace cimdhcp
