#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace cimom {

[[nodiscard]] constexpr bool isSurrogate(char32_t character) noexcept {
    return character >= 0xD800 && character <= 0xDFFF;
}

/// Appends a character in UTF-8. What is not a Unicode scalar value (a lone
/// surrogate, say) becomes U+FFFD, so that the text stays valid.
void appendUtf8(std::string& text, char32_t character);

struct Utf8Character {
    std::size_t length = 0;  ///< in bytes; 0: no valid sequence
    char32_t value = 0;
};

/// The character that starts at `offset`, which must be below the size.
[[nodiscard]] Utf8Character readUtf8(std::string_view text, std::size_t offset) noexcept;

}  // namespace cimom
