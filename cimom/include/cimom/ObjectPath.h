#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "cimom/Value.h"

namespace cimom {

/// The path of an instance, or of a class when it has no keys.
struct ObjectPath {
    std::string host;       ///< empty: none
    std::string nameSpace;  ///< without leading slash; empty: none
    std::string className;
    std::vector<NamedValue> keys;  ///< in the order given

    [[nodiscard]] const Value* key(std::string_view name) const noexcept;

    /// DSP0004 equality: names without regard to case, keys in any order, string
    /// values exactly. An empty host equals any other.
    bool operator==(const ObjectPath& other) const;
};

}  // namespace cimom
