#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "facts/ClientFacts.h"
#include "formats/Files.h"
#include "formats/IpAddress.h"
#include "formats/ValueFormats.h"

namespace ZR::Live {

/// Where wicked keeps leases; the second while the first cannot be written.
inline constexpr std::array<std::string_view, 2> wickedDirectories{"/var/lib/wicked",
                                                                   "/run/wicked"};
inline constexpr std::string_view wickedLeasePrefix = "lease-";

/// One address of a wicked lease.
struct WickedAddress {
    IpAddress address;
    std::optional<std::int64_t> acquired;      ///< epoch seconds
    std::optional<std::uint32_t> lifetime;     ///< seconds; UINT32_MAX: for ever
    std::optional<std::uint32_t> renewal{};    ///< T1, likewise
    std::optional<std::uint32_t> rebinding{};  ///< T2, likewise

    bool operator==(const WickedAddress&) const = default;
};

/// A lease file of wicked.
struct WickedLease {
    std::uint8_t family = 0;          ///< AF_INET or AF_INET6; 0 for neither
    std::string type;                 ///< "dhcp", "static", "auto", ...
    std::string state;                ///< "granted" while it holds
    std::optional<IpAddress> server;  ///< of DHCPv6 the sender of the messages
    std::vector<WickedAddress> addresses;
    std::string clientIdentifier{};  ///< as it stands there; of DHCPv6 the DUID

    bool operator==(const WickedLease&) const = default;
};
[[nodiscard]] Parsed<WickedLease> parseWickedLease(std::string_view xml);

/// Adds the leases of all known places. Needs the processes to be in the facts.
void readWicked(const Roots& roots, ClientFacts& facts);

}  // namespace ZR::Live
