#pragma once

#include <array>
#include <string>
#include <string_view>
#include <vector>

#include "facts/ClientFacts.h"
#include "formats/Files.h"
#include "formats/IpAddress.h"
#include "zrcommon/InterfaceFile.h"

namespace ZR::Live {

/// Where ifcfg-NAME files lie: with network-scripts or NetworkManager, and with wicked.
inline constexpr std::array<std::string_view, 2> ifcfgDirectories{"/etc/sysconfig/network-scripts",
                                                                  "/etc/sysconfig/network"};
inline constexpr std::string_view ifcfgPrefix = InterfaceFile::prefix;

/// The settings of an ifcfg file that tell where addresses come from.
struct IfcfgFile {
    std::string device;                ///< empty when the file does not name it
    std::string hardware;              ///< the device's address, where it is named by that
    std::string bootProtocol;          ///< in small letters; empty for none
    std::vector<IpAddress> addresses;  ///< of IPv4
    bool dhcp6 = false;                ///< DHCPV6C

    bool operator==(const IfcfgFile&) const = default;
};
[[nodiscard]] IfcfgFile parseIfcfg(std::string_view text);

/// Whether a file of this name counts, and is not what an editor or a package left.
[[nodiscard]] bool isIfcfgName(std::string_view name) noexcept;

/// Adds the configuration of each file.
void readIfcfg(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
