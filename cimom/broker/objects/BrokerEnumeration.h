#pragma once

#include <cmpift.h>

#include "broker/Arena.h"
#include "broker/objects/BrokerArray.h"

namespace cimom::broker {

/// A CMPIEnumeration: a cursor over an array of instances or paths.
struct EnumerationRecord : CMPIEnumeration {
    Arena* arena;
    ArrayRecord* elements;
    CMPICount next;
};

extern const CMPIEnumerationFT enumerationTable;

/// Null unless the enumeration was made by this broker and is alive.
[[nodiscard]] EnumerationRecord* enumerationOf(const CMPIEnumeration* enumeration) noexcept;

/// The elements must live in the arena. Throws std::bad_alloc.
EnumerationRecord* makeEnumeration(Arena& arena, ArrayRecord* elements);

}  // namespace cimom::broker
