#include "text/ValueMeaning.h"

#include <cstdint>
#include <limits>
#include <string_view>
#include <variant>

#include "text/IntegerText.h"

namespace cimdhcp {

namespace {

constexpr std::string_view rangeSign = "..";

const cimom::Array* elementsOf(const cimom::Qualifier* qualifier) {
    return qualifier == nullptr ? nullptr : qualifier->value.array();
}

std::optional<std::string> textAt(const cimom::Array& elements, std::size_t index) {
    if (index >= elements.size()) {
        return std::nullopt;
    }
    const auto* const text = std::get_if<std::string>(&elements[index]);
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
/// highest value of the type; an end that is no number covers nothing.
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

}  // namespace cimdhcp
