#include "CMPI/CMPIDHCPSettingData.h"

#include <utility>

#include "CMPI/ElementAdapter.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPSettingData = loggerCategory;

namespace {

using Element = DHCPSettingData;

const TraceSource source{"CMPI/CMPIDHCPSettingData", loggerCMPIDHCPSettingData};

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

CMPIDHCPSettingData::CMPIDHCPSettingData(const CMPIBroker* broker, const CMPIContext* context,
                                         std::string nameSpace)
    : _broker(broker), _context(context), _namespace(std::move(nameSpace)) {
    traceMethod(ZR_HERE);
}

CMPIDHCPSettingData::CMPIDHCPSettingData(const CMPIBroker* broker, const CMPIContext* context,
                                         const CMPIObjectPath* objectPath)
    : _broker(broker), _context(context), _namespace(ProviderUtilities::getNamespace(objectPath)) {
    const ParameterScope scope(ZR_HERE, " _broker=", _broker, " _context=", _context,
                               " objectPath=", objectPath);
    setObjectPath(objectPath);
}

CMPIDHCPSettingData::~CMPIDHCPSettingData() {
    traceMethod(ZR_HERE);
}

void CMPIDHCPSettingData::setObjectPath(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    filterByKeys(element_, objectPath, filterKeys, ZR_HERE);
}

CMPIDHCPSettingData::operator bool() const {
    traceMethod(ZR_HERE);
    return static_cast<bool>(element_);
}

void CMPIDHCPSettingData::operator++() {
    traceMethod(ZR_HERE);
    ++element_;
}

CMPIObjectPath* CMPIDHCPSettingData::getObjectPath() const {
    const TraceScope scope(ZR_HERE);
    return makeObjectPath(_broker, "QVXZR_DHCPSettingData", _namespace, element_, pathKeys,
                          ZR_HERE);
}

CMPIInstance* CMPIDHCPSettingData::getCMPIInstance(const char** properties) const {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return makeInstance(_broker, getObjectPath(), element_, instanceProperties);
}

CMPIStatus CMPIDHCPSettingData::modifyInstance(const CMPIInstance* newInstance) {
    const ParameterScope scope(ZR_HERE, " newInstance=", newInstance);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    if (newInstance == nullptr) {
        status.rc = CMPI_RC_ERR_FAILED;
        return status;
    }
    // Absent, null or no text: the name is empty, and is written as such.
    std::string name;
    ProviderUtilities::getProperty(newInstance, "ConfigurationName", name, false);
    if (!element_.setConfigurationName(name)) {
        status.rc = CMPI_RC_ERR_FAILED;
    }
    return status;
}

}  // namespace ZR::DHCPClientProvider
