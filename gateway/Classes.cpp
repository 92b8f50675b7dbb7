#include "Classes.h"

#include <algorithm>
#include <array>

#include "zrcommon/Strings.h"

namespace ZR::DHCPClientGateway {

namespace {

// A test compares ancestors, keys and properties with the schema.

constexpr std::array computerAncestors{"CIM_ComputerSystem",        "CIM_System",
                                       "CIM_EnabledLogicalElement", "CIM_LogicalElement",
                                       "CIM_ManagedSystemElement",  "CIM_ManagedElement"};
constexpr std::array ipEndpointAncestors{"CIM_IPProtocolEndpoint", "CIM_ProtocolEndpoint",
                                         "CIM_ServiceAccessPoint", "CIM_EnabledLogicalElement",
                                         "CIM_LogicalElement",     "CIM_ManagedSystemElement",
                                         "CIM_ManagedElement"};
constexpr std::array endpointAncestors{"CIM_DHCPProtocolEndpoint", "CIM_ProtocolEndpoint",
                                       "CIM_ServiceAccessPoint",   "CIM_EnabledLogicalElement",
                                       "CIM_LogicalElement",       "CIM_ManagedSystemElement",
                                       "CIM_ManagedElement"};
constexpr std::array accessPointAncestors{"CIM_RemoteServiceAccessPoint", "CIM_ServiceAccessPoint",
                                          "CIM_EnabledLogicalElement",    "CIM_LogicalElement",
                                          "CIM_ManagedSystemElement",     "CIM_ManagedElement"};
constexpr std::array assignmentAncestors{"CIM_IPAssignmentSettingData", "CIM_SettingData",
                                         "CIM_ManagedElement"};
constexpr std::array settingAncestors{"CIM_DHCPSettingData", "CIM_IPAssignmentSettingData",
                                      "CIM_SettingData", "CIM_ManagedElement"};
constexpr std::array capabilitiesAncestors{"CIM_DHCPCapabilities",
                                           "CIM_EnabledLogicalElementCapabilities",
                                           "CIM_Capabilities", "CIM_ManagedElement"};
constexpr std::array hostedAncestors{"CIM_HostedAccessPoint", "CIM_HostedDependency",
                                     "CIM_Dependency"};
constexpr std::array sapDependencyAncestors{"CIM_SAPSAPDependency", "CIM_Dependency"};
constexpr std::array elementCapabilitiesAncestors{"CIM_ElementCapabilities"};
constexpr std::array availableAncestors{"CIM_RemoteAccessAvailableToElement", "CIM_Dependency"};
constexpr std::array elementSettingAncestors{"CIM_ElementSettingData"};
constexpr std::array orderedAncestors{"CIM_OrderedComponent", "CIM_Component"};

constexpr std::array computerKeys{"CreationClassName", "Name"};
constexpr std::array accessPointKeys{"SystemCreationClassName", "SystemName", "CreationClassName",
                                     "Name"};
constexpr std::array settingKeys{"InstanceID"};
constexpr std::array dependencyKeys{"Antecedent", "Dependent"};
constexpr std::array elementCapabilitiesKeys{"ManagedElement", "Capabilities"};
constexpr std::array elementSettingKeys{"ManagedElement", "SettingData"};
constexpr std::array componentKeys{"GroupComponent", "PartComponent"};

constexpr std::array<Property, 36> endpointProperties{{
    {"InstanceID", CMPI_string, Presence::never},
    {"Caption", CMPI_string, Presence::never},
    {"Description", CMPI_string, Presence::always},
    {"ElementName", CMPI_string, Presence::always},
    {"InstallDate", CMPI_dateTime, Presence::never},
    {"Name", CMPI_string, Presence::always},
    {"OperationalStatus", CMPI_uint16A, Presence::never},
    {"StatusDescriptions", CMPI_stringA, Presence::never},
    {"Status", CMPI_string, Presence::never},
    {"HealthState", CMPI_uint16, Presence::never},
    {"CommunicationStatus", CMPI_uint16, Presence::never},
    {"DetailedStatus", CMPI_uint16, Presence::never},
    {"OperatingStatus", CMPI_uint16, Presence::never},
    {"PrimaryStatus", CMPI_uint16, Presence::never},
    {"EnabledState", CMPI_uint16, Presence::always, 5},
    {"OtherEnabledState", CMPI_string, Presence::never},
    {"RequestedState", CMPI_uint16, Presence::always, 12},
    {"EnabledDefault", CMPI_uint16, Presence::never, 2},
    {"TimeOfLastStateChange", CMPI_dateTime, Presence::never},
    {"AvailableRequestedStates", CMPI_uint16A, Presence::never},
    {"TransitioningToState", CMPI_uint16, Presence::never, 12},
    {"SystemCreationClassName", CMPI_string, Presence::always},
    {"SystemName", CMPI_string, Presence::sometimes},
    {"CreationClassName", CMPI_string, Presence::always},
    {"NameFormat", CMPI_string, Presence::always},
    {"ProtocolType", CMPI_uint16, Presence::never},
    {"ProtocolIFType", CMPI_uint16, Presence::always},
    {"OtherTypeDescription", CMPI_string, Presence::always},
    {"ClientState", CMPI_uint16, Presence::always},
    {"RenewalTime", CMPI_uint32, Presence::never},
    {"RebindingTime", CMPI_uint32, Presence::never},
    {"LeaseTime", CMPI_uint32, Presence::never},
    {"LeaseObtained", CMPI_dateTime, Presence::never},
    {"LeaseExpires", CMPI_dateTime, Presence::never},
    {"OptionsReceived", CMPI_uint16A, Presence::always},
    {"BroadcastResetSupported", CMPI_boolean, Presence::never},
}};

constexpr std::array<Property, 11> capabilitiesProperties{{
    {"InstanceID", CMPI_string, Presence::always},
    {"Caption", CMPI_string, Presence::never},
    {"Description", CMPI_string, Presence::never},
    {"ElementName", CMPI_string, Presence::always},
    {"ElementNameEditSupported", CMPI_boolean, Presence::sometimes},
    {"MaxElementNameLen", CMPI_uint16, Presence::sometimes},
    {"RequestedStatesSupported", CMPI_uint16A, Presence::never},
    {"ElementNameMask", CMPI_string, Presence::never},
    {"OptionsSupported", CMPI_uint16A, Presence::always},
    {"IPv6OptionsSupported", CMPI_uint16A, Presence::never},
    {"StateAwareness", CMPI_uint16A, Presence::never},
}};

constexpr std::array<Property, 14> settingProperties{{
    {"InstanceID", CMPI_string, Presence::always},
    {"Caption", CMPI_string, Presence::never},
    {"Description", CMPI_string, Presence::never},
    {"ElementName", CMPI_string, Presence::always},
    {"ChangeableType", CMPI_uint16, Presence::never},
    {"ConfigurationName", CMPI_string, Presence::sometimes},
    {"AddressOrigin", CMPI_uint16, Presence::always, 0},
    {"ProtocolIFType", CMPI_uint16, Presence::never},
    {"RequestedIPv4Address", CMPI_string, Presence::sometimes},
    {"RequestedLeaseTime", CMPI_uint32, Presence::never},
    {"ClientIdentifier", CMPI_string, Presence::never},
    {"VendorClassIdentifier", CMPI_string, Presence::never},
    {"RequestedOptions", CMPI_uint16A, Presence::never},
    {"RequiredOptions", CMPI_uint16A, Presence::never},
}};

constexpr std::array<Property, 29> accessPointProperties{{
    {"InstanceID", CMPI_string, Presence::never},
    {"Caption", CMPI_string, Presence::never},
    {"Description", CMPI_string, Presence::never},
    {"ElementName", CMPI_string, Presence::always},
    {"InstallDate", CMPI_dateTime, Presence::never},
    {"Name", CMPI_string, Presence::always},
    {"OperationalStatus", CMPI_uint16A, Presence::never},
    {"StatusDescriptions", CMPI_stringA, Presence::never},
    {"Status", CMPI_string, Presence::never},
    {"HealthState", CMPI_uint16, Presence::never},
    {"CommunicationStatus", CMPI_uint16, Presence::never},
    {"DetailedStatus", CMPI_uint16, Presence::never},
    {"OperatingStatus", CMPI_uint16, Presence::never},
    {"PrimaryStatus", CMPI_uint16, Presence::never},
    {"EnabledState", CMPI_uint16, Presence::never, 5},
    {"OtherEnabledState", CMPI_string, Presence::never},
    {"RequestedState", CMPI_uint16, Presence::never, 12},
    {"EnabledDefault", CMPI_uint16, Presence::never, 2},
    {"TimeOfLastStateChange", CMPI_dateTime, Presence::never},
    {"AvailableRequestedStates", CMPI_uint16A, Presence::never},
    {"TransitioningToState", CMPI_uint16, Presence::never, 12},
    {"SystemCreationClassName", CMPI_string, Presence::always},
    {"SystemName", CMPI_string, Presence::sometimes},
    {"CreationClassName", CMPI_string, Presence::always},
    {"AccessInfo", CMPI_string, Presence::sometimes},
    {"InfoFormat", CMPI_uint16, Presence::always},
    {"OtherInfoFormatDescription", CMPI_string, Presence::never},
    {"AccessContext", CMPI_uint16, Presence::always, 0},
    {"OtherAccessContext", CMPI_string, Presence::never},
}};

constexpr std::array<Property, 2> dependencyProperties{{
    {"Antecedent", CMPI_ref, Presence::always},
    {"Dependent", CMPI_ref, Presence::always},
}};

constexpr std::array<Property, 3> elementCapabilitiesProperties{{
    {"ManagedElement", CMPI_ref, Presence::always},
    {"Capabilities", CMPI_ref, Presence::always},
    {"Characteristics", CMPI_uint16A, Presence::never},
}};

constexpr std::array<Property, 4> availableProperties{{
    {"Antecedent", CMPI_ref, Presence::always},
    {"Dependent", CMPI_ref, Presence::always},
    {"IsDefault", CMPI_boolean, Presence::never},
    {"OrderOfAccess", CMPI_uint16, Presence::always, 0},
}};

constexpr std::array<Property, 5> elementSettingProperties{{
    {"ManagedElement", CMPI_ref, Presence::always},
    {"SettingData", CMPI_ref, Presence::always},
    {"IsDefault", CMPI_uint16, Presence::never},
    {"IsCurrent", CMPI_uint16, Presence::always},
    {"IsNext", CMPI_uint16, Presence::never},
}};

constexpr std::array<Property, 3> orderedProperties{{
    {"GroupComponent", CMPI_ref, Presence::always},
    {"PartComponent", CMPI_ref, Presence::always},
    {"AssignedSequence", CMPI_uint64, Presence::always},
}};

constexpr std::array<ServedClass, 15> classes{{
    {.name = "QVXZR_ComputerSystem",
     .ancestors = computerAncestors,
     .keys = computerKeys,
     .server = Server::otherwise,
     .properties = {}},
    {.name = "QVXZR_SPComputerSystem",
     .ancestors = computerAncestors,
     .keys = computerKeys,
     .server = Server::otherwise,
     .properties = {}},
    {.name = "QVXZR_IPProtocolEndpoint",
     .ancestors = ipEndpointAncestors,
     .keys = accessPointKeys,
     .server = Server::otherwise,
     .properties = {}},
    {.name = "QVXZR_IPAssignmentSettingData",
     .ancestors = assignmentAncestors,
     .keys = settingKeys,
     .server = Server::otherwise,
     .properties = {}},
    {.name = "QVXZR_DHCPProtocolEndpoint",
     .ancestors = endpointAncestors,
     .keys = accessPointKeys,
     .server = Server::exact,
     .properties = endpointProperties,
     .narrowsBy = "Name"},
    {.name = "QVXZR_DHCPCapabilities",
     .ancestors = capabilitiesAncestors,
     .keys = settingKeys,
     .server = Server::exact,
     .properties = capabilitiesProperties,
     .narrowsBy = "InstanceID"},
    {.name = "QVXZR_DHCPSettingData",
     .ancestors = settingAncestors,
     .keys = settingKeys,
     .server = Server::exact,
     .properties = settingProperties,
     .narrowsBy = "InstanceID",
     .writable = "ConfigurationName"},
    // Asked for one, the exact provider tells the servers of another interface with it.
    {.name = "QVXZR_DHCPRemoteServiceAccessPoint",
     .ancestors = accessPointAncestors,
     .keys = accessPointKeys,
     .server = Server::exact,
     .properties = accessPointProperties},
    {.name = "QVXZR_DHCPElementCapabilities",
     .ancestors = elementCapabilitiesAncestors,
     .keys = elementCapabilitiesKeys,
     .server = Server::gateway,
     .properties = elementCapabilitiesProperties},
    {.name = "QVXZR_HostedDHCPPoint",
     .ancestors = hostedAncestors,
     .keys = dependencyKeys,
     .server = Server::gateway,
     .properties = dependencyProperties},
    {.name = "QVXZR_DHCPRemoteHostedAccessPoint",
     .ancestors = hostedAncestors,
     .keys = dependencyKeys,
     .server = Server::gateway,
     .properties = dependencyProperties},
    {.name = "QVXZR_SAPSAPDependency",
     .ancestors = sapDependencyAncestors,
     .keys = dependencyKeys,
     .server = Server::gateway,
     .properties = dependencyProperties},
    {.name = "QVXZR_DHCPOrderedComponent",
     .ancestors = orderedAncestors,
     .keys = componentKeys,
     .server = Server::gateway,
     .properties = orderedProperties},
    {.name = "QVXZR_DHCPRemoteAccessAvailableToElement",
     .ancestors = availableAncestors,
     .keys = dependencyKeys,
     .server = Server::gateway,
     .properties = availableProperties},
    {.name = "QVXZR_DHCPElementSettingData",
     .ancestors = elementSettingAncestors,
     .keys = elementSettingKeys,
     .server = Server::gateway,
     .properties = elementSettingProperties},
}};

}  // namespace

std::span<const ServedClass> allClasses() noexcept {
    return classes;
}

const ServedClass* findClass(std::string_view name) noexcept {
    const auto* found =
        std::find_if(classes.begin(), classes.end(),
                     [name](const ServedClass& each) { return equalNames(each.name, name); });
    return found == classes.end() ? nullptr : found;
}

bool derivesFrom(const ServedClass& served, std::string_view name) noexcept {
    return equalNames(served.name, name) ||
           std::any_of(served.ancestors.begin(), served.ancestors.end(),
                       [name](const char* ancestor) { return equalNames(ancestor, name); });
}

}  // namespace ZR::DHCPClientGateway
