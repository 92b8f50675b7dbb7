#pragma once

#include <optional>
#include <string>
#include <vector>

#include "cimom/ObjectPath.h"
#include "cimom/Value.h"
#include "operations/Caller.h"

namespace cimom::wbem {

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

}  // namespace cimom::wbem
