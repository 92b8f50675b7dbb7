#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>

#include "facts/Lease.h"

namespace ZR::Live {

/// The options of a lease as NetworkManager writes them to its files and its bus: all are
/// texts, by the names that DHCP clients hand to their scripts. Which there are depends on
/// the client that it uses.
using NetworkManagerOptions = std::map<std::string, std::string, std::less<>>;

/// The lease that they are, of no interface yet; nullopt without an address, as while
/// NetworkManager asks for one.
[[nodiscard]] std::optional<Lease> networkManagerLease4(const NetworkManagerOptions& options);
[[nodiscard]] std::optional<Lease> networkManagerLease6(const NetworkManagerOptions& options);

}  // namespace ZR::Live
