#pragma once

#include <cstddef>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace ZR::Live {

/// The text form of an address of AF_INET or AF_INET6 in network order; nullopt
/// when the family is another or the length does not fit it.
[[nodiscard]] std::optional<std::string> addressText(int family, std::span<const std::byte> bytes);

/// The one form in which addresses are compared: what the kernel's bytes would
/// print as. nullopt when the text is no address of the family.
[[nodiscard]] std::optional<std::string> canonicalAddress(int family, std::string_view text);

/// The same of an IPv4 address, also with a prefix length behind a "/"; empty when the
/// text is none.
[[nodiscard]] std::string canonicalIPv4(std::string_view text);

}  // namespace ZR::Live
