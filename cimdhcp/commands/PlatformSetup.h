#pragma once

#include <iosfwd>
#include <string>

#include "arguments/Commands.h"

namespace cimdhcp {

/// How a command looks at the live machine.
enum class Look : bool {
    once,   ///< all that it asks is about one moment, and nothing is watched
    again,  ///< it sees changes while it runs, its own among them
};

/// Hands --tree and --data-dir to the platform, as environment variables: each
/// provider library has a copy of the platform of its own, which reads them when it
/// is loaded. Call before that, and before the platform's settings are asked for
/// in this process.
///
/// A tree that cannot be read twice, as "-" for standard input, a pipe or a FIFO, is read
/// once and whole into memory, where every copy of the platform finds it.
///
/// Lets the first reading of each copy wait a second for a service processor, unless the
/// environment tells how long, and tells it whether to look again.
///
/// Writes a line to `err` for each setting that cannot be used. Throws Failure
/// when the tree is not a file of a JSON tree or the data directory is not a directory.
void setUpPlatform(const Options& options, Look look, std::ostream& err);

/// Throws Failure when --data-dir names a directory that is not there: what is likely a slip
/// is neither taken for an empty directory nor made.
void requireDataDirectory(const Options& options);

/// What a person knows the tree by that setUpPlatform() handed over; empty: there is none.
[[nodiscard]] const std::string& treeName();

}  // namespace cimdhcp
