#pragma once

#include <algorithm>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "facts/Client.h"
#include "formats/InterfaceName.h"

namespace ZR::Live {

/// A running DHCP client of this network namespace.
struct ClientProcess {
    Client client{};
    std::vector<InterfaceName> interfaces;  ///< empty: every link that can broadcast
    std::string leaseFile;                  ///< empty: the client's default
    bool ipv6 = false;                      ///< DHCPv6 in place of DHCPv4
    std::int32_t pid = 0;                   ///< process number; 0 before it is known
    std::uint32_t user = 0;                 ///< effective user
    /// Indexes of the links on which a packet socket of it listens; nullopt when that is
    /// not to be known. A link can be renamed under a client, its index stays.
    std::optional<std::vector<std::uint32_t>> heardLinks{};

    /// Whether it was told to serve this interface, or all.
    [[nodiscard]] bool serves(const InterfaceName& interface) const noexcept {
        return interfaces.empty() ||
               std::find(interfaces.begin(), interfaces.end(), interface) != interfaces.end();
    }

    bool operator==(const ClientProcess&) const = default;
};

/// A running program that manages links, of this network namespace or another.
struct ManagerProcess {
    enum class Where : std::uint8_t { Here, Elsewhere, Unknown };

    Client client{};
    Where where = Where::Unknown;
    std::int32_t pid = 0;
    std::uint32_t user = 0;  ///< effective user

    bool operator==(const ManagerProcess&) const = default;
};

}  // namespace ZR::Live
