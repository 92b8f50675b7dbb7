#include "CMPI/CMPIDHCPProtocolEndpoint.h"

#include <array>

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPProtocolEndpoint = loggerCategory;

namespace {

using Element = DHCPProtocolEndpoint;

constexpr std::array<FilterKey<Element>, 2> filterKeys{{
    {"SystemName", Element::FilterBySystemName, false},
    {"Name", Element::FilterByName, true},
}};

constexpr std::array<PathKey<Element>, 4> pathKeys{{
    {"SystemCreationClassName", &Element::getSystemCreationClassName, nullptr},
    {"SystemName", &Element::getSystemName, nullptr},
    {"CreationClassName", &Element::getCreationClassName, nullptr},
    {"Name", &Element::getName, nullptr},
}};

constexpr std::array<ElementProperty<Element>, 33> instanceProperties{{
    property<&Element::getCaption>("Caption"),
    property<&Element::getElementName>("ElementName"),
    dateTime<&Element::getInstallDate>("InstallDate"),
    property<&Element::getStatusDescriptions>("StatusDescriptions"),
    property<&Element::getHealthState>("HealthState"),
    property<&Element::getPrimaryStatus>("PrimaryStatus"),
    property<&Element::getDetailedStatus>("DetailedStatus"),
    property<&Element::getOperatingStatus>("OperatingStatus"),
    property<&Element::getCommunicationStatus>("CommunicationStatus"),
    property<&Element::getOtherEnabledState>("OtherEnabledState"),
    property<&Element::getRequestedState>("RequestedState"),
    property<&Element::getEnabledDefault>("EnabledDefault"),
    property<&Element::getAvailableRequestedStates>("AvailableRequestedStates"),
    property<&Element::getTransitioningToState>("TransitioningToState"),
    property<&Element::getSystemCreationClassName>("SystemCreationClassName"),
    property<&Element::getSystemName>("SystemName"),
    property<&Element::getCreationClassName>("CreationClassName"),
    property<&Element::getDescription>("Description"),
    property<&Element::getOperationalStatus>("OperationalStatus"),
    property<&Element::getEnabledState>("EnabledState"),
    dateTime<&Element::getTimeOfLastStateChange>("TimeOfLastStateChange"),
    property<&Element::getName>("Name"),
    property<&Element::getNameFormat>("NameFormat"),
    property<&Element::getProtocolIFType>("ProtocolIFType"),
    property<&Element::getOtherTypeDescription>("OtherTypeDescription"),
    property<&Element::getBroadcastResetSupported>("BroadcastResetSupported"),
    property<&Element::getClientState>("ClientState"),
    property<&Element::getRenewalTime>("RenewalTime"),
    property<&Element::getRebindingTime>("RebindingTime"),
    property<&Element::getLeaseTime>("LeaseTime"),
    dateTime<&Element::getLeaseObtained>("LeaseObtained"),
    dateTime<&Element::getLeaseExpires>("LeaseExpires"),
    property<&Element::getOptionsReceived>("OptionsReceived"),
}};

}  // namespace

const RowSource DHCPProtocolEndpointRow::trace{
    {"CMPI/CMPIDHCPProtocolEndpoint", loggerCMPIDHCPProtocolEndpoint},
    "~CMPIDHCPProtocolEndpoint",
    __LINE__};

const ElementClass<Element> DHCPProtocolEndpointRow::elementClass{filterKeys, pathKeys,
                                                                  instanceProperties};

template class ElementAdapter<DHCPProtocolEndpointRow>;

}  // namespace ZR::DHCPClientProvider
