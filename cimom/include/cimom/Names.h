#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace cimom {

/// ASCII lower case, without the locale on which tolower depends.
[[nodiscard]] constexpr char lowered(char letter) noexcept {
    return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
}

[[nodiscard]] constexpr bool isNameStart(char letter) noexcept {
    return (letter >= 'A' && letter <= 'Z') || (letter >= 'a' && letter <= 'z') || letter == '_';
}
[[nodiscard]] constexpr bool isDigit(char letter) noexcept {
    return letter >= '0' && letter <= '9';
}
[[nodiscard]] constexpr bool isNamePart(char letter) noexcept {
    return isNameStart(letter) || isDigit(letter);
}

/// Names compare without regard to case (ASCII).
[[nodiscard]] constexpr bool sameName(std::string_view a, std::string_view b) noexcept {
    return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                      [](char x, char y) { return lowered(x) == lowered(y); });
}

/// FNV-1a over the lower-cased name. With NameEqual it lets hashed containers
/// find names without regard to case and without a copy.
struct NameHash {
    using is_transparent = void;
    std::size_t operator()(std::string_view name) const noexcept {
        std::uint64_t hash = 14695981039346656037U;
        for (const char letter : name) {
            hash ^= static_cast<unsigned char>(lowered(letter));
            hash *= 1099511628211U;
        }
        return static_cast<std::size_t>(hash);
    }
};

struct NameEqual {
    using is_transparent = void;
    bool operator()(std::string_view a, std::string_view b) const noexcept {
        return sameName(a, b);
    }
};

}  // namespace cimom
