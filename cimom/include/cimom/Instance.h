#pragma once

#include <string_view>
#include <vector>

#include "cimom/ObjectPath.h"
#include "cimom/Value.h"

namespace cimom {

struct Instance {
    ObjectPath path;  ///< its class name is the instance's class
    std::vector<NamedValue> properties;

    [[nodiscard]] const Value* property(std::string_view name) const noexcept;

    bool operator==(const Instance&) const = default;
};

}  // namespace cimom
