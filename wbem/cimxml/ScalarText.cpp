#include "cimxml/XmlText.h"

#include <array>
#include <charconv>
#include <cmath>
#include <limits>
#include <system_error>
#include <type_traits>

#include "cimom/DateTimeText.h"
#include "cimom/Names.h"
#include "cimom/Utf8.h"

namespace cimom::wbem {

namespace {

/// Longer than any number's text.
using NumberBuffer = std::array<char, 40>;

template <typename Integer>
void appendInteger(std::string& out, Integer number) {
    NumberBuffer buffer{};
    const auto end = std::to_chars(buffer.data(), buffer.data() + buffer.size(), number).ptr;
    out.append(buffer.data(), end);
}

template <typename Real>
void appendReal(std::string& out, Real number) {
    if (std::isnan(number)) {
        out += "NaN";
        return;
    }
    if (std::isinf(number)) {
        out += number > 0 ? "INF" : "-INF";
        return;
    }
    NumberBuffer buffer{};
    const auto end = std::to_chars(buffer.data(), buffer.data() + buffer.size(), number,
                                   std::chars_format::scientific)
                         .ptr;
    const std::string_view digits(buffer.data(), static_cast<std::size_t>(end - buffer.data()));
    // DSP0201 wants a point in every real; "5e-01" has none.
    const std::size_t exponent = digits.find('e');
    out += digits.substr(0, exponent);
    if (digits.find('.') == std::string_view::npos) {
        out += ".0";
    }
    out += digits.substr(exponent);
}

template <typename Integer>
std::optional<Integer> readInteger(std::string_view text) {
    int base = 10;
    if constexpr (std::is_signed_v<Integer>) {
        if (text.starts_with('+') && text.size() > 1 && isDigit(text[1])) {
            text.remove_prefix(1);
        }
    }
    if (text.starts_with("0x") || text.starts_with("0X")) {
        text.remove_prefix(2);
        base = 16;
        if (text.starts_with('-')) {
            return std::nullopt;
        }
    }
    Integer number{};
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number, base);
    if (error != std::errc() || stop != end) {
        return std::nullopt;
    }
    return number;
}

template <typename Target, typename Widest>
std::optional<Scalar> integerIn(std::string_view text) {
    const auto number = readInteger<Target>(text);
    return number ? std::optional<Scalar>(static_cast<Widest>(*number)) : std::nullopt;
}

std::optional<double> readReal(std::string_view text) {
    if (sameName(text, "NaN")) {
        return std::numeric_limits<double>::quiet_NaN();
    }
    if (sameName(text, "INF") || sameName(text, "+INF")) {
        return std::numeric_limits<double>::infinity();
    }
    if (sameName(text, "-INF")) {
        return -std::numeric_limits<double>::infinity();
    }
    const std::size_t sign = text.starts_with('-') || text.starts_with('+') ? 1 : 0;
    // from_chars would take "inf" and its like, too.
    if (text.size() <= sign || (!isDigit(text[sign]) && text[sign] != '.')) {
        return std::nullopt;
    }
    // from_chars knows no plus sign.
    text.remove_prefix(text.starts_with('+') ? 1 : 0);
    double number = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    if (error != std::errc() || stop != end) {
        return std::nullopt;
    }
    return number;
}

std::optional<Scalar> readCharacter(std::string_view text) {
    if (text.empty()) {
        return std::nullopt;
    }
    const Utf8Character character = readUtf8(text, 0);
    // A char16 is one code unit of UTF-16.
    if (character.length != text.size() || character.value > 0xFFFF) {
        return std::nullopt;
    }
    return Scalar(static_cast<char16_t>(character.value));
}

std::optional<Scalar> readBoolean(std::string_view text) {
    if (sameName(text, "TRUE")) {
        return Scalar(true);
    }
    return sameName(text, "FALSE") ? std::optional(Scalar(false)) : std::nullopt;
}

template <typename Held>
std::optional<Scalar> asScalar(const std::optional<Held>& held) {
    return held ? std::optional<Scalar>(*held) : std::nullopt;
}

}  // namespace

void appendScalarText(std::string& out, Type type, const Scalar& scalar) {
    std::visit(
        [&](const auto& held) {
            using Held = std::decay_t<decltype(held)>;
            if constexpr (std::is_same_v<Held, bool>) {
                out += held ? "TRUE" : "FALSE";
            } else if constexpr (std::is_same_v<Held, std::string>) {
                appendText(out, held);
            } else if constexpr (std::is_same_v<Held, char16_t>) {
                std::string character;
                appendUtf8(character, held);
                appendText(out, character);
            } else if constexpr (std::is_same_v<Held, double>) {
                if (type == Type::real32) {
                    appendReal(out, static_cast<float>(held));
                } else {
                    appendReal(out, held);
                }
            } else if constexpr (std::is_integral_v<Held>) {
                appendInteger(out, held);
            }
        },
        scalar);
}

std::optional<Scalar> readScalarText(Type type, std::string_view text) {
    switch (type) {
        case Type::boolean:
            return readBoolean(text);
        case Type::char16:
            return readCharacter(text);
        case Type::uint8:
            return integerIn<std::uint8_t, std::uint64_t>(text);
        case Type::uint16:
            return integerIn<std::uint16_t, std::uint64_t>(text);
        case Type::uint32:
            return integerIn<std::uint32_t, std::uint64_t>(text);
        case Type::uint64:
            return integerIn<std::uint64_t, std::uint64_t>(text);
        case Type::sint8:
            return integerIn<std::int8_t, std::int64_t>(text);
        case Type::sint16:
            return integerIn<std::int16_t, std::int64_t>(text);
        case Type::sint32:
            return integerIn<std::int32_t, std::int64_t>(text);
        case Type::sint64:
            return integerIn<std::int64_t, std::int64_t>(text);
        case Type::real32: {
            // What a float cannot hold would become infinite.
            auto number = readReal(text);
            if (number && std::isfinite(*number)) {
                const auto narrow = static_cast<float>(*number);
                number = std::isfinite(narrow) ? std::optional<double>(narrow) : std::nullopt;
            }
            return asScalar(number);
        }
        case Type::real64:
            return asScalar(readReal(text));
        case Type::string:
            return Scalar(std::string(text));
        case Type::datetime:
            return parseDateTime(text) ? std::optional(Scalar(std::string(text))) : std::nullopt;
        case Type::reference:
        case Type::instance:
            break;
    }
    return std::nullopt;
}

std::optional<Value> readNumberText(std::string_view text) {
    for (const Type type : {Type::uint64, Type::sint64, Type::real64}) {
        if (auto scalar = readScalarText(type, text)) {
            return Value{type, false, *std::move(scalar)};
        }
    }
    return std::nullopt;
}

}  // namespace cimom::wbem
