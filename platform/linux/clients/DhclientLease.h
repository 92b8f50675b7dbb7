#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"

namespace ZR::Live {

/// One address of a lease block.
struct DhclientAddress {
    IpAddress address;
    // Times in epoch seconds, or Lease::never.
    std::int64_t expires = 0;
    std::optional<std::int64_t> obtained{};
    std::optional<std::int64_t> renews{};
    std::optional<std::int64_t> rebinds{};

    bool operator==(const DhclientAddress&) const = default;
};

/// One block "lease { }" or "lease6 { }" of ISC dhclient.
struct DhclientLease {
    bool ipv6 = false;
    InterfaceName interfaceName;
    std::vector<DhclientAddress> addresses;
    std::optional<IpAddress> server;  ///< DHCP option 54; DHCPv6 names servers by DUID only
    bool bootp = false;
    bool released = false;
    std::vector<std::uint16_t> options{};  ///< codes of those that came, each once
    std::string clientIdentifier{};        ///< a text, or bytes as in 1:0:1f

    bool operator==(const DhclientLease&) const = default;
};

/// What is wrong in a lease file.
struct DhclientDamage {
    std::size_t line = 0;  ///< the first is 1
    std::string what;      ///< "the lease has no end"

    bool operator==(const DhclientDamage&) const = default;
};

/// What a lease file says.
struct DhclientLeases {
    /// Of each interface and protocol the last block, which is the newest, in the order in
    /// which the interfaces first appear.
    std::vector<DhclientLease> leases;
    /// In the order of the file; of a file that is damaged all over, the first ones. A damaged
    /// block is left out, so that an older one of its interface counts.
    std::vector<DhclientDamage> damage;
    /// The file ends within a block or statement, as one does that is being written. The last
    /// damage is that.
    bool cutOff = false;
};

/// Any text gives facts: statements that are not known are skipped.
[[nodiscard]] DhclientLeases parseDhclientLeases(std::string_view text);

/// The code of an option by the name under which ISC dhclient writes it into its lease
/// files. nullopt for a name that a configuration made up, which does not tell its code.
[[nodiscard]] std::optional<std::uint16_t> dhclientOptionCode(std::string_view name) noexcept;

/// The same for DHCPv6, whose names begin with "dhcp6.".
[[nodiscard]] std::optional<std::uint16_t> dhclientOptionCode6(std::string_view name) noexcept;

}  // namespace ZR::Live
