#pragma once

#include <iosfwd>

#include "arguments/Commands.h"

namespace cimdhcp {

/// Hands --tree and --data-dir to the platform, as environment variables: each
/// provider library has a copy of the platform of its own, which reads them when it
/// is loaded. Call before that, and before the platform's settings are asked for
/// in this process.
///
/// Writes a line to `err` for each setting that cannot be used. Throws Failure
/// when the tree is not a file of a JSON tree or the data directory is not a directory.
void setUpPlatform(const Options& options, std::ostream& err);

}  // namespace cimdhcp
