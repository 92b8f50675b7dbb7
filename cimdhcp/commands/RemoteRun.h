#pragma once

#include "arguments/Commands.h"
#include "commands/Outputs.h"
#include "text/Failure.h"
#include "text/Presentation.h"

namespace cimdhcp {

/// Carries out a command on the servers that the options name: on one that --connect
/// names with the output of this machine, on several with that of FleetOutput. Returns how
/// the program ends. Throws Failure for a fault of the only server, and for what is not
/// the fault of a server.
ExitStatus runRemotely(const CommandLine& line, const Presentation& presentation,
                       const Outputs& outputs, const Style& errorStyle);

}  // namespace cimdhcp
