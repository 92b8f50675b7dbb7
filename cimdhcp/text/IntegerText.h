#pragma once

#include <compare>
#include <cstdint>
#include <optional>
#include <string_view>

namespace cimdhcp {

/// An integer of either of CIM's 64-bit ranges. Zero is not negative.
struct Integer {
    bool negative = false;
    std::uint64_t magnitude = 0;

    static constexpr Integer of(std::int64_t number) noexcept {
        const auto bits = static_cast<std::uint64_t>(number);
        return number < 0 ? Integer{true, 0 - bits} : Integer{false, bits};
    }

    constexpr bool operator==(const Integer&) const = default;
    constexpr std::strong_ordering operator<=>(const Integer& other) const noexcept {
        if (negative != other.negative) {
            return negative ? std::strong_ordering::less : std::strong_ordering::greater;
        }
        return negative ? other.magnitude <=> magnitude : magnitude <=> other.magnitude;
    }
};

/// Reads an integer as MOF writes it (DSP0004, annex A): decimal "-5", hexadecimal
/// "0x1F", octal "017", binary "101b". None when it is something else or does not
/// fit into 64 bits.
[[nodiscard]] std::optional<Integer> readInteger(std::string_view text) noexcept;

}  // namespace cimdhcp
