#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

#include "formats/IpAddress.h"

namespace ZR::Live {

/// A DHCPv4 lease in the form of systemd-networkd's lease files, which older versions of
/// NetworkManager's built-in client write, too.
struct NetworkdLease {
    std::optional<IpAddress> address;
    std::optional<IpAddress> server;
    std::optional<std::uint64_t> lifetime;  ///< seconds; infiniteTime: for ever

    bool operator==(const NetworkdLease&) const = default;
};

/// Any text gives facts: lines that are not understood are skipped. The form changed
/// between the versions 252 and 257, in the times only.
[[nodiscard]] NetworkdLease parseNetworkdLease(std::string_view text);

}  // namespace ZR::Live
