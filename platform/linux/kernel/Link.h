#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>

#include "formats/InterfaceName.h"

namespace ZR::Live {

/// What the kernel tells about one link.
struct Link {
    std::uint32_t ifindex = 0;
    InterfaceName name;            ///< the kernel's name, never an alternative one
    std::uint32_t flags = 0;       ///< IFF_*
    std::uint8_t operstate = 0;    ///< IF_OPER_*, RFC 2863 states
    std::uint16_t arphrdType = 0;  ///< ARPHRD_*
    std::string kind;              ///< driver kind ("bridge"); empty for most devices
    std::string slaveKind;         ///< kind of the master, as the link's port of it
    std::uint32_t master = 0;      ///< ifindex of the master; 0 for none
    bool hasParentDevice = false;  ///< sits on a bus: a real or paravirtual device
    std::optional<bool> carrier;   ///< nullopt when the kernel does not tell
    bool wireless = false;         ///< not from netlink, which does not know it
    /// Twelve digits, hexadecimal and small; empty for one that is not of six bytes.
    std::string hardwareAddress{};
    /// Where the other end of a virtual cable lies, as this network namespace numbers the
    /// others; nullopt for all else, and for a cable within the namespace.
    std::optional<std::int32_t> farNamespace = std::nullopt;

    bool operator==(const Link&) const = default;
};

/// Facts of one RTM_NEWLINK message, header included. Any bytes give facts or
/// nullopt: another or too short a message, an attribute whose length cannot be
/// true, or no usable name.
[[nodiscard]] std::optional<Link> parseLink(std::span<const std::byte> message);

}  // namespace ZR::Live
