#pragma once

#include <cmpift.h>

#include "broker/Arena.h"

namespace cimom::broker {

/// A CMPIArray: fixed length, all elements of one type, each possibly null.
struct ArrayRecord : CMPIArray {
    Arena* arena;
    CMPIType elementType;  ///< as stored: never CMPI_chars, never with the array bit
    CMPICount size;
    CMPIData* elements;
};

extern const CMPIArrayFT arrayTable;

/// Null unless the array was made by this broker and is alive.
[[nodiscard]] ArrayRecord* arrayOf(const CMPIArray* array) noexcept;

/// `size` null elements of a stored type. Throws std::bad_alloc.
ArrayRecord* makeArray(Arena& arena, CMPICount size, CMPIType elementType);
ArrayRecord* copyArray(Arena& arena, const ArrayRecord& array);

}  // namespace cimom::broker
