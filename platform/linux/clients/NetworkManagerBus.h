#pragma once

#include <string>
#include <string_view>

#include "clients/BusRequest.h"
#include "facts/ClientFacts.h"

namespace ZR::Live {

/// Asks the NetworkManager of this machine for its devices, their leases, and what of its
/// profiles it has applied to them: { "objects": as of org.freedesktop.DBus.ObjectManager,
/// "applied": by the paths of devices }.
[[nodiscard]] BusResponse askNetworkManager(BusRequests::Deadline deadline);

/// Puts in the place of what its state files tell what it says itself. Returns why that
/// cannot be used, empty when it can; then nothing was changed.
[[nodiscard]] std::string_view addNetworkManagerDescription(std::string_view json,
                                                            ClientFacts& facts);

}  // namespace ZR::Live
