#pragma once

#include <array>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "facts/ClientFacts.h"
#include "formats/Files.h"
#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"
#include "zrcommon/InterfaceFile.h"

namespace ZR::Live {

// What the files of each kind say of the configuration of links.

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

inline constexpr std::string_view ifupdownDirectory = "/etc/network";
inline constexpr std::string_view ifupdownFile = "interfaces";
/// Where the file that systems come with looks for further ones.
inline constexpr std::string_view ifupdownFurtherDirectory = "/etc/network/interfaces.d";
inline constexpr std::string_view ifupdownStateDirectory = "/run/network";
inline constexpr std::string_view ifupdownStateFile = "ifstate";

/// One stanza "iface NAME FAMILY METHOD" of interfaces(5).
struct IfaceStanza {
    std::string name;                  ///< a logical name; most often that of the interface
    std::string family;                ///< "inet", "inet6", ...
    std::string method;                ///< "dhcp", "static", "manual", "bootp", ...
    std::vector<IpAddress> addresses;  ///< of IPv4
    bool dhcp = false;                 ///< the option of inet6 auto: DHCPv6 as well

    bool operator==(const IfaceStanza&) const = default;
};

/// A file of interfaces(5).
struct InterfacesFile {
    std::vector<IfaceStanza> stanzas;
    std::vector<std::string> sources;      ///< patterns of further files
    std::vector<std::string> directories;  ///< of further files

    bool operator==(const InterfacesFile&) const = default;
};
[[nodiscard]] InterfacesFile parseInterfaces(std::string_view text);

/// The lines PHYSICAL=LOGICAL of the interfaces that are up.
[[nodiscard]] std::vector<std::pair<InterfaceName, std::string>> parseIfstate(
    std::string_view text);

/// Adds the configuration of each interface; it is applied where the interface is up. What
/// ifup(8) has started since may have ended: that it is applied does not say that it is so.
void readIfupdown(const Roots& roots, ClientFacts& facts);

/// What a text of the form of /proc/net/pnp says. nullopt when the kernel was told its
/// address, or asked in a way (RARP) that tells nothing here.
[[nodiscard]] std::optional<BootResponse> parseKernelBoot(std::string_view text);

/// Adds what the kernel asked for at its start. It did so for the first network namespace
/// alone, and others have no such file.
void readKernelBoot(const Roots& roots, ClientFacts& facts);

/// Where netplan writes what it makes of its own files for systemd-networkd. Its own
/// files tell less: in them, an interface may stand for any that fits a pattern.
inline constexpr std::string_view netplanDirectory = "/run/systemd/network";

/// Adds the configuration of each link that netplan has made one for. What it makes
/// for NetworkManager is read with that one's profiles.
void readNetplan(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
