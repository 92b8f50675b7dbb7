#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "clients/DhcpcdSettings.h"
#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"

namespace ZR::Live {

/// What one of dhcpcd's processes says that it does. It runs as several, each with a right
/// or a socket that the others do not have.
struct DhcpcdTitle {
    enum class Role : std::uint8_t {
        Main,     ///< decides; since version 9 without any rights
        Proxy,    ///< has the rights of root, and does what the main one asks for
        Asking,   ///< hears the responses of DHCPv4 servers on a link
        Defends,  ///< watches over an IPv4 address of a link (RFC 5227)
        Listens,  ///< has the DHCP client's port at an address
        Other,
    };

    Role role = Role::Other;
    std::optional<InterfaceName> interface {};  ///< nullopt for all links
    std::optional<IpAddress> address{};         ///< of IPv4, that it defends or listens at
    bool ipv4 = false;                          ///< of the main one
    bool ipv6 = false;                          ///< likewise

    bool operator==(const DhcpcdTitle&) const = default;
};

/// A text as in "dhcpcd: eth1 [ip4] [ip6]"; nullopt when it is not such a title.
[[nodiscard]] std::optional<DhcpcdTitle> parseDhcpcdTitle(std::string_view text);

/// A command line that was not yet written over with a title.
struct DhcpcdCommand {
    std::vector<InterfaceName> interfaces;  ///< empty: all
    DhcpcdSettings settings;
    std::string configuration;  ///< the file with its settings; empty: the usual one

    bool operator==(const DhcpcdCommand&) const = default;
};

/// nullopt for a process that runs only to speak to another one, or to try something.
[[nodiscard]] std::optional<DhcpcdCommand> parseDhcpcdCommand(
    std::span<const std::string_view> arguments);

}  // namespace ZR::Live
