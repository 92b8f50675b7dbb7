#pragma once

#include <cmpidt.h>

#include <cstring>
#include <optional>

#include "cimom/Type.h"

namespace cimom::broker {

[[nodiscard]] constexpr CMPIType withoutArray(CMPIType type) noexcept {
    return static_cast<CMPIType>(type & ~CMPI_ARRAY);
}
[[nodiscard]] constexpr bool isArrayType(CMPIType type) noexcept {
    return (type & CMPI_ARRAY) != 0;
}

/// The CIM type of a CMPI type without array bit; CMPI_chars is a string.
/// Nothing for types that are not CIM types.
[[nodiscard]] std::optional<Type> cimType(CMPIType scalarType) noexcept;

[[nodiscard]] CMPIType cmpiType(Type type) noexcept;
[[nodiscard]] CMPIType cmpiType(Type type, bool isArray) noexcept;

/// Reads one member of a provider's value. The pointer may be the address of a
/// plain variable of the member's type, as C code passes it: it is aligned for
/// that type only, and nothing behind it may be read.
template <typename Member>
[[nodiscard]] Member memberOf(const CMPIValue* value) noexcept {
    Member member;
    // NOLINTNEXTLINE(bugprone-sizeof-expression): of pointers, too
    std::memcpy(&member, static_cast<const void*>(value), sizeof member);
    return member;
}

/// Copies the one member that the type names; the others stay zero. For scalars
/// other than objects and texts.
[[nodiscard]] CMPIValue plainValue(const CMPIValue* value, Type type) noexcept;

}  // namespace cimom::broker
