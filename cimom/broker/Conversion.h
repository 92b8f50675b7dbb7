#pragma once

#include <cmpift.h>

#include <stdexcept>

#include "cimom/Forward.h"

namespace cimom::broker {

class Arena;
struct InstanceRecord;
struct PathRecord;

/// A value of the model that its type cannot hold, e.g. 300 for a uint8 or a
/// text that is not a datetime. what() tells name, value and type.
class ConversionError : public std::invalid_argument {
  public:
    using std::invalid_argument::invalid_argument;
};

// From a provider's objects to the model. Values of types that the model has no
// place for cannot be stored in the records.
[[nodiscard]] Value toModel(const CMPIData& data);
[[nodiscard]] ObjectPath toModel(const PathRecord& path);
[[nodiscard]] Instance toModel(const InstanceRecord& instance);

// From the model to objects in an arena. Values are not compared with the class:
// a provider gets what the client sent. Throw ConversionError, std::bad_alloc.
[[nodiscard]] CMPIData toData(Arena& arena, const ClassRepository* classes, const Value& value);
[[nodiscard]] PathRecord* toRecord(Arena& arena, const ClassRepository* classes,
                                   const ObjectPath& path);
[[nodiscard]] InstanceRecord* toRecord(Arena& arena, const ClassRepository* classes,
                                       const Instance& instance);

}  // namespace cimom::broker
