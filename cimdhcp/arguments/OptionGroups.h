#pragma once

#include <CLI/CLI.hpp>

#include "arguments/CommandLine.h"

namespace cimdhcp {

// Options that hold for many commands. They are read into `options`, which must live
// as long as the parser.

/// Which servers are asked, and how.
void addRemoteOptions(CLI::App& app, Options& options);
/// How answers are shown.
void addOutputOptions(CLI::App& app, Options& options);

/// Throws Failure with ExitStatus::usage when these options do not fit together, or
/// not to the command.
void checkOptionsFor(const CommandLine& line);

}  // namespace cimdhcp
