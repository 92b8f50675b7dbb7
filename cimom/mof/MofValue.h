#pragma once

#include <string>

#include "cimom/Forward.h"
#include "mof/MofSyntax.h"

namespace cimom {

/// The value that a text gives to something of this type. Throws MofError, with
/// the name of `file`, when it does not fit. Elements of arrays may be null.
[[nodiscard]] Value typedValue(const MofInitializer& initializer, Type type, bool isArray,
                               const std::string& file);

}  // namespace cimom
