#include "CMPI/CMPIDHCPRemoteAccessAvailableToElement.h"

#include "CMPI/AssociationAdapter.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPRemoteAccessAvailableToElement = loggerCategory;

namespace {

const TraceSource source{"CMPI/CMPIDHCPRemoteAccessAvailableToElement",
                         loggerCMPIDHCPRemoteAccessAvailableToElement};

constexpr AssociationEnds ends{
    "QVXZR_DHCPRemoteAccessAvailableToElement",
    83,
    {"Antecedent", 82, "QVXZR_DHCPRemoteServiceAccessPoint", "CIM_RemoteServiceAccessPoint"},
    {"Dependent", 4, "QVXZR_DHCPProtocolEndpoint", "CIM_DHCPProtocolEndpoint"},
};

constexpr std::array<ElementProperty<DHCPRemoteAccessAvailableToElement>, 1> ownProperties{{
    property<&DHCPRemoteAccessAvailableToElement::getOrderOfAccess>("OrderOfAccess"),
}};

}  // namespace

CMPIDHCPRemoteAccessAvailableToElement::CMPIDHCPRemoteAccessAvailableToElement(
    const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* objectPath)
    : _broker(broker),
      _context(context),
      _namespace(ProviderUtilities::getNamespace(objectPath)),
      requestedClassId_(ProviderUtilities::getClassId(objectPath)),
      accessPoint_(broker, context, _namespace),
      endpoint_(broker, context, _namespace) {
    const ParameterScope scope(ZR_HERE, " _broker=", _broker, " _context=", _context,
                               " objectPath=", objectPath);
    traceVariable(ZR_HERE, "requestedClassId", static_cast<unsigned>(requestedClassId_));
    switch (ends.sourceOf(requestedClassId_)) {
        case Source::first:
            endpoint_.setObjectPath(locateDHCPEndptPath(objectPath));
            accessPoint_.setObjectPath(objectPath);
            break;
        case Source::second:
            accessPoint_.setObjectPath(locateRemoteSAP(objectPath));
            endpoint_.setObjectPath(objectPath);
            break;
        case Source::association:
            if (accessPoint_) {
                endpoint_.setObjectPath(locateDHCPEndptPath(accessPoint_.getObjectPath()));
            }
            break;
        case Source::none:
            break;
    }
}

CMPIDHCPRemoteAccessAvailableToElement::~CMPIDHCPRemoteAccessAvailableToElement() {
    traceMethod(ZR_HERE);
}

CMPIDHCPRemoteAccessAvailableToElement::operator bool() {
    traceMethod(ZR_HERE);
    return stands(ends.sourceOf(requestedClassId_), accessPoint_, endpoint_, accessPoint_);
}

void CMPIDHCPRemoteAccessAvailableToElement::operator++() {
    traceMethod(ZR_HERE);
    step(ends.sourceOf(requestedClassId_), accessPoint_, endpoint_, accessPoint_);
}

bool CMPIDHCPRemoteAccessAvailableToElement::isNotTargetClass(const char* resultClass) const {
    const ParameterScope scope(ZR_HERE, " resultClass=", resultClass);
    return ends.isNotTarget(requestedClassId_, resultClass);
}

CMPIObjectPath* CMPIDHCPRemoteAccessAvailableToElement::getAssociatorNames() {
    const TraceScope scope(ZR_HERE);
    return farPath(ends.sourceOf(requestedClassId_), accessPoint_, endpoint_);
}

CMPIInstance* CMPIDHCPRemoteAccessAvailableToElement::getAssociator(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return farInstance(ends.sourceOf(requestedClassId_), accessPoint_, endpoint_, properties);
}

CMPIObjectPath* CMPIDHCPRemoteAccessAvailableToElement::getObjectPath() {
    const TraceScope scope(ZR_HERE);
    CMPIObjectPath* path = ProviderUtilities::createObjectPath(_broker, ends.className, _namespace);
    if (path == nullptr) {
        return nullptr;
    }
    CMPIObjectPath* accessPoint = accessPoint_.getObjectPath();
    ProviderUtilities::setKeyProperty(path, "Antecedent", accessPoint);
    ProviderUtilities::setKeyProperty(path, "Dependent", locateDHCPEndptPath(accessPoint));
    return path;
}

CMPIInstance* CMPIDHCPRemoteAccessAvailableToElement::getCMPIInstance(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return makeAssociationInstance(_broker, getObjectPath(), ends, record_, ownProperties);
}

CMPIObjectPath* CMPIDHCPRemoteAccessAvailableToElement::locateRemoteSAP(
    const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    return locate(_broker, _namespace, ends.first.className, objectPath, record_,
                  &DHCPRemoteAccessAvailableToElement::getRemoteServiceAccessPointMoniker);
}

CMPIObjectPath* CMPIDHCPRemoteAccessAvailableToElement::locateDHCPEndptPath(
    const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    return locate(_broker, _namespace, ends.second.className, objectPath, record_,
                  &DHCPRemoteAccessAvailableToElement::getDHCPProtocolEndpointMoniker);
}

}  // namespace ZR::DHCPClientProvider
