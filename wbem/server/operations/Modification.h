#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "cimom/ObjectPath.h"
#include "cimom/Value.h"

namespace cimom::wbem {

/// Who sent the request. Without users set up there is no identity, and none is made up.
struct Caller {
    std::optional<std::string> user;
    std::string address;
    bool mayModify = false;
    /// Whether the client has stopped waiting for the response; empty: it waits.
    std::function<bool()> gone = nullptr;
};

/// An attempt to change an instance, for the log.
struct Modification {
    struct Change {
        std::string property;
        std::optional<Value> oldValue;  ///< none: the instance could not be read before
        Value newValue;
    };

    Caller caller;
    ObjectPath object;
    std::vector<Change> changes;
    unsigned status = 0;  ///< CIM status code; 0: done
    std::string description;
};

/// Gets every attempt to modify, also one that was refused. Must not throw.
using ModificationLog = std::function<void(const Modification&)>;

/// A line for the log about an attempt to modify: who, from where, which object,
/// and for each property that it would change the old and the new value, as in
/// `modify user="root" address=127.0.0.1 object=... Name: "old" -> "new" status=OK`.
/// Values are shortened to 200 bytes each.
[[nodiscard]] std::string modificationText(const Modification& modification);

}  // namespace cimom::wbem
