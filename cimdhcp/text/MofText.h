#pragma once

#include <string>
#include <string_view>

#include "cimom/Value.h"

namespace cimdhcp {

/// A text as a MOF string literal, quotation marks and escapes included
/// (DSP0004, 7.12.1).
[[nodiscard]] std::string mofString(std::string_view text);

/// A value as a MOF initializer: NULL, a literal, or {literal, ...}. A reference
/// is its path as a string. An embedded instance is the string of its declaration.
[[nodiscard]] std::string mofInitializer(const cimom::Value& value);

/// One element of a value as a MOF literal.
[[nodiscard]] std::string mofLiteral(const cimom::Scalar& scalar);

/// The declaration of an instance on one line.
[[nodiscard]] std::string mofDeclaration(const cimom::Instance& instance);

}  // namespace cimdhcp
