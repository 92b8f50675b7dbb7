#pragma once

#include <cstdint>
#include <vector>

#include "client/MachineInterfaces.h"
#include "commands/Findings.h"

namespace cimdhcp {

/// What is wrong, or worth a look, about the DHCP clients of a machine, each with its
/// remedy: clients without a lease, links that are down, leases that have ended, and what
/// the diagnostics tell. Like troubles are one finding. `now` in seconds since the epoch.
[[nodiscard]] std::vector<Finding> machineFindings(const MachineInterfaces& machine,
                                                   std::int64_t now);

}  // namespace cimdhcp
