#pragma once

#include <cmpift.h>

#include "broker/Arena.h"
#include "broker/objects/BrokerValues.h"

namespace cimom::broker {

/// A CMPIArgs: named method arguments.
// NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init): the arena value-initialises it
struct ArgsRecord : CMPIArgs {
    Arena* arena;
    EntryList entries;
};

extern const CMPIArgsFT argsTable;

/// Null unless the arguments were made by this broker and are alive.
[[nodiscard]] ArgsRecord* argsOf(const CMPIArgs* args) noexcept;

/// Throws std::bad_alloc.
ArgsRecord* makeArgs(Arena& arena);

}  // namespace cimom::broker
