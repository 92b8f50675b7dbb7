#pragma once

#include <array>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include "facts/ClientFacts.h"
#include "formats/Files.h"

namespace ZR::Live {

/// Where ISC dhclient keeps leases, by who starts it: Debian's own and ifupdown,
/// network scripts, NetworkManager with dhclient as its back end.
struct DhclientDirectory {
    std::string_view path;
    bool isDefault;  ///< a client without -lf keeps dhclient.leases here
};
inline constexpr std::array<DhclientDirectory, 3> dhclientDirectories{{
    {"/var/lib/dhcp", true},
    {"/var/lib/dhclient", true},
    {"/var/lib/NetworkManager", false},
}};
inline constexpr std::string_view dhclientNamePrefix = "dhclient";

/// Where the start of the system from the network (dracut) leaves net.INTERFACE.lease, of
/// a dhclient that has ended since.
inline constexpr std::string_view dracutDirectory = "/run/initramfs";
inline constexpr std::string_view dracutPrefix = "net.";

/// What a command line says, program name included. nullopt for a client that
/// runs only to give leases back or to end another (-r, -x), and for none at all.
[[nodiscard]] std::optional<ClientProcess> parseDhclientArguments(
    std::span<const std::string_view> arguments);

/// Adds the leases of the files of all known places and of the running clients'
/// own files, the newest file first. Needs the processes to be in the facts.
void readDhclient(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
