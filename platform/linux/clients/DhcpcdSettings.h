#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"

namespace ZR::Live {

/// What dhcpcd is told about one link, by its file or by its command line: both know the
/// same options.
struct DhcpcdSettings {
    bool ipv4 = true;
    bool ipv6 = true;
    bool dhcp4 = true;
    bool dhcp6 = true;
    bool inform = false;                 ///< asks for all but an address (DHCPINFORM)
    bool isStatic = false;               ///< was told the IPv4 address, and asks for nothing
    std::optional<IpAddress> address{};  ///< the IPv4 address that it was told
    std::vector<std::string> allowed{};  ///< patterns (fnmatch(3)) of links; empty: all
    std::vector<std::string> denied{};   ///< likewise

    /// Takes an option by its long name. One that does not matter here changes nothing.
    void take(std::string_view option, std::string_view value);

    [[nodiscard]] bool asks4() const noexcept { return ipv4 && dhcp4 && !isStatic; }
    [[nodiscard]] bool asks6() const noexcept { return ipv6 && dhcp6; }
    [[nodiscard]] bool admits(const InterfaceName& interface) const;

    bool operator==(const DhcpcdSettings&) const = default;
};

/// Applies a text of the form of dhcpcd.conf(5): the options for all links, and those for
/// one. What it says of wireless networks and of profiles is left out: which of them
/// holds, dhcpcd alone knows.
void applyDhcpcdConf(std::string_view text, const InterfaceName& interface,
                     DhcpcdSettings& settings);

}  // namespace ZR::Live
