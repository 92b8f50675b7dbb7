#pragma once

#include <cmpift.h>

#include <cstddef>
#include <string_view>

#include "broker/Arena.h"
#include "model/NameKey.h"

namespace cimom::broker {

/// A CMPIString. Its hdl is the zero-terminated text itself, because clients
/// built with the older convenience macros read it there. Never changes.
struct StringRecord : CMPIString {
    Arena* arena;
    std::size_t length;

    [[nodiscard]] const char* text() const noexcept { return static_cast<const char*>(hdl); }
    [[nodiscard]] std::string_view view() const noexcept { return {text(), length}; }
};

extern const CMPIStringFT stringTable;

/// Throws std::bad_alloc.
StringRecord* makeString(Arena& arena, std::string_view text);

/// The string itself when it lives in that arena, else a copy there.
StringRecord* stringIn(Arena& arena, const CMPIString& string);

/// A string with the text of a name. Objects of an arena that have names in common share it.
StringRecord* nameIn(Arena& arena, const NameKey& name);

/// The record of an empty text that lives for ever.
[[nodiscard]] StringRecord* emptyString() noexcept;

/// The text of any broker's string; empty for a null or dead one.
[[nodiscard]] std::string_view textOf(const CMPIString* string);

}  // namespace cimom::broker
