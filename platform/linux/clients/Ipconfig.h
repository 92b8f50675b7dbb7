#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

#include "facts/ClientFacts.h"
#include "formats/Files.h"
#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"

namespace ZR::Live {

/// Where ipconfig of klibc, with which an initial RAM file system boots over the
/// network, leaves net-INTERFACE.conf.
inline constexpr std::string_view ipconfigDirectory = "/run";
inline constexpr std::string_view ipconfigPrefix = "net-";

/// The result of one ipconfig.
struct IpconfigResult {
    enum class Protocol : std::uint8_t { Other, Dhcp, Bootp };

    std::optional<InterfaceName> interfaceName;
    Protocol protocol = Protocol::Other;
    std::optional<IpAddress> address;
    std::optional<IpAddress> server;  ///< of the boot files, the best guess at the DHCP server
    std::uint32_t leaseTime = 0;      ///< seconds; 0 and UINT32_MAX: for ever
    /// When the response came, in seconds since the start of the system.
    std::optional<std::uint32_t> uptime{};

    bool operator==(const IpconfigResult&) const = default;
};
[[nodiscard]] IpconfigResult parseIpconfig(std::string_view text);

/// Adds what ipconfig was given. Its files tell times since the start of the system, which
/// do not depend on a clock that was set since.
void readIpconfig(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
