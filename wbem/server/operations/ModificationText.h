#pragma once

#include <string>

#include "operations/Operations.h"

namespace cimom::wbem {

/// A line for the log about an attempt to modify: who, from where, which object,
/// and for each property that it would change the old and the new value, as in
/// `modify user="root" address=127.0.0.1 object=... Name: "old" -> "new" status=OK`.
/// Values are shortened to 200 bytes each.
[[nodiscard]] std::string modificationText(const Modification& modification);

}  // namespace cimom::wbem
