#pragma once

#include <string>
#include <vector>

#include "ExtensionObjects.h"
#include "zrclient/Snapshot.h"

/// What a snapshot of the machine has, as objects. All in the order of its tree.
namespace ZR::DHCPClientExtensions {

[[nodiscard]] std::vector<ExtensionObject> leaseObjects(const Snapshot& snapshot);
[[nodiscard]] std::vector<ExtensionObject> interfaceObjects(const Snapshot& snapshot);
[[nodiscard]] std::vector<ExtensionObject> diagnosticObjects(const Snapshot& snapshot);

/// The names of the DHCP endpoints, as the provider of these gives them: one for each
/// interface that uses DHCP. Without a name of the machine they lack SystemName.
[[nodiscard]] std::vector<ObjectName> endpointNames(const Snapshot& snapshot);

/// A lease and the endpoint of its interface.
struct LeaseAndEndpoint {
    ObjectName endpoint;
    ObjectName lease;
};

/// Those of interfaces that have an endpoint.
[[nodiscard]] std::vector<LeaseAndEndpoint> leasesOfEndpoints(const Snapshot& snapshot);

/// The CIM text of a moment in seconds since the epoch, in UTC; of one that lies beyond
/// what can be written the last one that can.
[[nodiscard]] std::string dateTimeText(std::uint64_t seconds);

}  // namespace ZR::DHCPClientExtensions
