#pragma once

#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "facts/ClientFacts.h"
#include "formats/Files.h"
#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"

namespace ZR::Live {

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

}  // namespace ZR::Live
