#include "text/MofText.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <type_traits>
#include <variant>

#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"
#include "zrcommon/Strings.h"

namespace cimdhcp {

namespace {

/// The escape of a character inside quotation marks; the character itself when it
/// needs none.
std::string escaped(char letter, char quote) {
    switch (letter) {
        case '\b':
            return "\\b";
        case '\t':
            return "\\t";
        case '\n':
            return "\\n";
        case '\f':
            return "\\f";
        case '\r':
            return "\\r";
        case '\\':
            return "\\\\";
        default:
            break;
    }
    if (letter == quote) {
        return {'\\', letter};
    }
    const auto byte = static_cast<std::uint8_t>(letter);
    if (byte >= 0x20 && byte != 0x7F) {
        return {letter};
    }
    // Always four digits: a hexadecimal digit of the text may follow.
    constexpr std::string_view digits = "0123456789ABCDEF";
    return std::string("\\x00") + digits[byte >> 4U] + digits[byte & 0xFU];
}

std::string between(std::string_view text, char quote) {
    std::string result(1, quote);
    for (const char letter : text) {
        result += escaped(letter, quote);
    }
    return result + quote;
}

std::string realText(double number) {
    if (!std::isfinite(number)) {
        return "NULL";  // MOF has no literal for it
    }
    // 24 characters hold the shortest text of any double.
    std::array<char, 32> buffer{};
    auto* const end = std::to_chars(buffer.data(), buffer.data() + buffer.size(), number).ptr;
    std::string text(buffer.data(), end);
    if (text.find('.') == std::string::npos) {
        // A real literal needs a point before its exponent.
        text.insert(std::min(text.find('e'), text.size()), ".0");
    }
    return text;
}

}  // namespace

std::string mofString(std::string_view text) {
    return between(text, '"');
}

std::string mofLiteral(const cimom::Scalar& scalar) {
    return std::visit(
        [](const auto& held) -> std::string {
            using Held = std::decay_t<decltype(held)>;
            if constexpr (std::is_same_v<Held, bool>) {
                return held ? "TRUE" : "FALSE";
            } else if constexpr (std::is_integral_v<Held> && !std::is_same_v<Held, char16_t>) {
                return std::to_string(held);
            } else if constexpr (std::is_same_v<Held, double>) {
                return realText(held);
            } else if constexpr (std::is_same_v<Held, char16_t>) {
                const auto unit = static_cast<wchar_t>(held);
                return between(ZR::make_string({&unit, 1}), '\'');
            } else if constexpr (std::is_same_v<Held, std::string>) {
                return mofString(held);
            } else if constexpr (std::is_same_v<Held, std::shared_ptr<const cimom::ObjectPath>>) {
                return mofString(cimom::toText(*held));
            } else if constexpr (std::is_same_v<Held, std::shared_ptr<const cimom::Instance>>) {
                return mofString(mofDeclaration(*held));
            } else {
                return "NULL";
            }
        },
        scalar);
}

std::string mofInitializer(const cimom::Value& value) {
    if (const cimom::Array* const elements = value.array()) {
        std::string text = "{";
        for (const cimom::Scalar& element : *elements) {
            text += (text.size() > 1 ? ", " : "") + mofLiteral(element);
        }
        return text + '}';
    }
    const cimom::Scalar* const scalar = value.scalar();
    return scalar == nullptr ? "NULL" : mofLiteral(*scalar);
}

std::string mofDeclaration(const cimom::Instance& instance) {
    std::string text = "instance of " + instance.path.className + " {";
    for (const cimom::NamedValue& property : instance.properties) {
        text += ' ' + property.name + " = " + mofInitializer(property.value) + ';';
    }
    return text + " };";
}

}  // namespace cimdhcp
