#pragma once

#include <array>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

#include "facts/ClientFacts.h"
#include "formats/Files.h"
#include "formats/InterfaceName.h"

namespace ZR::Live {

/// Where dhcpcd keeps the packets of its leases, by version and who packed it.
struct DhcpcdDirectory {
    std::string_view path;
    std::string_view namePrefix;  ///< before the interface in a file's name
};
inline constexpr std::array<DhcpcdDirectory, 3> dhcpcdDirectories{{
    {"/var/lib/dhcpcd", ""},
    {"/var/lib/dhcpcd5", "dhcpcd-"},
    {"/var/db/dhcpcd", ""},
}};

inline constexpr std::string_view dhcpcdConfigurationDirectory = "/etc";
inline constexpr std::string_view dhcpcdConfigurationFile = "dhcpcd.conf";

/// What a command line says, program name included. A running dhcpcd writes what it
/// does in its place, "dhcpcd: eth1 [ip4] [ip6]", which is understood too. nullopt for
/// its helpers, for one that runs only to speak to another, and for none at all.
[[nodiscard]] std::optional<ClientProcess> parseDhcpcdArguments(
    std::span<const std::string_view> arguments);

/// The interfaces that the stem of a lease file's name may mean, the longest first: of
/// a wireless link the network's name stands behind it, and both may have a "-".
[[nodiscard]] std::vector<InterfaceName> dhcpcdInterfaces(std::string_view stem);

/// Adds the leases of all known places, and puts in the place of the processes of dhcpcd
/// that are in the facts what they really do: one for each protocol, with the links on
/// which it asks or has leases. Its file, its command line, and the titles of its helpers
/// tell that a link is left alone, or has an address that dhcpcd was told. Each dhcpcd that
/// runs is a manager in the facts besides.
void readDhcpcd(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
