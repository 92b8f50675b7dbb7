#pragma once

#include <array>
#include <string>
#include <string_view>

#include "facts/ClientFacts.h"
#include "formats/Files.h"

namespace ZR::Live {

inline constexpr std::string_view networkdStateDirectory = "/run/systemd/netif";
inline constexpr std::string_view networkdLinksDirectory = "/run/systemd/netif/links";
inline constexpr std::string_view networkdLeasesDirectory = "/run/systemd/netif/leases";

/// Where .network files and their drop-in directories lie; the first that has a
/// drop-in of a name hides those of the same name in the others.
inline constexpr std::array<std::string_view, 4> networkFileDirectories{
    "/etc/systemd/network", "/run/systemd/network", "/usr/local/lib/systemd/network",
    "/usr/lib/systemd/network"};

/// The state file of one link.
struct NetworkdLink {
    std::string adminState;   ///< "configured", "unmanaged", ...
    std::string networkFile;  ///< absolute path; empty when none was matched
    std::string damage{};     ///< what is wrong with the text; empty for nothing

    /// Whether networkd configures the link.
    [[nodiscard]] bool managed() const noexcept;

    bool operator==(const NetworkdLink&) const = default;
};
[[nodiscard]] NetworkdLink parseNetworkdLink(std::string_view text);

/// Adds leases and managements of all links that networkd knows. What a networkd that has
/// ended left of them are configurations. Needs the processes to be in the facts.
void readNetworkd(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
