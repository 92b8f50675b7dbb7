#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <variant>
#include <vector>

#include "formats/IpAddress.h"

namespace ZR::Live {

/// One command to a service processor (IPMI 2.0, chapter 5).
struct IpmiRequest {
    std::uint8_t netFn = 0;  ///< even; that of the response is one more
    std::uint8_t command = 0;
    std::vector<std::uint8_t> data;

    bool operator==(const IpmiRequest&) const = default;
};

/// What came back. The data begins with the completion code.
struct IpmiResponse {
    std::uint8_t netFn = 0;
    std::uint8_t command = 0;
    std::vector<std::uint8_t> data;

    bool operator==(const IpmiResponse&) const = default;
};

/// Why a response gives no facts.
struct IpmiRefusal {
    std::optional<std::uint8_t> code;  ///< completion code; nullopt where the response is malformed
    std::string reason;

    /// Whether the same request may succeed at another time: the
    /// processor is busy or in its start or update, or the way to it failed
    /// (IPMI 2.0, table 5-2).
    [[nodiscard]] bool passing() const noexcept;

    /// Completion code 0x80 of Get LAN Configuration Parameters: the processor does
    /// not have the parameter.
    [[nodiscard]] bool unsupported() const noexcept { return code == 0x80; }

    bool operator==(const IpmiRefusal&) const = default;
};

/// Facts, or why there are none.
template <typename Facts>
using IpmiDecoded = std::variant<Facts, IpmiRefusal>;

/// One channel of a service processor (IPMI 2.0, 22.24).
struct ChannelInfo {
    std::uint8_t channel = 0;
    std::uint8_t medium = 0;  ///< channel medium type number (IPMI 2.0, table 6-3)

    [[nodiscard]] bool isLan() const noexcept { return medium == 4; }  // 802.3 LAN

    bool operator==(const ChannelInfo&) const = default;
};

[[nodiscard]] IpmiRequest getChannelInfo(std::uint8_t channel);
[[nodiscard]] IpmiRequest getLanAddress(std::uint8_t channel);
[[nodiscard]] IpmiRequest getLanAddressSource(std::uint8_t channel);

// Any bytes give facts or a reason. What follows the expected bytes does not count:
// later versions of the commands append to them.

[[nodiscard]] IpmiDecoded<ChannelInfo> decodeChannelInfo(const IpmiResponse& response);

/// Parameter 3 of Get LAN Configuration Parameters; nullopt for 0.0.0.0, which means that
/// the channel has no address.
[[nodiscard]] IpmiDecoded<std::optional<IpAddress>> decodeLanAddress(const IpmiResponse& response);

/// Parameter 4 of Get LAN Configuration Parameters: 0 unspecified, 1 static, 2 DHCP,
/// 3 loaded by BIOS or system software, 4 another protocol; above 4 reserved.
[[nodiscard]] IpmiDecoded<std::uint8_t> decodeLanAddressSource(const IpmiResponse& response);

}  // namespace ZR::Live
