#include "manager/PathMatch.h"

#include <algorithm>
#include <optional>
#include <utility>

#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/Names.h"

namespace cimom {

namespace {

bool sameNameSpace(const std::string& a, const std::string& b) noexcept {
    return a.empty() || b.empty() || sameName(a, b);
}

bool isNumber(const Scalar& scalar) noexcept {
    return std::holds_alternative<std::uint64_t>(scalar) ||
           std::holds_alternative<std::int64_t>(scalar) || std::holds_alternative<double>(scalar);
}

bool sameNumber(const Scalar& a, const Scalar& b) {
    return std::visit(
        [](const auto& x, const auto& y) {
            using X = std::decay_t<decltype(x)>;
            using Y = std::decay_t<decltype(y)>;
            constexpr auto whole = []<typename T>(std::in_place_type_t<T>) {
                return std::is_same_v<T, std::uint64_t> || std::is_same_v<T, std::int64_t>;
            };
            if constexpr (whole(std::in_place_type<X>) && whole(std::in_place_type<Y>)) {
                return std::cmp_equal(x, y);
            } else if constexpr (std::is_arithmetic_v<X> && std::is_arithmetic_v<Y>) {
                return static_cast<double>(x) == static_cast<double>(y);
            } else {
                return false;
            }
        },
        a, b);
}

bool samePath(const ObjectPath& a, const ObjectPath& b) {
    return sameName(a.className, b.className) && sameNameSpace(a.nameSpace, b.nameSpace) &&
           a.keys.size() == b.keys.size() &&
           std::all_of(a.keys.begin(), a.keys.end(), [&b](const NamedValue& key) {
               const Value* const other = b.key(key.name);
               return other != nullptr && sameKeyValue(key.value, *other);
           });
}

}  // namespace

bool sameKeyValue(const Value& a, const Value& b) {
    const Scalar* const x = a.scalar();
    const Scalar* const y = b.scalar();
    if (x == nullptr || y == nullptr || a.isNull() || b.isNull()) {
        return false;
    }
    if (isNumber(*x) && isNumber(*y)) {
        return sameNumber(*x, *y);
    }
    const auto* const left = std::get_if<std::shared_ptr<const ObjectPath>>(x);
    const auto* const right = std::get_if<std::shared_ptr<const ObjectPath>>(y);
    if (left != nullptr && right != nullptr) {
        return samePath(**left, **right);
    }
    return *x == *y;
}

bool hasKeys(const Instance& instance, const ObjectPath& path) {
    return std::all_of(path.keys.begin(), path.keys.end(), [&instance](const NamedValue& key) {
        const Value* value = instance.path.key(key.name);
        if (value == nullptr) {
            value = instance.property(key.name);
        }
        return value != nullptr && sameKeyValue(*value, key.value);
    });
}

bool sameObject(const ObjectPath& a, const ObjectPath& b, const ClassRepository& repository) {
    if (!sameNameSpace(a.nameSpace, b.nameSpace) ||
        !(sameName(a.className, b.className) || repository.isA(a.className, b.className) ||
          repository.isA(b.className, a.className))) {
        return false;
    }
    bool shared = false;
    for (const NamedValue& key : a.keys) {
        if (const Value* const other = b.key(key.name)) {
            if (!sameKeyValue(key.value, *other)) {
                return false;
            }
            shared = true;
        }
    }
    return shared;
}

}  // namespace cimom
