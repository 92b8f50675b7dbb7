#pragma once

#include <string>
#include <utility>
#include <variant>
#include <vector>

#include "MachineFacts.h"

/// The four classes at the far ends as plain objects: keys and properties, without CMPI.
namespace ZR::DHCPClientNeighbours {

using PropertyValue = std::variant<std::string, unsigned short, std::vector<unsigned short>>;

struct NeighbourObject {
    std::string className;
    std::vector<std::pair<std::string, std::string>> keys;
    std::vector<std::pair<std::string, PropertyValue>> properties;  ///< beside the keys

    /// The value of a key; null when there is no such key. Names compare without
    /// regard to case.
    [[nodiscard]] const std::string* key(const std::string& name) const;

    bool operator==(const NeighbourObject&) const = default;
};

/// Whether a class is one of the four. Names compare without regard to case.
[[nodiscard]] bool isNeighbourClass(const std::string& className);

/// The objects of a class. For "QVXZR_ComputerSystem", `name` chooses the computer:
/// without one it is the host alone; the name of the service processor gives that,
/// in its own class, so that associations of its interfaces reach it.
[[nodiscard]] std::vector<NeighbourObject> objectsOf(const std::string& className,
                                                     const std::string& name);

}  // namespace ZR::DHCPClientNeighbours
