#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

namespace ZR::Live {

/// The code of an option by the name under which ISC dhclient writes it into its lease
/// files. nullopt for a name that a configuration made up, which does not tell its code.
[[nodiscard]] std::optional<std::uint16_t> dhclientOptionCode(std::string_view name) noexcept;

/// The same for DHCPv6, whose names begin with "dhcp6.".
[[nodiscard]] std::optional<std::uint16_t> dhclientOptionCode6(std::string_view name) noexcept;

}  // namespace ZR::Live
