#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "cimom/Forward.h"
#include "cimom/Type.h"

/// The object manager's own model of CIM data: plain values without any tie to
/// CMPI records, to MOF or to XML, which are translated from and to it.
namespace cimom {

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
