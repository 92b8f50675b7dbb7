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
    /// Why it is not certain that what was asked for has happened, although the provider has
    /// said so; none: it was looked at, and has.
    std::optional<std::string> doubt = std::nullopt;
};

/// Gets every attempt to modify, create or delete, also one that was refused. Must not throw.
using ModificationLog = std::function<void(const Modification&)>;

/// A value for such a line, shortened to 200 bytes.
[[nodiscard]] std::string valueText(const Value& value);

/// A line for the log about an attempt to modify: who, from where, which object,
/// and for each property that it would change the old and the new value, as in
/// `modify user="root" address=127.0.0.1 object=... Name: "old" -> "new" status=OK`.
/// The status ACCEPTED, with a reason, is that of an attempt whose provider has said OK, while
/// what can be read behind it is not what was asked for, or cannot be read.
/// Creations ("create", with the values that were given) and deletions ("delete") likewise.
/// Values are shortened to 200 bytes each.
[[nodiscard]] std::string modificationText(const Modification& modification);

}  // namespace cimom::wbem
