#pragma once

#include <string_view>

#include "cimom/Forward.h"

namespace cimom {

/// Whether two key values mean the same: numbers by value, whatever their
/// types, references by what they name, everything else exactly. A null agrees
/// with nothing.
[[nodiscard]] bool sameKeyValue(const Value& a, const Value& b);

/// Whether the instance agrees with every key of the path; keys that the
/// instance's own path lacks are looked for among its properties.
[[nodiscard]] bool hasKeys(const Instance& instance, const ObjectPath& path);

/// Whether two paths name the same object: related classes (one is the other or
/// its ancestor), the same namespace, and agreement on every key that both have,
/// at least one. Paths made by different parties carry different sets of keys.
/// A namespace that one of them lacks does not matter.
[[nodiscard]] bool sameObject(const ObjectPath& a, const ObjectPath& b,
                              const ClassRepository& repository);

}  // namespace cimom
