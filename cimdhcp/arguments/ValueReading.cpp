#include "arguments/ArgumentValue.h"

#include <array>
#include <charconv>
#include <cstdint>
#include <limits>
#include <memory>
#include <optional>
#include <string>
#include <system_error>

#include "cimom/ClassDeclaration.h"
#include "cimom/Names.h"
#include "cimom/ObjectPathText.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/IntegerText.h"
#include "zrcommon/Strings.h"

namespace cimdhcp {

namespace {

using cimom::Scalar;
using cimom::Type;

struct IntegerRange {
    Type type;
    std::int64_t lowest;
    std::uint64_t highest;
};

template <typename Number>
constexpr IntegerRange rangeOf(Type type) {
    return {type, static_cast<std::int64_t>(std::numeric_limits<Number>::min()),
            static_cast<std::uint64_t>(std::numeric_limits<Number>::max())};
}

constexpr std::array integerRanges{
    rangeOf<std::uint8_t>(Type::uint8),   rangeOf<std::uint16_t>(Type::uint16),
    rangeOf<std::uint32_t>(Type::uint32), rangeOf<std::uint64_t>(Type::uint64),
    rangeOf<std::int8_t>(Type::sint8),    rangeOf<std::int16_t>(Type::sint16),
    rangeOf<std::int32_t>(Type::sint32),  rangeOf<std::int64_t>(Type::sint64),
};

const IntegerRange* integerRange(Type type) {
    for (const IntegerRange& range : integerRanges) {
        if (range.type == type) {
            return &range;
        }
    }
    return nullptr;
}

std::optional<Scalar> integer(const IntegerRange& range, std::string_view text) {
    const auto number = readInteger(text);
    if (!number || *number < Integer::of(range.lowest) || Integer{false, range.highest} < *number) {
        return std::nullopt;
    }
    if (range.lowest == 0) {
        return Scalar(number->magnitude);
    }
    return Scalar(
        static_cast<std::int64_t>(number->negative ? 0 - number->magnitude : number->magnitude));
}

std::optional<Scalar> real(std::string_view text) {
    double number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (text.empty() || error != std::errc() || end != text.data() + text.size()) {
        return std::nullopt;
    }
    return Scalar(number);
}

/// A timestamp "yyyymmddhhmmss.mmmmmmsutc" or an interval "ddddddddhhmmss.mmmmmm:000";
/// asterisks stand for digits that are not known (DSP0004, 5.2.4). The object
/// manager looks at the numbers themselves.
bool isDateTime(std::string_view text) {
    constexpr std::string_view form = "00000000000000.000000+000";
    if (text.size() != form.size()) {
        return false;
    }
    for (std::size_t i = 0; i < form.size(); ++i) {
        const char letter = text[i];
        const bool digit = letter >= '0' && letter <= '9';
        const bool right = form[i] == '0'   ? digit || letter == '*'
                           : form[i] == '.' ? letter == '.'
                                            : letter == '+' || letter == '-' || letter == ':';
        if (!right) {
            return false;
        }
    }
    return true;
}

std::optional<Scalar> character(std::string_view text) {
    const std::wstring wide = ZR::make_wstring(text);
    if (wide.size() != 1 || static_cast<std::uint32_t>(wide.front()) > 0xFFFF) {
        return std::nullopt;
    }
    return Scalar(static_cast<char16_t>(wide.front()));
}

std::optional<Scalar> path(std::string_view text) {
    try {
        return Scalar(std::make_shared<const cimom::ObjectPath>(cimom::parseObjectPath(text)));
    } catch (const cimom::ObjectPathError&) {
        return std::nullopt;
    }
}

std::optional<Scalar> scalar(Type type, std::string_view text) {
    if (const IntegerRange* const range = integerRange(type)) {
        return integer(*range, text);
    }
    switch (type) {
        case Type::boolean:
            if (cimom::sameName(text, "TRUE") || cimom::sameName(text, "FALSE")) {
                return Scalar(cimom::sameName(text, "TRUE"));
            }
            return std::nullopt;
        case Type::real32:
        case Type::real64:
            return real(text);
        case Type::char16:
            return character(text);
        case Type::string:
            return Scalar(std::string(text));
        case Type::datetime:
            return isDateTime(text) ? std::optional(Scalar(std::string(text))) : std::nullopt;
        case Type::reference:
            return path(text);
        default:
            return std::nullopt;  // embedded instances have no text form here
    }
}

std::string wanted(const cimom::PropertyDeclaration& property) {
    std::string one;
    if (const IntegerRange* const range = integerRange(property.type)) {
        one = "a number from " + std::to_string(range->lowest) + " to " +
              std::to_string(range->highest);
    } else if (property.type == Type::boolean) {
        one = "TRUE or FALSE";
    } else if (property.type == Type::real32 || property.type == Type::real64) {
        one = "a number";
    } else if (property.type == Type::char16) {
        one = "one character";
    } else if (property.type == Type::datetime) {
        one = "a datetime like 20261120081530.000000+000";
    } else if (property.type == Type::reference) {
        one = "an object path";
    } else if (property.type == Type::string) {
        one = "a text";
    } else {
        return "a value that cannot be typed here";
    }
    return property.isArray ? "a list {value, value...}, each " + one +
                                  (property.type == Type::string ? " in double quotes" : "")
                            : one;
}

[[noreturn]] void refuse(const cimom::PropertyDeclaration& property, std::string_view text) {
    throw Failure(ExitStatus::usage, property.name + " cannot be \"" + printable(text) +
                                         "\": it takes " + wanted(property));
}

/// Reads the elements between the braces.
class ElementReader {
  public:
    explicit ElementReader(std::string_view text) : rest_(text) {}

