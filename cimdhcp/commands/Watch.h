#pragma once

#include "arguments/Commands.h"
#include "text/Presentation.h"

namespace cimdhcp {

class EmbeddedClient;

// Both write each change as a line as soon as it is known, and return when a signal asks for
// the end. They throw Failure.

/// The changes of this machine.
void watchMachine(const WatchCommand& command, EmbeddedClient& client,
                  const Presentation& presentation, const Outputs& outputs);

/// The changes of the machines of the servers that the options name. A failure of the only
/// server at the beginning is thrown; every other one is told, and the server is asked again.
void watchServers(const WatchCommand& command, const Options& options,
                  const Presentation& presentation, const Outputs& outputs);

}  // namespace cimdhcp
