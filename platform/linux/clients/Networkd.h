#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "clients/Lease.h"
#include "formats/Roots.h"

namespace ZR::Live {

inline constexpr std::string_view networkdLinksDirectory = "/run/systemd/netif/links";
inline constexpr std::string_view networkdLeasesDirectory = "/run/systemd/netif/leases";

/// Where .network files and their drop-in directories lie; the first that has a
/// drop-in of a name hides those of the same name in the others.
inline constexpr std::array<std::string_view, 4> networkFileDirectories{
    "/etc/systemd/network", "/run/systemd/network", "/usr/local/lib/systemd/network",
    "/usr/lib/systemd/network"};

/// A time without end, in seconds.
inline constexpr std::uint64_t infiniteTime = UINT64_MAX;

/// Seconds of a time span: a plain number, "8min 45s", "infinity". The number
/// 4294967295, which means an infinite lease on the wire, is infinite too.
[[nodiscard]] std::optional<std::uint64_t> parseTimeSpan(std::string_view text);

/// The state file of one link.
struct NetworkdLink {
    std::string adminState;                ///< "configured", "unmanaged", ...
    std::string networkFile;               ///< absolute path; empty when none was matched
    std::optional<std::string> leaseFile;  ///< absolute path, while there is a DHCPv4 lease

    /// Whether networkd configures the link.
    [[nodiscard]] bool managed() const noexcept;

    bool operator==(const NetworkdLink&) const = default;
};
[[nodiscard]] NetworkdLink parseNetworkdLink(std::string_view text);

/// The lease file of one link. Its form changed between versions 252 and 257, in
/// the times only.
struct NetworkdLease {
    std::string address;                     ///< canonical IPv4 text; empty for none
    std::string server;                      ///< canonical IPv4 text; empty for none
    std::optional<std::uint64_t> renewal;    ///< T1, seconds
    std::optional<std::uint64_t> rebinding;  ///< T2, seconds
    std::optional<std::uint64_t> lifetime;   ///< seconds

    bool operator==(const NetworkdLease&) const = default;
};
[[nodiscard]] NetworkdLease parseNetworkdLease(std::string_view text);

/// The settings of a .network file that tell where addresses come from.
struct NetworkFile {
    bool dhcp4 = false;
    bool dhcp6 = false;
    bool linkLocal4 = false;
    std::vector<std::string> addresses;  ///< IPv4, canonical text, without prefix length
    std::string matchName{};             ///< names of links that it is for, patterns among them

    bool operator==(const NetworkFile&) const = default;
};
/// Applies a file, or a drop-in on top of what went before.
void applyNetworkFile(std::string_view text, NetworkFile& settings);

/// Adds leases and managements of all links that networkd knows. Needs the
/// processes to be in the facts.
void readNetworkd(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