    /// The next element; none when it is malformed. `quoted` tells whether it
    /// stood in double quotes.
    std::optional<std::string> next(bool& quoted) {
        rest_ = ZR::trim(rest_);
        quoted = rest_.starts_with('"');
        if (quoted) {
            return quotedText();
        }
        const std::size_t end = rest_.find(',');
        std::string word(ZR::trim(rest_.substr(0, end)));
        rest_.remove_prefix(end == std::string_view::npos ? rest_.size() : end);
        return word.empty() ? std::nullopt : std::optional(std::move(word));
    }

    /// Passes over the comma before a further element. False when there is none.
    bool separator() {
        rest_ = ZR::trim(rest_);
        const bool there = rest_.starts_with(',');
        rest_.remove_prefix(there ? 1 : 0);
        return there;
    }

    [[nodiscard]] bool atEnd() const { return ZR::trim(rest_).empty(); }

  private:
    std::optional<std::string> quotedText() {
        std::string text;
        for (std::size_t i = 1; i < rest_.size(); ++i) {
            if (rest_[i] == '"') {
                rest_.remove_prefix(i + 1);
                return text;
            }
            const bool escape = rest_[i] == '\\' && i + 1 < rest_.size();
            i += escape ? 1 : 0;
            text += rest_[i];
        }
        return std::nullopt;  // no closing quotation mark
    }

    std::string_view rest_;
};

std::optional<cimom::Array> elements(const cimom::PropertyDeclaration& property,
                                     std::string_view text) {
    if (text.size() < 2 || !text.starts_with('{') || !text.ends_with('}')) {
        return std::nullopt;
    }
    ElementReader reader(text.substr(1, text.size() - 2));
    cimom::Array array;
    if (reader.atEnd()) {
        return array;
    }
    do {
        bool quoted = false;
        const auto word = reader.next(quoted);
        if (!word) {
            return std::nullopt;
        }
        if (!quoted && cimom::sameName(*word, "NULL")) {
            array.emplace_back();
            continue;
        }
        auto element = scalar(property.type, *word);
        if (!element || (property.type == Type::string && !quoted)) {
            return std::nullopt;
        }
        array.push_back(*std::move(element));
    } while (reader.separator());
    return reader.atEnd() ? std::optional(std::move(array)) : std::nullopt;
}

}  // namespace

cimom::Value readValue(const cimom::PropertyDeclaration& property, std::string_view text) {
    const bool isText = property.type == Type::string && !property.isArray;
    if (!isText && cimom::sameName(text, "NULL")) {
        return cimom::Value::null(property.type, property.isArray);
    }
    cimom::Value value{property.type, property.isArray, std::monostate()};
    if (property.isArray) {
        auto array = elements(property, ZR::trim(text));
        if (!array) {
            refuse(property, text);
        }
        value.content = *std::move(array);
    } else {
        auto one = scalar(property.type, text);
        if (!one) {
            refuse(property, text);
        }
        value.content = *std::move(one);
    }
    return value;
}

}  // namespace cimdhcp
