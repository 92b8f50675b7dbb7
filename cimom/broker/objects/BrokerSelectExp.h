#pragma once

#include <cmpift.h>

#include <memory>
#include <string_view>

#include "broker/Arena.h"
#include "broker/objects/BrokerString.h"
#include "cimom/Forward.h"

namespace cimom::broker {

/// A CMPISelectExp: the text of a query, which is read again each time a provider has
/// an instance evaluated. Never changes.
// NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init): the arena value-initialises it
struct SelectExpRecord : CMPISelectExp {
    Arena* arena;
    const ClassRepository* classes;
    StringRecord* query;
    StringRecord* language;
};

extern const CMPISelectExpFT selectExpTable;

/// Null unless the expression was made by this broker and is alive.
[[nodiscard]] SelectExpRecord* selectExpOf(const CMPISelectExp* expression) noexcept;

/// Throws std::bad_alloc. The query is not looked at.
SelectExpRecord* makeSelectExp(Arena& arena, const ClassRepository& classes, std::string_view query,
                               std::string_view language);

}  // namespace cimom::broker
