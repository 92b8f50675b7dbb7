#pragma once

#include <cmpift.h>

#include <cstdint>
#include <string>
#include <variant>
#include <vector>

#include "providerutilities/Keys.h"

/// The objects of this provider as plain values, and what a broker makes of them.
namespace ZR::DHCPClientExtensions {

/// std::monostate: not known. A date-time is its CIM text of 25 characters.
using PropertyContent =
    std::variant<std::monostate, bool, std::uint64_t, std::string, std::vector<unsigned short>>;

struct ObjectProperty {
    const char* name;
    CMPIType type;
    PropertyContent value;

    bool operator==(const ObjectProperty&) const = default;
};

/// What names an object.
struct ObjectName {
    const char* className = nullptr;
    KeyTexts keys;
    std::string nameSpace;  ///< empty: that of the request

    bool operator==(const ObjectName&) const = default;
};

/// An object whose key is InstanceID.
struct ExtensionObject {
    const char* className = nullptr;
    std::string id;
    std::vector<ObjectProperty> properties;  ///< all but the key

    [[nodiscard]] ObjectName name() const { return {className, {{"InstanceID", id}}, {}}; }

    bool operator==(const ExtensionObject&) const = default;
};

// What is made belongs to the object manager. All throw Refusal when it refuses a part: an
// object with half its keys would be another one.

[[nodiscard]] CMPIObjectPath* makePath(const CMPIBroker* broker, const std::string& nameSpace,
                                       const ObjectName& name);

/// With what a property list, null for all properties, has. What is listed and not known is
/// null, and without a list it stays unset, which means the same.
[[nodiscard]] CMPIInstance* makeInstance(const CMPIBroker* broker, const std::string& nameSpace,
                                         const ExtensionObject& object, const char** properties);

}  // namespace ZR::DHCPClientExtensions
