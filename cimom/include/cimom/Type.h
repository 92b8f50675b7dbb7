#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

namespace cimom {

/// CIM data types (DSP0004, 5.2).
enum class Type : std::uint8_t {
    boolean,
    char16,
    uint8,
    uint16,
    uint32,
    uint64,
    sint8,
    sint16,
    sint32,
    sint64,
    real32,
    real64,
    string,
    datetime,
    reference,
    instance,
};

/// The name of a type as MOF and CIM-XML write it, e.g. "uint16"; "reference"
/// and "instance" for those two.
[[nodiscard]] std::string_view typeName(Type type) noexcept;
[[nodiscard]] std::optional<Type> typeFromName(std::string_view name) noexcept;

}  // namespace cimom
