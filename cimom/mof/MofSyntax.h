#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "cimom/MofError.h"
#include "cimom/Type.h"

/// What a MOF text says (DSP0004, annex A), before any of it is checked against
/// other declarations.
namespace cimom {

/// Sign and magnitude, since the text alone does not tell which type it is for.
struct MofInteger {
    bool negative = false;
    std::uint64_t magnitude = 0;

    bool operator==(const MofInteger&) const = default;
};

/// std::monostate is NULL.
using MofConstant = std::variant<std::monostate, bool, MofInteger, double, char16_t, std::string>;

struct MofLiteral {
    MofConstant value;
    MofPosition position;

    bool operator==(const MofLiteral&) const = default;
};

/// One literal, or a list of them in braces.
struct MofInitializer {
    bool isArray = false;
    std::vector<MofLiteral> elements;  ///< exactly one when it is not an array
    MofPosition position;

    bool operator==(const MofInitializer&) const = default;
};

/// What is said about a qualifier's inheritance; absent: nothing.
struct MofFlavors {
    std::optional<bool> overridable;
    std::optional<bool> toSubclass;
    std::optional<bool> translatable;

    bool operator==(const MofFlavors&) const = default;
};

struct MofQualifier {
    std::string name;
    std::optional<MofInitializer> value;
    MofFlavors flavors;
    MofPosition position;

    bool operator==(const MofQualifier&) const = default;
};

struct MofType {
    Type type = Type::string;
    std::string referenceClass;  ///< for references, else empty
    MofPosition position;

    bool operator==(const MofType&) const = default;
};

/// A property, or a parameter of a method (which has no default value).
struct MofElement {
    std::vector<MofQualifier> qualifiers;
    MofType type;
    std::string name;
    MofPosition position;  ///< of the name
    bool isArray = false;
    std::optional<std::uint32_t> arraySize;
    std::optional<MofInitializer> defaultValue;

    bool operator==(const MofElement&) const = default;
};

struct MofMethod {
    std::vector<MofQualifier> qualifiers;
    MofType returnType;
    std::string name;
    MofPosition position;
    std::vector<MofElement> parameters;

    bool operator==(const MofMethod&) const = default;
};

struct MofClass {
    std::vector<MofQualifier> qualifiers;
    std::string name;
    MofPosition position;
    std::string superclass;  ///< empty for a root
    MofPosition superclassPosition;
    std::vector<MofElement> properties;
    std::vector<MofMethod> methods;

    bool operator==(const MofClass&) const = default;
};

/// Where a qualifier may stand.
enum class MofScope : std::uint8_t {
    schema,
    classes,
    association,
    indication,
    qualifier,
    property,
    reference,
    method,
    parameter,
    any,
};

struct MofQualifierType {
    std::string name;
    MofPosition position;
    Type type = Type::string;
    bool isArray = false;
    std::optional<MofInitializer> defaultValue;
    std::vector<MofScope> scopes;
    MofFlavors flavors;

    bool operator==(const MofQualifierType&) const = default;
};

struct MofPragma {
    std::string name;
    std::string value;
    MofPosition position;  ///< of the value

    bool operator==(const MofPragma&) const = default;
};

using MofDeclaration = std::variant<MofPragma, MofQualifierType, MofClass>;

}  // namespace cimom
