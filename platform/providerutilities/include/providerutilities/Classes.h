#pragma once

#include <array>

/// The classes of the numbering that all providers of the platform share.
namespace ZR::Classes {

struct Class {
    unsigned short id;
    const char* name;
    const char* standardName;  ///< the class of the standard that it serves
};

inline constexpr Class computerSystem{1, "QVXZR_ComputerSystem", "CIM_ComputerSystem"};
inline constexpr Class dhcpProtocolEndpoint{4, "QVXZR_DHCPProtocolEndpoint",
                                            "CIM_DHCPProtocolEndpoint"};
inline constexpr Class dhcpCapabilities{5, "QVXZR_DHCPCapabilities", "CIM_DHCPCapabilities"};
inline constexpr Class dhcpElementCapabilities{6, "QVXZR_DHCPElementCapabilities",
                                               "CIM_ElementCapabilities"};
inline constexpr Class sapSapDependency{8, "QVXZR_SAPSAPDependency", "CIM_SAPSAPDependency"};
inline constexpr Class ipProtocolEndpoint{9, "QVXZR_IPProtocolEndpoint", "CIM_IPProtocolEndpoint"};
inline constexpr Class hostedDHCPPoint{34, "QVXZR_HostedDHCPPoint", "CIM_HostedAccessPoint"};
inline constexpr Class ipAssignmentSettingData{66, "QVXZR_IPAssignmentSettingData",
                                               "CIM_IPAssignmentSettingData"};
inline constexpr Class dhcpRemoteServiceAccessPoint{82, "QVXZR_DHCPRemoteServiceAccessPoint",
                                                    "CIM_RemoteServiceAccessPoint"};
inline constexpr Class dhcpRemoteAccessAvailableToElement{
    83, "QVXZR_DHCPRemoteAccessAvailableToElement", "CIM_RemoteAccessAvailableToElement"};
inline constexpr Class dhcpRemoteHostedAccessPoint{84, "QVXZR_DHCPRemoteHostedAccessPoint",
                                                   "CIM_HostedAccessPoint"};
inline constexpr Class dhcpSettingData{85, "QVXZR_DHCPSettingData", "CIM_DHCPSettingData"};
inline constexpr Class dhcpElementSettingData{86, "QVXZR_DHCPElementSettingData",
                                              "CIM_ElementSettingData"};
inline constexpr Class dhcpOrderedComponent{87, "QVXZR_DHCPOrderedComponent",
                                            "CIM_OrderedComponent"};

inline constexpr std::array all{
    computerSystem,
    dhcpProtocolEndpoint,
    dhcpCapabilities,
    dhcpElementCapabilities,
    sapSapDependency,
    ipProtocolEndpoint,
    hostedDHCPPoint,
    ipAssignmentSettingData,
    dhcpRemoteServiceAccessPoint,
    dhcpRemoteAccessAvailableToElement,
    dhcpRemoteHostedAccessPoint,
    dhcpSettingData,
    dhcpElementSettingData,
    dhcpOrderedComponent,
};

}  // namespace ZR::Classes
