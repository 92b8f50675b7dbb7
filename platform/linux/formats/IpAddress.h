#pragma once

#include <array>
#include <compare>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace ZR::Live {

/// An IPv4 or IPv6 address. Never without one: where there may be none, it is optional.
class IpAddress {
  public:
    /// The address that bytes in network order are; nullopt when the family is neither
    /// AF_INET nor AF_INET6, or the length does not fit it.
    [[nodiscard]] static std::optional<IpAddress> fromBytes(
        int family, std::span<const std::byte> bytes) noexcept;

    /// The address that a text is; nullopt when it is not one of the family.
    [[nodiscard]] static std::optional<IpAddress> fromText(int family, std::string_view text);

    /// The IPv4 address that a text is, also with a prefix length behind a "/".
    [[nodiscard]] static std::optional<IpAddress> ipv4FromText(std::string_view text);

    /// AF_INET or AF_INET6.
    [[nodiscard]] int family() const noexcept { return family_; }
    [[nodiscard]] bool isIPv4() const noexcept;

    /// 4 or 16 bytes in network order. Borrows the address.
    [[nodiscard]] std::span<const std::byte> bytes() const noexcept;

    /// Whether all bytes are zero, which stands for no address in many a place.
    [[nodiscard]] bool isUnspecified() const noexcept;

    /// The form of inet_ntop(3), of which each address has exactly one.
    [[nodiscard]] std::string text() const;

    friend bool operator==(const IpAddress&, const IpAddress&) noexcept = default;
    // clang-tidy 14 takes the 0 that a defaulted comparison compares with for a pointer.
    // NOLINTNEXTLINE(modernize-use-nullptr)
    friend std::strong_ordering operator<=>(const IpAddress&, const IpAddress&) noexcept = default;

  private:
    IpAddress(int family, std::span<const std::byte> bytes) noexcept;

    std::uint8_t family_;
    std::array<std::byte, 16> bytes_{};  // beyond the family's length always zero
};

}  // namespace ZR::Live
