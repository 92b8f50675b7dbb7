#pragma once

#include <string>

#include "cimom/ClassRepository.h"

namespace cimdhcp {

/// The meaning of a property's value, those of an array's elements with commas
/// between them (an element without one stands as it is). Empty when there is
/// none, or `declaration` is null: the class is not known.
[[nodiscard]] std::string meaningOf(const cimom::ClassDeclaration* declaration,
                                    const cimom::NamedValue& property);

/// The value with its meaning behind it, as it is shown to a person: "2 (Enabled)",
/// "{8 (Domain Name Server), 14}". References stand as plain paths.
[[nodiscard]] std::string valueWithMeaning(const cimom::ClassDeclaration* declaration,
                                           const cimom::NamedValue& property);

}  // namespace cimdhcp
