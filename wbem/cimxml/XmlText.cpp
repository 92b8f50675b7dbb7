#include "cimxml/XmlText.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>

#include "cimom/Utf8.h"

namespace cimom::wbem {

namespace {

/// Which bytes cannot be copied as they are.
using Specials = std::array<bool, 256>;

constexpr Specials specialsOf(std::string_view markup) {
    Specials specials{};
    for (std::size_t byte = 0; byte < specials.size(); ++byte) {
        specials.at(byte) = byte < 0x20 || byte >= 0x80;
    }
    for (const char character : markup) {
        specials.at(static_cast<unsigned char>(character)) = true;
    }
    return specials;
}

constexpr Specials makeTextSpecials() {
    Specials specials = specialsOf("&<>");
    specials.at('\n') = false;
    specials.at('\t') = false;
    return specials;
}

constexpr Specials textSpecials = makeTextSpecials();
constexpr Specials attributeSpecials = specialsOf("&<>\"");
constexpr std::string_view replacement = "\xEF\xBF\xBD";

std::string_view referenceTo(char character) noexcept {
    switch (character) {
        case '&':
            return "&amp;";
        case '<':
            return "&lt;";
        case '>':
            return "&gt;";
        case '"':
            return "&quot;";
        case '\r':
            return "&#13;";
        case '\n':
            return "&#10;";
        case '\t':
            return "&#9;";
        default:
            return replacement;
    }
}

/// Whether the next eight bytes have none of the specials: of letters, digits and the like nearly
/// all texts consist. False also for some that have none.
bool areEightPlain(const char* bytes) noexcept {
    constexpr std::uint64_t ones = 0x0101010101010101;
    constexpr std::uint64_t highs = 0x80 * ones;
    std::uint64_t word = 0;
    std::memcpy(&word, bytes, sizeof word);
    // Sets the high bit of each byte that is 0, and perhaps of others behind it.
    const auto zeros = [](std::uint64_t value) { return (value - ones) & ~value; };
    const std::uint64_t below = (word - 0x20 * ones) | word;
    // "<" and ">" differ in one bit, and likewise '"' and "&".
    const std::uint64_t brackets = zeros((word | 0x02 * ones) ^ ('>' * ones));
    const std::uint64_t others = zeros((word | 0x04 * ones) ^ ('&' * ones));
    return ((below | brackets | others) & highs) == 0;
}

void append(std::string& out, std::string_view text, const Specials& specials) {
    std::size_t plain = 0;  // where the part begins that is not copied yet
    std::size_t at = 0;
    while (at < text.size()) {
        while (text.size() - at >= sizeof(std::uint64_t) && areEightPlain(text.data() + at)) {
            at += sizeof(std::uint64_t);
        }
        while (at < text.size() && !specials[static_cast<unsigned char>(text[at])]) {
            ++at;
        }
        if (at == text.size()) {
            break;
        }
        const auto byte = static_cast<unsigned char>(text[at]);
        std::size_t length = 1;
        std::string_view written;
        if (byte < 0x80) {
            written = referenceTo(text[at]);
        } else {
            const Utf8Character character = readUtf8(text, at);
            if (character.length != 0 && character.value != 0xFFFE && character.value != 0xFFFF) {
                at += character.length;
                continue;
            }
            length = character.length == 0 ? 1 : character.length;
            written = replacement;
        }
        out.append(text.substr(plain, at - plain)).append(written);
        at += length;
        plain = at;
    }
    out.append(text.substr(plain));
}

}  // namespace

void appendText(std::string& out, std::string_view text) {
    append(out, text, textSpecials);
}

void appendAttributeText(std::string& out, std::string_view text) {
    append(out, text, attributeSpecials);
}

void appendAttribute(std::string& out, std::string_view name, std::string_view value) {
    out.append(1, ' ').append(name).append("=\"");
    appendAttributeText(out, value);
    out += '"';
}

}  // namespace cimom::wbem
