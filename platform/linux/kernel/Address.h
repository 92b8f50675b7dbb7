#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>

#include "formats/IpAddress.h"

namespace ZR::Live {

/// What the kernel tells about one address of a link.
struct Address {
    /// A lifetime without end.
    static constexpr std::uint32_t infinite = UINT32_MAX;

    std::uint32_t ifindex = 0;
    IpAddress ip;                            ///< the link's own address, never its peer's
    std::uint32_t flags = 0;                 ///< IFA_F_*
    std::uint8_t scope = 0;                  ///< RT_SCOPE_*
    std::uint32_t validLifetime = infinite;  ///< seconds left when it was read

    bool operator==(const Address&) const = default;
};

/// Facts of one RTM_NEWADDR message, header included. Any bytes give facts or
/// nullopt: another or too short a message, an attribute whose length cannot be
/// true, or without an address of IPv4 or IPv6.
[[nodiscard]] std::optional<Address> parseAddress(std::span<const std::byte> message);

}  // namespace ZR::Live
