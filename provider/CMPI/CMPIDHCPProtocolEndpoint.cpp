#include "CMPI/CMPIDHCPProtocolEndpoint.h"

#include <utility>

#include "CMPI/ElementAdapter.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPProtocolEndpoint = loggerCategory;

namespace {

using Element = DHCPProtocolEndpoint;

const TraceSource source{"CMPI/CMPIDHCPProtocolEndpoint", loggerCMPIDHCPProtocolEndpoint};

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

CMPIDHCPProtocolEndpoint::CMPIDHCPProtocolEndpoint(const CMPIBroker* broker,
                                                   const CMPIContext* context,
                                                   std::string nameSpace)
    : _broker(broker), _context(context), _namespace(std::move(nameSpace)) {
    traceMethod(ZR_HERE);
}

CMPIDHCPProtocolEndpoint::CMPIDHCPProtocolEndpoint(const CMPIBroker* broker,
                                                   const CMPIContext* context,
                                                   const CMPIObjectPath* objectPath)
    : _broker(broker), _context(context), _namespace(ProviderUtilities::getNamespace(objectPath)) {
    const ParameterScope scope(ZR_HERE, " _broker=", _broker, " _context=", _context,
                               " objectPath=", objectPath);
    setObjectPath(objectPath);
}

CMPIDHCPProtocolEndpoint::~CMPIDHCPProtocolEndpoint() {
    traceMethod(ZR_HERE);
}

void CMPIDHCPProtocolEndpoint::setObjectPath(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    filterByKeys(element_, objectPath, filterKeys, ZR_HERE);
}

CMPIDHCPProtocolEndpoint::operator bool() {
    traceMethod(ZR_HERE);
    return static_cast<bool>(element_);
}

void CMPIDHCPProtocolEndpoint::operator++() {
    traceMethod(ZR_HERE);
    ++element_;
}

CMPIObjectPath* CMPIDHCPProtocolEndpoint::getObjectPath() const {
    const TraceScope scope(ZR_HERE);
    return makeObjectPath(_broker, "QVXZR_DHCPProtocolEndpoint", _namespace, element_, pathKeys,
                          ZR_HERE);
}

CMPIInstance* CMPIDHCPProtocolEndpoint::getCMPIInstance(const char** properties) const {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return makeInstance(_broker, getObjectPath(), element_, instanceProperties);
}

}  // namespace ZR::DHCPClientProvider
