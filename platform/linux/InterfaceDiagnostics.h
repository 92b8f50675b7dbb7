#pragma once

#include <vector>

#include "Decide.h"
#include "Machine.h"
#include "zrclient/Diagnostic.h"

namespace ZR::Live {

/// Adds what is not as it looks on one interface: a configuration that nothing executes, a
/// lease that has ended, one whose client is gone, a client on a port of a bridge, an address
/// of which it is not known whether DHCP gave it, a manager that does not respond. Where clients
/// may be hidden from this user, nothing is said of clients that do not run.
void addDiagnostics(const Machine& machine, const InterfaceView& view,
                    const std::vector<Decision>& decisions, std::vector<Diagnostic>& diagnostics);

}  // namespace ZR::Live
