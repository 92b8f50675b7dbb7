#pragma once

#include <string>
#include <string_view>

namespace ZR {

/// Wide text of a UTF-8 text. A byte that is not part of valid UTF-8 becomes the
/// code unit 0xDC00 plus the byte, so that make_string gives back exactly the
/// bytes that came in: file names need not be text.
[[nodiscard]] std::wstring make_wstring(std::string_view text);

/// UTF-8 of a wide text; the inverse of make_wstring. A code unit that is neither
/// a Unicode scalar value nor one of make_wstring's becomes U+FFFD.
[[nodiscard]] std::string make_string(std::wstring_view text);

/// Whether two names are equal but for the case of the letters A to Z, whatever the
/// locale: in a Turkish one, strcasecmp takes "I" and "i" for different letters.
[[nodiscard]] bool equalNames(std::string_view one, std::string_view other) noexcept;

/// The text without blanks, tabs and carriage returns at its ends.
[[nodiscard]] std::string_view trim(std::string_view text) noexcept;

/// Takes the first word off a text, with the blanks before it; empty when there is none.
std::string_view nextWord(std::string_view& text, std::string_view blanks = " \t") noexcept;

}  // namespace ZR
