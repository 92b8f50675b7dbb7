#pragma once

#include <cmpift.h>

#include <array>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "ExtensionObjects.h"
#include "zrclient/Snapshot.h"

/// The classes that this provider serves, as tables.
namespace ZR::DHCPClientExtensions {

/// What a request is made with. All of it belongs to the object manager.
struct Request {
    const CMPIBroker* broker = nullptr;
    const CMPIContext* context = nullptr;
    const CMPIResult* result = nullptr;
    const CMPIObjectPath* path = nullptr;  ///< what the client names
    std::string nameSpace;                 ///< that of the path
    const Snapshot* machine = nullptr;     ///< at one moment, for all that is asked
};

/// A class that this provider, or for the ends of associations another one, serves.
struct ElementClass {
    const char* name;
    std::span<const char* const> ancestors;  ///< nearest first
    std::span<const char* const> keys;
    /// What there is of it. Null: another provider serves it.
    std::vector<ExtensionObject> (*objects)(const Snapshot& machine);
    /// What names its objects, where `objects` is null.
    std::vector<ObjectName> (*names)(const Snapshot& machine) = nullptr;
};

/// The names of what an association ties together, in the order of its roles.
using Link = std::array<ObjectName, 2>;

struct AssociationClass {
    const char* name;
    std::span<const char* const> ancestors;
    std::array<const char*, 2> roles;
    std::array<const char*, 2> ends;  ///< an ElementClass each
    std::vector<Link> (*links)(const Request& request);
};

[[nodiscard]] std::span<const ElementClass> elementClasses() noexcept;
[[nodiscard]] std::span<const AssociationClass> associationClasses() noexcept;

// Null for any other class. Names compare without regard to case.
[[nodiscard]] const ElementClass* findElement(std::string_view name) noexcept;
[[nodiscard]] const AssociationClass* findAssociation(std::string_view name) noexcept;

/// What names the objects of a class.
[[nodiscard]] std::vector<ObjectName> namesOf(const ElementClass& served, const Snapshot& machine);

}  // namespace ZR::DHCPClientExtensions
