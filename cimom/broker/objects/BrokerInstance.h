#pragma once

#include <cmpift.h>

#include <atomic>

#include "broker/Arena.h"
#include "broker/objects/BrokerObjectPath.h"
#include "broker/objects/BrokerValues.h"
#include "cimom/Forward.h"

namespace cimom::broker {

/// Which properties an instance keeps.
struct PropertyFilter {
    bool active = false;
    CMPICount size = 0;
    StringRecord** names = nullptr;
};

/// A CMPIInstance. A key that its path lacks is added to the path when it is set as a
/// property, also when the filter excludes the property: some providers make all paths so.
// NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init): the arena value-initialises it
struct InstanceRecord : CMPIInstance {
    Arena* arena;
    PathRecord* path;
    const ClassDeclaration* declaration;  ///< null: its class is unknown, nothing is checked
    /// So many keys came with the path; those behind them were set as properties.
    CMPICount ownKeys;
    EntryList properties;
    PropertyFilter filter;
    /// The copy of the path last handed out; handed out again while neither has changed.
    std::atomic<PathRecord*>* handedOut;
};

extern const CMPIInstanceFT instanceTable;

/// Null unless the instance was made by this broker and is alive.
[[nodiscard]] InstanceRecord* instanceOf(const CMPIInstance* instance) noexcept;

/// An instance without properties; the path is copied. Throw std::bad_alloc.
InstanceRecord* makeInstance(Arena& arena, const PathRecord& path);
InstanceRecord* copyInstance(Arena& arena, const InstanceRecord& instance);

}  // namespace cimom::broker
