#include "mof/MofValue.h"

#include <cmath>
#include <limits>
#include <optional>
#include <string_view>
#include <utility>

#include "cimom/MofError.h"
#include "cimom/Names.h"
#include "cimom/Value.h"

namespace cimom {

namespace {

std::string shown(MofInteger integer) {
    return (integer.negative ? "-" : "") + std::to_string(integer.magnitude);
}

/// The largest value of an integer type; none for the other types.
std::optional<std::uint64_t> largest(Type type) {
    switch (type) {
        case Type::uint8:
            return std::numeric_limits<std::uint8_t>::max();
        case Type::uint16:
            return std::numeric_limits<std::uint16_t>::max();
        case Type::uint32:
            return std::numeric_limits<std::uint32_t>::max();
        case Type::uint64:
            return std::numeric_limits<std::uint64_t>::max();
        case Type::sint8:
            return std::numeric_limits<std::int8_t>::max();
        case Type::sint16:
            return std::numeric_limits<std::int16_t>::max();
        case Type::sint32:
            return std::numeric_limits<std::int32_t>::max();
        case Type::sint64:
            return std::numeric_limits<std::int64_t>::max();
        default:
            return std::nullopt;
    }
}

bool isSigned(Type type) {
    return type == Type::sint8 || type == Type::sint16 || type == Type::sint32 ||
           type == Type::sint64;
}

bool isReal(Type type) {
    return type == Type::real32 || type == Type::real64;
}

/// None when the integer is out of the type's range.
std::optional<Scalar> integerOf(MofInteger integer, Type type, std::uint64_t limit) {
    const bool negative = integer.negative && integer.magnitude != 0;
    if (!isSigned(type)) {
        return negative || integer.magnitude > limit ? std::nullopt
                                                     : std::optional<Scalar>(integer.magnitude);
    }
    // Two's complement reaches one further below zero.
    if (integer.magnitude > limit + (negative ? 1 : 0)) {
        return std::nullopt;
    }
    return static_cast<std::int64_t>(negative ? 0 - integer.magnitude : integer.magnitude);
}

/// The 25 characters of DSP0004, 5.2.4; asterisks stand for unknown digits.
bool isDatetime(std::string_view text) {
    constexpr std::size_t point = 14;
    constexpr std::size_t sign = 21;
    constexpr std::size_t length = 25;
    if (text.size() != length) {
        return false;
    }
    for (std::size_t index = 0; index < length; ++index) {
        const char letter = text[index];
        const bool fits = index == point  ? letter == '.'
                          : index == sign ? letter == '+' || letter == '-' || letter == ':'
                                          : isDigit(letter) || (letter == '*' && index < sign);
        if (!fits) {
            return false;
        }
    }
    return true;
}

std::optional<double> realOf(const MofConstant& constant) {
    if (const auto* real = std::get_if<double>(&constant)) {
        return *real;
    }
    if (const auto* integer = std::get_if<MofInteger>(&constant)) {
        const auto magnitude = static_cast<double>(integer->magnitude);
        return integer->negative ? -magnitude : magnitude;
    }
    return std::nullopt;
}

/// None when the literal is of another kind than the type.
std::optional<Scalar> scalarOf(const MofConstant& constant, Type type) {
    if (const auto* text = std::get_if<std::string>(&constant)) {
        const bool fits = type == Type::string || (type == Type::datetime && isDatetime(*text));
        return fits ? std::optional<Scalar>(*text) : std::nullopt;
    }
    if (const auto* truth = std::get_if<bool>(&constant)) {
        return type == Type::boolean ? std::optional<Scalar>(*truth) : std::nullopt;
    }
    if (const auto* character = std::get_if<char16_t>(&constant)) {
        return type == Type::char16 ? std::optional<Scalar>(*character) : std::nullopt;
    }
    return std::nullopt;
}

Scalar typedScalar(const MofLiteral& literal, Type type, const std::string& file) {
    const MofConstant& constant = literal.value;
    if (std::holds_alternative<std::monostate>(constant)) {
        return std::monostate();
    }
    const auto* const integer = std::get_if<MofInteger>(&constant);
    const auto limit = largest(type);
    if (integer != nullptr && limit) {
        if (auto scalar = integerOf(*integer, type, *limit)) {
            return *std::move(scalar);
        }
        throw MofError(file, literal.position,
                       shown(*integer) + " does not fit " + std::string(typeName(type)));
    }
    const auto real = isReal(type) ? realOf(constant) : std::nullopt;
    if (real) {
        if (type == Type::real32 && std::abs(*real) > std::numeric_limits<float>::max()) {
            throw MofError(file, literal.position, "this number does not fit real32");
        }
        return *real;
    }
    if (auto scalar = scalarOf(constant, type)) {
        return *std::move(scalar);
    }
    throw MofError(file, literal.position,
                   type == Type::reference
                       ? "a reference can have no default value but NULL"
                       : "this is not a value of type " + std::string(typeName(type)));
}

}  // namespace

Value typedValue(const MofInitializer& initializer, Type type, bool isArray,
                 const std::string& file) {
    Value value = Value::null(type, isArray);
    if (!initializer.isArray) {
        const Scalar scalar = typedScalar(initializer.elements.front(), type, file);
        if (std::holds_alternative<std::monostate>(scalar)) {
            return value;
        }
        if (isArray) {
            throw MofError(file, initializer.position, "a list in braces is needed here");
        }
        value.content = scalar;
        return value;
    }
    if (!isArray) {
        throw MofError(file, initializer.position, "one value is needed here, not a list");
    }
    Array elements;
    elements.reserve(initializer.elements.size());
    for (const MofLiteral& element : initializer.elements) {
        elements.push_back(typedScalar(element, type, file));
    }
    value.content = std::move(elements);
    return value;
}

}  // namespace cimom
