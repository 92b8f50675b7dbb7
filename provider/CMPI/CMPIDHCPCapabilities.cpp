#include "CMPI/CMPIDHCPCapabilities.h"

#include <array>

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPCapabilities = loggerCategory;

namespace {

using Element = DHCPCapabilities;

constexpr std::array<FilterKey<Element>, 1> filterKeys{{
    {"InstanceID", Element::FilterByInstanceID, false},
}};

constexpr std::array<PathKey<Element>, 1> pathKeys{{
    {"InstanceID", &Element::getInstanceID, "instanceID"},
}};

constexpr std::array<ElementProperty<Element>, 8> instanceProperties{{
    property<&Element::getInstanceID>("InstanceID"),
    property<&Element::getElementName>("ElementName"),
    property<&Element::getElementNameEditSupported>("ElementNameEditSupported"),
    property<&Element::getMaxElementNameLen>("MaxElementNameLen"),
    property<&Element::getRequestedStatesSupported>("RequestedStatesSupported"),
    property<&Element::getElementNameMask>("ElementNameMask"),
    property<&Element::getStateAwareness>("StateAwareness"),
    property<&Element::getOptionsSupported>("OptionsSupported"),
}};

}  // namespace

const RowSource DHCPCapabilitiesRow::trace{
    {"CMPI/CMPIDHCPCapabilities", loggerCMPIDHCPCapabilities}, "~CMPIDHCPCapabilities", __LINE__};

const ElementClass<Element> DHCPCapabilitiesRow::elementClass{filterKeys, pathKeys,
                                                              instanceProperties};

template class ElementAdapter<DHCPCapabilitiesRow>;

}  // namespace ZR::DHCPClientProvider
