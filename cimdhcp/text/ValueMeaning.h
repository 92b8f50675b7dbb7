#pragma once

#include <optional>
#include <string>

#include "cimom/Value.h"

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

/// The text that a value holds; empty when it holds none. Null: there is no value.
[[nodiscard]] std::string heldText(const cimom::Value* value);

/// The meaning of a property's value, those of an array's elements with commas
/// between them (an element without one stands as it is). Empty when there is
/// none, or `declaration` is null: the class is not known.
[[nodiscard]] std::string meaningOf(const cimom::ClassDeclaration* declaration,
                                    const cimom::NamedValue& property);

/// The value with its meaning behind it, as it is shown to a person: "2 (Enabled)",
/// "{8 (Domain Name Server), 14}". References are shown as plain paths.
[[nodiscard]] std::string valueWithMeaning(const cimom::ClassDeclaration* declaration,
                                           const cimom::NamedValue& property);

}  // namespace cimdhcp
