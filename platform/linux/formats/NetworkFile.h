#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "formats/IpAddress.h"

namespace ZR::Live {

/// The settings of a .network file of systemd-networkd that tell where addresses come from.
struct NetworkFile {
    bool dhcp4 = false;
    bool dhcp6 = false;
    bool linkLocal4 = false;
    std::vector<IpAddress> addresses;  ///< of IPv4
    std::string matchName{};           ///< names of links that it is for, patterns among them

    bool operator==(const NetworkFile&) const = default;
};

/// Applies a file, or a drop-in on top of what went before.
void applyNetworkFile(std::string_view text, NetworkFile& settings);

}  // namespace ZR::Live
