#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

/// The object manager's own model of CIM data: plain values without any tie to
/// CMPI records, to MOF or to XML, which are translated from and to it.
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

struct ObjectPath;
struct Instance;

/// One element: std::monostate is null. All integers are held in 64 bits of
/// their signedness, reals in a double, datetimes as their 25-character text.
/// References and embedded instances are shared and immutable; never null
/// pointers.
using Scalar =
    std::variant<std::monostate, bool, std::uint64_t, std::int64_t, double, char16_t, std::string,
                 std::shared_ptr<const ObjectPath>, std::shared_ptr<const Instance>>;
using Array = std::vector<Scalar>;

/// A typed value: null, one scalar, or an array.
struct Value {
    Type type = Type::string;
    bool isArray = false;
    std::variant<std::monostate, Scalar, Array> content;

    [[nodiscard]] bool isNull() const noexcept;
    /// The scalar, or null when the value is null or an array.
    [[nodiscard]] const Scalar* scalar() const noexcept { return std::get_if<Scalar>(&content); }
    [[nodiscard]] const Array* array() const noexcept { return std::get_if<Array>(&content); }

    static Value ofString(std::string text);
    static Value null(Type type, bool isArray);

    /// Deep: references and instances compare by what they hold.
    bool operator==(const Value& other) const;
};

struct NamedValue {
    std::string name;
    Value value;

    bool operator==(const NamedValue&) const = default;
};

/// The first value of that name; null when there is none.
[[nodiscard]] const Value* findValue(const std::vector<NamedValue>& values,
                                     std::string_view name) noexcept;

}  // namespace cimom
