#pragma once

#include <vector>

#include "ExtensionClasses.h"

/// How clients find that the DHCP clients of the machine follow the profile for them
/// (DSP1033): the profile in the interop namespace, and from there the endpoints in theirs.
namespace ZR::DHCPClientExtensions {

inline constexpr const char* profileClass = "QVXZR_RegisteredDHCPClientProfile";

/// The one object, whatever the machine.
[[nodiscard]] std::vector<ExtensionObject> profileObjects(const Snapshot& machine);

/// The profile and each endpoint, each name with its own namespace: of the two that of the
/// request, and of the other one the interop namespace that the object manager has, or
/// that of the endpoints.
[[nodiscard]] std::vector<Link> profileLinks(const Request& request);

}  // namespace ZR::DHCPClientExtensions
