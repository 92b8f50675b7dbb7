#include "CMPI/CMPIDHCPSettingData.h"

#include <array>

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPSettingData = loggerCategory;

namespace {

using Element = DHCPSettingData;

constexpr std::array<FilterKey<Element>, 1> filterKeys{{
    {"InstanceID", Element::FilterByInstanceID, false},
}};

constexpr std::array<PathKey<Element>, 1> pathKeys{{
    {"InstanceID", &Element::getInstanceID, "instanceID"},
}};

constexpr std::array<ElementProperty<Element>, 9> instanceProperties{{
    property<&Element::getInstanceID>("InstanceID"),
    property<&Element::getElementName>("ElementName"),
    property<&Element::getAddressOrigin>("AddressOrigin"),
    property<&Element::getRequestedIPv4Address>("RequestedIPv4Address"),
    property<&Element::getClientIdentifier>("ClientIdentifier"),
    property<&Element::getVendorClassIdentifier>("VendorClassIdentifier"),
    property<&Element::getRequestedOptions>("RequestedOptions"),
    property<&Element::getRequestedLeaseTime>("RequestedLeaseTime"),
    // An interface without a configuration file has no such property.
    nonEmptyText<&Element::getConfigurationName>("ConfigurationName"),
}};

}  // namespace

const RowSource DHCPSettingDataRow::trace{
    {"CMPI/CMPIDHCPSettingData", loggerCMPIDHCPSettingData}, "~CMPIDHCPSettingData", __LINE__};

const ElementClass<Element> DHCPSettingDataRow::elementClass{filterKeys, pathKeys,
                                                             instanceProperties};

CMPIStatus DHCPSettingDataRow::modify(const Element& element, const CMPIInstance* newInstance) {
    if (newInstance == nullptr) {
        return {CMPI_RC_ERR_FAILED, nullptr};
    }
    // Absent, null or not a text: the name is empty, and is written as such.
    std::string name;
    ProviderUtilities::getProperty(newInstance, "ConfigurationName", name, false);
    return {element.setConfigurationName(name) ? CMPI_RC_OK : CMPI_RC_ERR_FAILED, nullptr};
}

template class ElementAdapter<DHCPSettingDataRow>;

}  // namespace ZR::DHCPClientProvider
