#pragma once

#include <optional>
#include <string>

#include "cimom/ClassRepository.h"

namespace cimdhcp {

/// What a value stands for by the qualifiers ValueMap and Values of its property
/// (DSP0004, 5.6.3): "Enabled" for an EnabledState of 2. None when the property
/// has no such qualifiers or no entry covers the value.
///
/// An entry of ValueMap is a value, a range "9..32767" whose ends may be left out,
/// or ".." alone, which stands for what no other entry covers. Without a ValueMap
/// the entries of Values stand for 0, 1, 2...
[[nodiscard]] std::optional<std::string> meaning(const cimom::PropertyDeclaration& declaration,
                                                 const cimom::Scalar& value);

}  // namespace cimdhcp
