#include "zrcommon/Strings.h"

#include <algorithm>
#include <bit>
#include <cstdint>

namespace ZR {

namespace {

constexpr std::uint32_t escapeBase = 0xDC00;
constexpr std::uint32_t replacement = 0xFFFD;

/// Length of the valid UTF-8 sequence at the start of `text` and its code point;
/// length 0 when there is none (overlong forms, surrogates, and code points
/// above U+10FFFF count as invalid: RFC 3629).
struct Decoded {
    std::size_t length;
    std::uint32_t codePoint;
};

bool isScalarValue(std::uint32_t codePoint) {
    const bool surrogate = codePoint >= 0xD800 && codePoint <= 0xDFFF;
    return codePoint <= 0x10FFFF && !surrogate;
}

/// What the first byte of a sequence of more than one tells.
struct Lead {
    std::size_t length;      ///< of the sequence; 0 when none begins with the byte
    std::uint32_t bits;      ///< of the code point
    std::uint32_t smallest;  ///< code point that needs that length
};

Lead leadOf(std::uint8_t byte) {
    if ((byte & 0xE0U) == 0xC0) {
        return {2, byte & 0x1FU, 0x80};
    }
    if ((byte & 0xF0U) == 0xE0) {
        return {3, byte & 0x0FU, 0x800};
    }
    if ((byte & 0xF8U) == 0xF0) {
        return {4, byte & 0x07U, 0x10000};
    }
    return {0, 0, 0};
}

Decoded decode(std::string_view text) {
    const auto byte = [&](std::size_t i) { return static_cast<std::uint8_t>(text[i]); };
    if (byte(0) < 0x80) {
        return {1, byte(0)};
    }
    const Lead lead = leadOf(byte(0));
    if (lead.length == 0 || text.size() < lead.length) {
        return {0, 0};
    }
    std::uint32_t codePoint = lead.bits;
    for (std::size_t i = 1; i < lead.length; ++i) {
        if ((byte(i) & 0xC0U) != 0x80) {
            return {0, 0};
        }
        codePoint = (codePoint << 6U) | (byte(i) & 0x3FU);
    }
    if (codePoint < lead.smallest || !isScalarValue(codePoint)) {
        return {0, 0};
    }
    return {lead.length, codePoint};
}

void encode(std::uint32_t codePoint, std::string& out) {
    const auto put = [&](std::uint32_t byte) { out.push_back(static_cast<char>(byte)); };
    if (codePoint < 0x80) {
        put(codePoint);
    } else if (codePoint < 0x800) {
        put(0xC0U | (codePoint >> 6U));
        put(0x80U | (codePoint & 0x3FU));
    } else if (codePoint < 0x10000) {
        put(0xE0U | (codePoint >> 12U));
        put(0x80U | ((codePoint >> 6U) & 0x3FU));
        put(0x80U | (codePoint & 0x3FU));
    } else {
        put(0xF0U | (codePoint >> 18U));
        put(0x80U | ((codePoint >> 12U) & 0x3FU));
        put(0x80U | ((codePoint >> 6U) & 0x3FU));
        put(0x80U | (codePoint & 0x3FU));
    }
}

}  // namespace

std::wstring make_wstring(std::string_view text) {
    std::wstring wide;
    wide.reserve(text.size());
    while (!text.empty()) {
        const Decoded decoded = decode(text);
        if (decoded.length == 0) {
            wide.push_back(
                static_cast<wchar_t>(escapeBase + static_cast<std::uint8_t>(text.front())));
            text.remove_prefix(1);
        } else {
            wide.push_back(static_cast<wchar_t>(decoded.codePoint));
            text.remove_prefix(decoded.length);
        }
    }
    return wide;
}

std::string make_string(std::wstring_view text) {
    std::string narrow;
    narrow.reserve(text.size());
    for (const wchar_t unit : text) {
        const auto codePoint = std::bit_cast<std::uint32_t>(unit);
        if (codePoint >= escapeBase + 0x80 && codePoint <= escapeBase + 0xFF) {
            narrow.push_back(static_cast<char>(codePoint - escapeBase));
        } else {
            encode(isScalarValue(codePoint) ? codePoint : replacement, narrow);
        }
    }
    return narrow;
}

bool equalNames(std::string_view one, std::string_view other) noexcept {
    const auto lower = [](char letter) {
        return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
    };
    return std::equal(one.begin(), one.end(), other.begin(), other.end(),
                      [lower](char a, char b) { return lower(a) == lower(b); });
}

std::string_view trim(std::string_view text) noexcept {
    constexpr std::string_view blanks = " \t\r";
    const std::size_t first = text.find_first_not_of(blanks);
    if (first == std::string_view::npos) {
        return {};
    }
    return text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

std::string_view nextWord(std::string_view& text, std::string_view blanks) noexcept {
    text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
    const std::string_view word = text.substr(0, text.find_first_of(blanks));
    text.remove_prefix(word.size());
    return word;
}

}  // namespace ZR
