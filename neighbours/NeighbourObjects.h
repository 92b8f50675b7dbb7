#pragma once

#include <span>
#include <string>
#include <utility>
#include <variant>
#include <vector>

#include "MachineFacts.h"

/// The four classes at the far ends as plain objects: keys and properties, without CMPI.
namespace ZR::DHCPClientNeighbours {

/// std::monostate is the null of a number: what is not known of an object, and would show
/// the default of the schema in some object managers if it stayed unset.
using PropertyValue =
    std::variant<std::monostate, std::string, unsigned short, std::vector<unsigned short>>;

struct NeighbourObject {
    std::string className;
    std::vector<std::pair<std::string, std::string>> keys;
    std::vector<std::pair<std::string, PropertyValue>> properties;  ///< beside the keys

    bool operator==(const NeighbourObject&) const = default;
};

/// Whether a class is one of the four. Names compare without regard to case.
[[nodiscard]] bool isNeighbourClass(const std::string& className);

/// The names of the keys of a class; empty for any other.
[[nodiscard]] std::span<const char* const> keysOf(const std::string& className);

/// The objects of a class. For "QVXZR_ComputerSystem", `name` chooses the computer:
/// without one it is the host alone; the name of the service processor gives that,
/// in its own class, so that associations of its interfaces reach it.
[[nodiscard]] std::vector<NeighbourObject> objectsOf(const std::string& className,
                                                     const std::string& name);

}  // namespace ZR::DHCPClientNeighbours
