#include "cimom/Utf8.h"

namespace cimom {

namespace {

struct Lead {
    std::size_t length;
    char32_t bits;
    char32_t smallest;  ///< below it the sequence is longer than needed
};

Lead leadOf(unsigned char byte) noexcept {
    if (byte < 0x80) {
        return {1, byte, 0};
    }
    if (byte >= 0xC0 && byte < 0xE0) {
        return {2, byte & 0x1FU, 0x80};
    }
    if (byte >= 0xE0 && byte < 0xF0) {
        return {3, byte & 0x0FU, 0x800};
    }
    if (byte >= 0xF0 && byte < 0xF8) {
        return {4, byte & 0x07U, 0x10000};
    }
    return {0, 0, 0};
}

}  // namespace

void appendUtf8(std::string& text, char32_t character) {
    if (isSurrogate(character) || character > 0x10FFFF) {
        character = 0xFFFD;
    }
    const auto continuation = [character](unsigned shift) {
        return static_cast<char>(0x80U | ((character >> shift) & 0x3FU));
    };
    if (character < 0x80) {
        text += static_cast<char>(character);
    } else if (character < 0x800) {
        text += static_cast<char>(0xC0U | (character >> 6U));
        text += continuation(0);
    } else if (character < 0x10000) {
        text += static_cast<char>(0xE0U | (character >> 12U));
        text += continuation(6);
        text += continuation(0);
    } else {
        text += static_cast<char>(0xF0U | (character >> 18U));
        text += continuation(12);
        text += continuation(6);
        text += continuation(0);
    }
}

Utf8Character readUtf8(std::string_view text, std::size_t offset) noexcept {
    const Lead lead = leadOf(static_cast<unsigned char>(text[offset]));
    if (lead.length == 0 || text.size() - offset < lead.length) {
        return {};
    }
    char32_t character = lead.bits;
    for (std::size_t index = 1; index < lead.length; ++index) {
        const auto byte = static_cast<unsigned char>(text[offset + index]);
        if ((byte & 0xC0U) != 0x80U) {
            return {};
        }
        character = (character << 6U) | (byte & 0x3FU);
    }
    if (character < lead.smallest || character > 0x10FFFF || isSurrogate(character)) {
        return {};
    }
    return {lead.length, character};
}

}  // namespace cimom
