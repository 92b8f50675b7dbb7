#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/Forward.h"

namespace cimom {

/// The namespace in which clients find out what an object manager can do.
inline constexpr std::string_view interopNameSpace = "root/interop";

/// A way in which clients reach the object manager. Numbers are those of the properties of
/// CIM_ObjectManagerCommunicationMechanism.
struct CommunicationMechanism {
    std::string name;  ///< no other mechanism has it
    std::string description;
    std::uint16_t protocol = 0;
    std::string version;                         ///< of the protocol
    std::vector<std::uint16_t> operations;       ///< FunctionalProfilesSupported
    std::vector<std::uint16_t> authentications;  ///< AuthenticationMechanismsSupported
};

/// How the object manager tells of itself.
struct InteropSettings {
    std::string elementName;  ///< what people call it
    std::string version;      ///< begins with a digit, without blanks
    std::vector<CommunicationMechanism> mechanisms;
};

/// Values of properties that are the same wherever the object manager or one of its services
/// is named: the keys of CIM_ObjectManager.
struct ManagerIdentity {
    std::string systemClass;  ///< SystemCreationClassName
    std::string system;       ///< SystemName
    std::string name;         ///< Name

    explicit ManagerIdentity(const ObjectManager& manager);
};

/// Has the manager serve CIM_ObjectManager, CIM_Namespace,
/// CIM_ObjectManagerCommunicationMechanism and their associations in the interop namespace,
/// and __Namespace in every namespace that there is now. The manager is borrowed by what it
/// then owns. Throws what ObjectManager::serve throws.
void serveInterop(ObjectManager& manager, const InteropSettings& settings);

}  // namespace cimom
