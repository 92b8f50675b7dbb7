#include "CMPI/CMPIDHCPRemoteServiceAccessPoint.h"

#include <array>

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPRemoteServiceAccessPoint = loggerCategory;

namespace {

using Element = DHCPRemoteServiceAccessPoint;

constexpr std::array<FilterKey<Element>, 2> filterKeys{{
    {"SystemName", Element::FilterBySystemName, true},
    {"Name", Element::FilterByName, true},
}};

constexpr std::array<PathKey<Element>, 4> pathKeys{{
    {"SystemCreationClassName", &Element::getSystemCreationClassName, nullptr},
    {"SystemName", &Element::getSystemName, nullptr},
    {"CreationClassName", &Element::getCreationClassName, nullptr},
    {"Name", &Element::getName, nullptr},
}};

constexpr std::array<ElementProperty<Element>, 9> instanceProperties{{
    property<&Element::getElementName>("ElementName"),
    property<&Element::getAccessInfo>("AccessInfo"),
    property<&Element::getOtherAccessContext>("OtherAccessContext"),
    property<&Element::getInfoFormat>("InfoFormat"),
    property<&Element::getAccessContext>("AccessContext"),
    property<&Element::getSystemCreationClassName>("SystemCreationClassName"),
    property<&Element::getSystemName>("SystemName"),
    property<&Element::getCreationClassName>("CreationClassName"),
    property<&Element::getName>("Name"),
}};

}  // namespace

const RowSource DHCPRemoteServiceAccessPointRow::trace{
    {"CMPI/CMPIDHCPRemoteServiceAccessPoint", loggerCMPIDHCPRemoteServiceAccessPoint},
    "~CMPIDHCPRemoteServiceAccessPoint",
    __LINE__};

const ElementClass<Element> DHCPRemoteServiceAccessPointRow::elementClass{filterKeys, pathKeys,
                                                                          instanceProperties};

template class ElementAdapter<DHCPRemoteServiceAccessPointRow>;

}  // namespace ZR::DHCPClientProvider
