#include "text/ValueMeaning.h"

#include <cstdint>
#include <memory>
#include <string_view>
#include <variant>

#include "cimom/ClassDeclaration.h"
#include "cimom/ObjectPathText.h"
#include "text/IntegerText.h"
#include "text/MofText.h"

namespace cimdhcp {

namespace {

constexpr std::string_view rangeSign = "..";

const cimom::Array* elementsOf(const cimom::Qualifier* qualifier) {
    return qualifier == nullptr ? nullptr : qualifier->value.array();
}

/// Of any index: a value of a property may be one.
std::optional<std::string> textAt(const cimom::Array& elements, std::uint64_t index) {
    if (index >= elements.size()) {
        return std::nullopt;
    }
    const auto* const text = std::get_if<std::string>(&elements[static_cast<std::size_t>(index)]);
    return text == nullptr ? std::nullopt : std::optional(*text);
}

std::optional<Integer> integerOf(const cimom::Scalar& value) {
    if (const auto* const number = std::get_if<std::uint64_t>(&value)) {
        return Integer{false, *number};
    }
    if (const auto* const number = std::get_if<std::int64_t>(&value)) {
        return Integer::of(*number);
    }
    return std::nullopt;
}

/// Whether a range covers the number. A missing end stands for the lowest or
/// highest value of the type; an end that is not a number covers nothing.
bool rangeCovers(std::string_view entry, std::size_t sign, Integer number) {
    const std::string_view low = entry.substr(0, sign);
    const std::string_view high = entry.substr(sign + rangeSign.size());
    const auto from = readInteger(low);
    const auto to = readInteger(high);
    return (low.empty() || (from && !(number < *from))) &&
           (high.empty() || (to && !(*to < number)));
}

bool covers(std::string_view entry, Integer number) {
    const std::size_t sign = entry.find(rangeSign);
    if (sign != std::string_view::npos) {
        return rangeCovers(entry, sign, number);
    }
    const auto single = readInteger(entry);
    return single && *single == number;
}

const cimom::PropertyDeclaration* declarationOf(const cimom::ClassDeclaration* declaration,
                                                const std::string& name) {
    return declaration == nullptr ? nullptr : declaration->property(name);
}

std::string shown(const cimom::PropertyDeclaration* property, const cimom::Scalar& value) {
    if (const auto* path = std::get_if<std::shared_ptr<const cimom::ObjectPath>>(&value)) {
        return cimom::toText(**path);
    }
    std::string text = mofLiteral(value);
    if (property != nullptr) {
        if (const auto words = meaning(*property, value)) {
            text += " (" + *words + ')';
        }
    }
    return text;
}

}  // namespace

std::optional<std::string> meaning(const cimom::PropertyDeclaration& declaration,
                                   const cimom::Scalar& value) {
    const cimom::Array* const meanings = elementsOf(declaration.qualifier("Values"));
    const cimom::Array* const map = elementsOf(declaration.qualifier("ValueMap"));
    const auto number = integerOf(value);
    const auto* const text = std::get_if<std::string>(&value);
    if (meanings == nullptr || (!number && text == nullptr)) {
        return std::nullopt;
    }
    if (map == nullptr) {
        return number && !number->negative ? textAt(*meanings, number->magnitude) : std::nullopt;
    }
    std::optional<std::string> otherwise;
    for (std::size_t index = 0; index < map->size(); ++index) {
        const auto entry = textAt(*map, index);
        if (!entry) {
            continue;
        }
        if (*entry == rangeSign) {
            otherwise = textAt(*meanings, index);
        } else if (number ? covers(*entry, *number) : *entry == *text) {
            return textAt(*meanings, index);
        }
    }
    return otherwise;
}

std::string heldText(const cimom::Value* value) {
    const cimom::Scalar* const scalar = value == nullptr ? nullptr : value->scalar();
    const auto* const text = scalar == nullptr ? nullptr : std::get_if<std::string>(scalar);
    return text == nullptr ? std::string() : *text;
}

std::string meaningOf(const cimom::ClassDeclaration* declaration,
                      const cimom::NamedValue& property) {
    const cimom::PropertyDeclaration* const known = declarationOf(declaration, property.name);
    if (known == nullptr) {
        return {};
    }
    if (const cimom::Scalar* const scalar = property.value.scalar()) {
        return meaning(*known, *scalar).value_or("");
    }
    std::string text;
    bool found = false;
    if (const cimom::Array* const elements = property.value.array()) {
        for (const cimom::Scalar& element : *elements) {
            const auto words = meaning(*known, element);
            found = found || words;
            text += (text.empty() ? "" : ", ") + words.value_or(mofLiteral(element));
        }
    }
    return found ? text : std::string();
}

std::string valueWithMeaning(const cimom::ClassDeclaration* declaration,
                             const cimom::NamedValue& property) {
    const cimom::PropertyDeclaration* const known = declarationOf(declaration, property.name);
    if (const cimom::Array* const elements = property.value.array()) {
        std::string text = "{";
        for (const cimom::Scalar& element : *elements) {
            text += (text.size() > 1 ? ", " : "") + shown(known, element);
        }
        return text + '}';
    }
    const cimom::Scalar* const scalar = property.value.scalar();
    return scalar == nullptr ? "NULL" : shown(known, *scalar);
}

}  // namespace cimdhcp
