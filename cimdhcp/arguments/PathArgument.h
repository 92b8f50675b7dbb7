#pragma once

#include <string>

#include "cimom/Forward.h"
#include "client/ClassLookup.h"

namespace cimdhcp {

/// Reads the name of a class, which may have a namespace before it. Throws Failure.
[[nodiscard]] cimom::ObjectPath readClassArgument(const std::string& text,
                                                  const std::string& defaultNamespace);

/// Reads the path of an instance. For a class that has keys the path needs at least
/// one: a path without keys names a class. Throws Failure.
[[nodiscard]] cimom::ObjectPath readPathArgument(const std::string& text,
                                                 const std::string& defaultNamespace,
                                                 const ClassLookup& classes);

}  // namespace cimdhcp
