#include "cimom/Value.h"

#include <algorithm>
#include <array>
#include <utility>

#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimom/ObjectPath.h"

namespace cimom {

namespace {

struct TypeEntry {
    Type type;
    std::string_view name;
};

/// In the order of Type, so that a type is the index of its name.
constexpr std::array<TypeEntry, 16> types{{
    {Type::boolean, "boolean"},
    {Type::char16, "char16"},
    {Type::uint8, "uint8"},
    {Type::uint16, "uint16"},
    {Type::uint32, "uint32"},
    {Type::uint64, "uint64"},
    {Type::sint8, "sint8"},
    {Type::sint16, "sint16"},
    {Type::sint32, "sint32"},
    {Type::sint64, "sint64"},
    {Type::real32, "real32"},
    {Type::real64, "real64"},
    {Type::string, "string"},
    {Type::datetime, "datetime"},
    {Type::reference, "reference"},
    {Type::instance, "instance"},
}};

constexpr bool typesStandInOrder() {
    for (std::size_t index = 0; index < types.size(); ++index) {
        if (static_cast<std::size_t>(types[index].type) != index) {
            return false;
        }
    }
    return true;
}
static_assert(typesStandInOrder());

template <typename Held>
bool samePointee(const std::shared_ptr<const Held>& a, const std::shared_ptr<const Held>& b) {
    return a == b || (a != nullptr && b != nullptr && *a == *b);
}

/// The variant's own comparison would compare references by address.
bool sameScalar(const Scalar& a, const Scalar& b) {
    if (a.index() != b.index()) {
        return false;
    }
    if (const auto* path = std::get_if<std::shared_ptr<const ObjectPath>>(&a)) {
        return samePointee(*path, std::get<std::shared_ptr<const ObjectPath>>(b));
    }
    if (const auto* instance = std::get_if<std::shared_ptr<const Instance>>(&a)) {
        return samePointee(*instance, std::get<std::shared_ptr<const Instance>>(b));
    }
    return a == b;
}

}  // namespace

std::string_view typeName(Type type) noexcept {
    const auto index = static_cast<std::size_t>(type);
    return index < types.size() ? types.at(index).name : std::string_view();
}

std::optional<Type> typeFromName(std::string_view name) noexcept {
    const auto* const found = std::find_if(types.begin(), types.end(), [name](const auto& entry) {
        return sameName(entry.name, name);
    });
    return found == types.end() ? std::nullopt : std::optional(found->type);
}

bool Value::isNull() const noexcept {
    if (const auto* held = scalar()) {
        return std::holds_alternative<std::monostate>(*held);
    }
    return std::holds_alternative<std::monostate>(content);
}

Value Value::ofString(std::string text) {
    return Value{Type::string, false, Scalar(std::move(text))};
}

Value Value::null(Type type, bool isArray) {
    return Value{type, isArray, std::monostate()};
}

bool Value::operator==(const Value& other) const {
    if (type != other.type || isArray != other.isArray || isNull() != other.isNull()) {
        return false;
    }
    // A null scalar and no content at all are both null.
    if (isNull()) {
        return true;
    }
    const Array* const elements = array();
    const Array* const others = other.array();
    if (elements != nullptr && others != nullptr) {
        return std::equal(elements->begin(), elements->end(), others->begin(), others->end(),
                          sameScalar);
    }
    const Scalar* const here = scalar();
    const Scalar* const there = other.scalar();
    return here != nullptr && there != nullptr && sameScalar(*here, *there);
}

const Value* findValue(const std::vector<NamedValue>& values, std::string_view name) noexcept {
    const auto found = std::find_if(values.begin(), values.end(), [name](const NamedValue& entry) {
        return sameName(entry.name, name);
    });
    return found == values.end() ? nullptr : &found->value;
}

}  // namespace cimom
