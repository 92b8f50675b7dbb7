#pragma once

#include <cmpift.h>

#include <string>

#include "broker/Arena.h"
#include "broker/objects/BrokerValues.h"

namespace cimom::broker {

/// A CMPIContext: what a provider may know of a request beside its parameters.
// NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init): the arena value-initialises it
struct ContextRecord : CMPIContext {
    Arena* arena;
    EntryList entries;
    unsigned depth;  ///< how many requests the one it belongs to is nested in, itself included
};

extern const CMPIContextFT contextTable;

/// Null unless the context was made by this broker and is alive.
[[nodiscard]] ContextRecord* contextOf(const CMPIContext* context) noexcept;

/// A context with the standard entries. Throws std::bad_alloc.
ContextRecord* makeContext(Arena& arena, std::string_view nameSpace, std::string_view principal,
                           CMPIFlags flags, unsigned depth);

/// The authenticated user that the context names; empty without one.
[[nodiscard]] std::string principalOf(const CMPIContext* context);

}  // namespace cimom::broker
