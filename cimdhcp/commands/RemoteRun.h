#pragma once

#include "arguments/CommandLine.h"
#include "commands/Program.h"
#include "text/Failure.h"
#include "text/Presentation.h"

namespace cimdhcp {

/// Carries out a command on the servers that the options name: on one that --connect
/// names as on this machine, on several as FleetOutput tells. Answers how the program
/// ends; throws Failure for what is no server's fault, or the one server's.
ExitStatus runRemotely(const CommandLine& line, const Presentation& presentation,
                       const Outputs& outputs, const Style& errorStyle);

}  // namespace cimdhcp
