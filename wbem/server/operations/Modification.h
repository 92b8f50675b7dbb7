#pragma once

#include <optional>
#include <string>
#include <vector>

#include "cimom/ObjectPath.h"
#include "cimom/Value.h"
#include "operations/Caller.h"

namespace cimom::wbem {

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

}  // namespace cimom::wbem
