#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "cimom/ObjectPath.h"
#include "cimom/Value.h"
#include "operations/Caller.h"

namespace cimom::wbem {

struct Modification;

/// An attempt to change, create or delete an instance, for the log.
struct Modification {
    enum class Kind { modify, create, remove };

    struct Change {
        std::string property;
        std::optional<Value> oldValue;  ///< none: the instance could not be read before
        Value newValue;
    };

    Caller caller;
    ObjectPath object;  ///< of a creation that failed the class
    std::vector<Change> changes;
    unsigned status = 0;  ///< CIM status code; 0: done
    std::string description;
    Kind kind = Kind::modify;
};

/// Gets every attempt to modify, create or delete, also one that was refused. Must not throw.
using ModificationLog = std::function<void(const Modification&)>;

/// A line for the log about an attempt to modify: who, from where, which object,
/// and for each property that it would change the old and the new value, as in
/// `modify user="root" address=127.0.0.1 object=... Name: "old" -> "new" status=OK`.
/// Creations ("create", with the values that were given) and deletions ("delete") likewise.
/// Values are shortened to 200 bytes each.
[[nodiscard]] std::string modificationText(const Modification& modification);

}  // namespace cimom::wbem
