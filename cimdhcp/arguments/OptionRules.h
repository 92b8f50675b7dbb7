#pragma once

#include "arguments/Commands.h"

namespace cimdhcp {

/// Whether the command sends requests to an object manager, and so can be about another
/// machine.
[[nodiscard]] bool asksClient(const Command& command) noexcept;

/// Brings what was read into the form that commands expect: a namespace without slashes
/// around it. Throws Failure with ExitStatus::usage when options do not fit together, or
/// not to the command.
void completeCommandLine(CommandLine& line);

}  // namespace cimdhcp
