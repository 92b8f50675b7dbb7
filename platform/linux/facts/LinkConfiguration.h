#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "facts/Client.h"
#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"

namespace ZR::Live {

/// What a program that manages a link, or a configuration file for such a program,
/// says about how the link gets its addresses. It names the link by index, by name or by
/// hardware address.
struct LinkConfiguration {
    Client client{};
    std::uint32_t ifindex = 0;                     ///< 0 when it names the link otherwise
    std::optional<InterfaceName> interfaceName{};  ///< nullopt when it names the link otherwise
    /// As Link::hardwareAddress; empty when it names the link otherwise. Such a one tells what
    /// becomes of the link with its next cable, and counts while it has none.
    std::string hardwareAddress{};
    NamePatterns names{};       ///< of which the link's is to be one
    std::optional<bool> dhcp4;  ///< nullopt when it does not tell, or cannot be read
    std::optional<bool> dhcp6;
    std::vector<IpAddress> staticAddresses;  ///< of IPv4
    bool linkLocal4 = false;                 ///< takes an address of 169.254/16 (RFC 3927)
    bool bootp4 = false;                     ///< asks by BOOTP (RFC 951), without DHCP
    bool other4 = false;                     ///< by another protocol, or shares the link
    bool applied = false;                    ///< it was brought up so, and not down since
    std::string origin{};                    ///< the file that says so

    bool operator==(const LinkConfiguration&) const = default;
};

}  // namespace ZR::Live
