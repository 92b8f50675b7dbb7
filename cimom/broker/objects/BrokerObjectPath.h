#pragma once

#include <cmpift.h>

#include "broker/Arena.h"
#include "broker/objects/BrokerString.h"
#include "broker/objects/BrokerValues.h"
#include "cimom/Forward.h"

namespace cimom::broker {

/// A CMPIObjectPath. Components that are not set are empty texts.
// NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init): the arena value-initialises it
struct PathRecord : CMPIObjectPath {
    Arena* arena;
    const ClassRepository* classes;  ///< null: no class is known
    StringRecord* host;
    StringRecord* nameSpace;
    StringRecord* className;
    EntryList keys;
    unsigned changes;  ///< how often a setter was used since it was made
};

extern const CMPIObjectPathFT objectPathTable;

/// Null unless the path was made by this broker and is alive.
[[nodiscard]] PathRecord* pathOf(const CMPIObjectPath* path) noexcept;

/// Throw std::bad_alloc.
PathRecord* makePath(Arena& arena, const ClassRepository* classes, std::string_view nameSpace,
                     std::string_view className);
PathRecord* copyPath(Arena& arena, const PathRecord& path);

}  // namespace cimom::broker
