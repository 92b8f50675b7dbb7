#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "clients/NetworkManagerLease.h"
#include "facts/ClientFacts.h"
#include "formats/Files.h"
#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"

namespace ZR::Live {

inline constexpr std::string_view networkManagerDevices = "/run/NetworkManager/devices";
inline constexpr std::string_view networkManagerState = "/var/lib/NetworkManager";

/// Where connection profiles lie.
inline constexpr std::array<std::string_view, 3> networkManagerProfiles{
    "/etc/NetworkManager/system-connections", "/run/NetworkManager/system-connections",
    "/usr/lib/NetworkManager/system-connections"};

/// The state file of one device, /run/NetworkManager/devices/IFINDEX.
struct NetworkManagerDevice {
    bool managed = false;
    std::string profile;               ///< UUID of the active connection; empty for none
    NetworkManagerOptions options4{};  ///< of the DHCPv4 lease; empty for none
    NetworkManagerOptions options6{};  ///< of what DHCPv6 gave; empty for nothing

    bool operator==(const NetworkManagerDevice&) const = default;
};
[[nodiscard]] NetworkManagerDevice parseNetworkManagerDevice(std::string_view text);

/// A connection profile: a key file NAME.nmconnection, or what was applied of one.
struct NetworkManagerProfile {
    std::string uuid;  ///< empty when the program derives it from the file's name
    std::optional<InterfaceName> interfaceName;
    std::string method4;  ///< "auto", "manual", "link-local", "shared", ...
    std::string method6;  ///< "auto", "dhcp", ...
    std::vector<IpAddress> addresses4;
    bool external = false;  ///< describes what others have set up

    bool operator==(const NetworkManagerProfile&) const = default;
};
[[nodiscard]] NetworkManagerProfile parseNetworkManagerProfile(std::string_view text);

/// What a profile says of a link's addresses. A method that is not known says nothing.
[[nodiscard]] LinkConfiguration networkManagerConfiguration(const NetworkManagerProfile& profile);

/// The interface in the name internal-UUID-INTERFACE.lease; nullopt for other names.
[[nodiscard]] std::optional<InterfaceName> internalLeaseInterface(std::string_view fileName);

/// Adds leases, managements and profiles, as far as its files tell. Needs the processes to
/// be in the facts: the state files outlive the program.
void readNetworkManager(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
