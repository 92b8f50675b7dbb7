#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

namespace ZR::Live {

/// The code of an option of DHCPv4 (RFC 2132), or of DHCPv6 (RFC 8415), by the name that
/// clients hand to their scripts: words with "_" or "-" between. nullopt for what is not an
/// option, or is not known.
[[nodiscard]] std::optional<std::uint16_t> optionCode4(std::string_view name) noexcept;
[[nodiscard]] std::optional<std::uint16_t> optionCode6(std::string_view name) noexcept;

}  // namespace ZR::Live
