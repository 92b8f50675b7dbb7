#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "formats/IpAddress.h"

namespace ZR::Live {

/// A DHCPv4 lease in the form of systemd-networkd's lease files, which older versions of
/// NetworkManager's built-in client write, too.
struct NetworkdLease {
    std::optional<IpAddress> address;
    std::optional<IpAddress> server;
    std::optional<std::uint64_t> lifetime;  ///< seconds; infiniteTime: for ever
    std::vector<std::uint16_t> options{};   ///< codes that the server must have sent
    std::string clientIdentifier{};         ///< as it stands there
    std::string damage{};                   ///< the first line that is wrong, and why; empty: none

    bool operator==(const NetworkdLease&) const = default;
};

/// Any text gives facts: lines that are not of the form are skipped, and the first is told. The
/// form changed between the versions 252 and 257, in the times only.
[[nodiscard]] NetworkdLease parseNetworkdLease(std::string_view text);

}  // namespace ZR::Live
