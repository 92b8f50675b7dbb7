#pragma once

#include <string>
#include <string_view>

#include "cimom/Forward.h"
#include "client/ClassLookup.h"

namespace cimdhcp {

/// Reads what a person typed as the value of a property. A text is taken as it is, even
/// NULL, which is the null value of every other type. Numbers, TRUE, FALSE, datetimes and
/// object paths are read by their type, an array as {value, value...} with its texts in
/// double quotes. Throws Failure with what the property would take.
[[nodiscard]] cimom::Value readValue(const cimom::PropertyDeclaration& property,
                                     std::string_view text);

/// Reads the name of a class, which may have a namespace before it. Throws Failure.
[[nodiscard]] cimom::ObjectPath readClassArgument(const std::string& text,
                                                  const std::string& defaultNamespace);

/// Reads the path of an instance. For a class that has keys the path needs at least
/// one: a path without keys names a class. Throws Failure.
[[nodiscard]] cimom::ObjectPath readPathArgument(const std::string& text,
                                                 const std::string& defaultNamespace,
                                                 const ClassLookup& classes);

}  // namespace cimdhcp
