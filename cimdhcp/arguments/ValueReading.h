#pragma once

#include <string_view>

#include "cimom/Forward.h"

namespace cimdhcp {

/// Reads what a person typed as the value of a property. A text is taken as it is, even
/// NULL, which is the null value of every other type. Numbers, TRUE, FALSE, datetimes and
/// object paths are read by their type, an array as {value, value...} with its texts in
/// double quotes. Throws Failure with what the property would take.
[[nodiscard]] cimom::Value readValue(const cimom::PropertyDeclaration& property,
                                     std::string_view text);

}  // namespace cimdhcp
