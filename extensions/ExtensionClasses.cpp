#include "ExtensionClasses.h"

#include <algorithm>
#include <utility>

#include "MachineObjects.h"
#include "ProfileObjects.h"
#include "providerutilities/Classes.h"
#include "zrcommon/Strings.h"

namespace ZR::DHCPClientExtensions {

namespace {

// A test compares ancestors, keys and roles with the schema.

constexpr std::array elementAncestors{"CIM_ManagedElement"};
constexpr std::array endpointAncestors{"CIM_DHCPProtocolEndpoint", "CIM_ProtocolEndpoint",
                                       "CIM_ServiceAccessPoint",   "CIM_EnabledLogicalElement",
                                       "CIM_LogicalElement",       "CIM_ManagedSystemElement",
                                       "CIM_ManagedElement"};
constexpr std::array dependencyAncestors{"CIM_Dependency"};
constexpr std::array profileAncestors{"CIM_RegisteredProfile", "CIM_RegisteredSpecification",
                                      "CIM_ManagedElement"};
constexpr std::array conformsAncestors{"CIM_ElementConformsToProfile"};

constexpr std::array elementKeys{"InstanceID"};
constexpr std::array endpointKeys{"SystemCreationClassName", "SystemName", "CreationClassName",
                                  "Name"};

constexpr const char* endpointClass = Classes::dhcpProtocolEndpoint.name;

constexpr std::array<ElementClass, 5> elements{{
    {"QVXZR_DHCPLease", elementAncestors, elementKeys, &leaseObjects},
    {"QVXZR_DHCPInterface", elementAncestors, elementKeys, &interfaceObjects},
    {"QVXZR_DHCPDiagnostic", elementAncestors, elementKeys, &diagnosticObjects},
    {profileClass, profileAncestors, elementKeys, &profileObjects},
    {endpointClass, endpointAncestors, endpointKeys, nullptr, &endpointNames},
}};

std::vector<Link> leaseLinks(const Request& request) {
    std::vector<Link> links;
    for (LeaseAndEndpoint& pair : leasesOfEndpoints(*request.machine)) {
        links.push_back({std::move(pair.endpoint), std::move(pair.lease)});
    }
    return links;
}

constexpr std::array<AssociationClass, 2> associations{{
    {"QVXZR_DHCPLeaseOfEndpoint",
     dependencyAncestors,
     {"Antecedent", "Dependent"},
     {endpointClass, "QVXZR_DHCPLease"},
     &leaseLinks},
    {"QVXZR_DHCPClientConformsToProfile",
     conformsAncestors,
     {"ConformantStandard", "ManagedElement"},
     {profileClass, endpointClass},
     &profileLinks},
}};

template <typename Class>
const Class* findIn(std::span<const Class> classes, std::string_view name) noexcept {
    const auto found = std::find_if(classes.begin(), classes.end(), [name](const Class& each) {
        return equalNames(each.name, name);
    });
    return found == classes.end() ? nullptr : &*found;
}

}  // namespace

std::span<const ElementClass> elementClasses() noexcept {
    return elements;
}

std::span<const AssociationClass> associationClasses() noexcept {
    return associations;
}

const ElementClass* findElement(std::string_view name) noexcept {
    return findIn(elementClasses(), name);
}

const AssociationClass* findAssociation(std::string_view name) noexcept {
    return findIn(associationClasses(), name);
}

std::vector<ObjectName> namesOf(const ElementClass& served, const Snapshot& machine) {
    if (served.objects == nullptr) {
        return served.names(machine);
    }
    std::vector<ObjectName> names;
    for (const ExtensionObject& object : served.objects(machine)) {
        names.push_back(object.name());
    }
    return names;
}

}  // namespace ZR::DHCPClientExtensions
