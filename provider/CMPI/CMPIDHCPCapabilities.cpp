#include "CMPI/CMPIDHCPCapabilities.h"

#include <utility>

#include "CMPI/ElementAdapter.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPCapabilities = loggerCategory;

namespace {

using Element = DHCPCapabilities;

const TraceSource source{"CMPI/CMPIDHCPCapabilities", loggerCMPIDHCPCapabilities};

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

CMPIDHCPCapabilities::CMPIDHCPCapabilities(const CMPIBroker* broker, const CMPIContext* context,
                                           std::string nameSpace)
    : _broker(broker), _context(context), _namespace(std::move(nameSpace)) {
    traceMethod(ZR_HERE);
}

CMPIDHCPCapabilities::CMPIDHCPCapabilities(const CMPIBroker* broker, const CMPIContext* context,
                                           const CMPIObjectPath* objectPath)
    : _broker(broker), _context(context), _namespace(ProviderUtilities::getNamespace(objectPath)) {
    const ParameterScope scope(ZR_HERE, " _broker=", _broker, " _context=", _context,
                               " objectPath=", objectPath);
    setObjectPath(objectPath);
}

CMPIDHCPCapabilities::~CMPIDHCPCapabilities() {
    traceMethod(ZR_HERE);
}

void CMPIDHCPCapabilities::setObjectPath(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    filterByKeys(element_, objectPath, filterKeys, ZR_HERE);
}

CMPIDHCPCapabilities::operator bool() {
    traceMethod(ZR_HERE);
    return static_cast<bool>(element_);
}

void CMPIDHCPCapabilities::operator++() {
    traceMethod(ZR_HERE);
    ++element_;
}

CMPIObjectPath* CMPIDHCPCapabilities::getObjectPath() const {
    const TraceScope scope(ZR_HERE);
    return makeObjectPath(_broker, "QVXZR_DHCPCapabilities", _namespace, element_, pathKeys,
                          ZR_HERE);
}

CMPIInstance* CMPIDHCPCapabilities::getCMPIInstance(const char** properties) const {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return makeInstance(_broker, getObjectPath(), element_, instanceProperties);
}

}  // namespace ZR::DHCPClientProvider
