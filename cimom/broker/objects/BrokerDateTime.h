#pragma once

#include <cmpift.h>

#include <string_view>

#include "broker/Arena.h"
#include "broker/objects/BrokerString.h"
#include "cimom/DateTimeText.h"

namespace cimom::broker {

/// A CMPIDateTime. The text is kept as given, with its offset from UTC and its
/// unknown digits. Never changes.
// NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init): the arena value-initialises it
struct DateTimeRecord : CMPIDateTime {
    Arena* arena;
    DateTime value;
    StringRecord* text;
};

extern const CMPIDateTimeFT dateTimeTable;

/// Null unless the datetime was made by this broker and is alive.
[[nodiscard]] DateTimeRecord* dateTimeOf(const CMPIDateTime* dateTime) noexcept;

/// Null for a text that is not a datetime. Throws std::bad_alloc.
DateTimeRecord* makeDateTime(Arena& arena, std::string_view text);
/// Null for a value that has no text.
DateTimeRecord* makeDateTime(Arena& arena, const DateTime& value);
/// The current time.
DateTimeRecord* makeDateTime(Arena& arena);
DateTimeRecord* copyDateTime(Arena& arena, const DateTimeRecord& dateTime);

}  // namespace cimom::broker
