#pragma once

#include <functional>
#include <string>

namespace cimom::wbem {

struct Modification;

/// Gets every attempt to modify, create or delete, also one that was refused. Must not throw.
using ModificationLog = std::function<void(const Modification&)>;

/// A line for the log about an attempt to modify: who, from where, which object,
/// and for each property that it would change the old and the new value, as in
/// `modify user="root" address=127.0.0.1 object=... Name: "old" -> "new" status=OK`.
/// Creations ("create", with the values that were given) and deletions ("delete") likewise.
/// Values are shortened to 200 bytes each.
[[nodiscard]] std::string modificationText(const Modification& modification);

}  // namespace cimom::wbem
