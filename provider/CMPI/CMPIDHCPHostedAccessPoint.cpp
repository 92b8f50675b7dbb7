#include "CMPI/CMPIDHCPHostedAccessPoint.h"

#include "CMPI/AssociationAdapter.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPHostedAccessPoint = loggerCategory;

namespace {

const TraceSource source{"CMPI/CMPIDHCPHostedAccessPoint", loggerCMPIDHCPHostedAccessPoint};

constexpr AssociationEnds ends{
    "QVXZR_HostedDHCPPoint",
    34,
    {"Antecedent", 1, "QVXZR_ComputerSystem", "CIM_ComputerSystem"},
    {"Dependent", 4, "QVXZR_DHCPProtocolEndpoint", "CIM_DHCPProtocolEndpoint"},
};

constexpr std::array<ElementProperty<DHCPHostedAccessPoint>, 0> ownProperties{};

}  // namespace

CMPIDHCPHostedAccessPoint::CMPIDHCPHostedAccessPoint(const CMPIBroker* broker,
                                                     const CMPIContext* context,
                                                     const CMPIObjectPath* objectPath)
    : _broker(broker),
      _context(context),
      _namespace(ProviderUtilities::getNamespace(objectPath)),
      requestedClassId_(ProviderUtilities::getClassId(objectPath)),
      computer_(broker, context, _namespace),
      endpoint_(broker, context, _namespace) {
    const ParameterScope scope(ZR_HERE, " _broker=", _broker, " _context=", _context,
                               " objectPath=", objectPath);
    traceVariable(ZR_HERE, "requestedClassId", static_cast<unsigned>(requestedClassId_));
    switch (ends.sourceOf(requestedClassId_)) {
        case Source::first:
            endpoint_.setObjectPath(locateDHCPProtocolEndpoint(objectPath));
            computer_.setObjectPath(objectPath);
            break;
        case Source::second:
            computer_.setObjectPath(locateComputer(objectPath));
            endpoint_.setObjectPath(objectPath);
            break;
        case Source::association:
            if (endpoint_) {
                computer_.setObjectPath(locateComputer(endpoint_.getObjectPath()));
            }
            break;
        case Source::none:
            break;
    }
}

CMPIDHCPHostedAccessPoint::~CMPIDHCPHostedAccessPoint() {
    traceMethod(ZR_HERE);
}

CMPIDHCPHostedAccessPoint::operator bool() {
    traceMethod(ZR_HERE);
    const Source walk = ends.sourceOf(requestedClassId_);
    if (walk == Source::association) {
        return static_cast<bool>(computer_) || static_cast<bool>(endpoint_);
    }
    return stands(walk, computer_, endpoint_, endpoint_);
}

void CMPIDHCPHostedAccessPoint::operator++() {
    traceMethod(ZR_HERE);
    const Source walk = ends.sourceOf(requestedClassId_);
    step(walk, computer_, endpoint_, endpoint_);
    // The pairs run over the endpoints of one computer after the other.
    if (walk == Source::association && !endpoint_) {
        ++computer_;
        if (computer_) {
            endpoint_.setObjectPath(locateDHCPProtocolEndpoint(computer_.getObjectPath()));
        }
    }
}

bool CMPIDHCPHostedAccessPoint::isNotTargetClass(const char* resultClass) const {
    const ParameterScope scope(ZR_HERE, " resultClass=", resultClass);
    return ends.isNotTarget(requestedClassId_, resultClass);
}

CMPIObjectPath* CMPIDHCPHostedAccessPoint::getAssociatorNames() {
    const TraceScope scope(ZR_HERE);
    return farPath(ends.sourceOf(requestedClassId_), computer_, endpoint_);
}

CMPIInstance* CMPIDHCPHostedAccessPoint::getAssociator(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return farInstance(ends.sourceOf(requestedClassId_), computer_, endpoint_, properties);
}

CMPIObjectPath* CMPIDHCPHostedAccessPoint::getObjectPath() {
    const TraceScope scope(ZR_HERE);
    CMPIObjectPath* path = ProviderUtilities::createObjectPath(_broker, ends.className, _namespace);
    if (path == nullptr) {
        return nullptr;
    }
    ProviderUtilities::setKeyProperty(path, "Antecedent", computer_.getObjectPath());
    ProviderUtilities::setKeyProperty(path, "Dependent", endpoint_.getObjectPath());
    return path;
}

CMPIInstance* CMPIDHCPHostedAccessPoint::getCMPIInstance(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return makeAssociationInstance(_broker, getObjectPath(), ends, record_, ownProperties);
}

CMPIObjectPath* CMPIDHCPHostedAccessPoint::locateComputer(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    return locate(_broker, _namespace, ends.first.className, objectPath, record_,
                  &DHCPHostedAccessPoint::getSystemMoniker);
}

CMPIObjectPath* CMPIDHCPHostedAccessPoint::locateDHCPProtocolEndpoint(
    const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    return locate(_broker, _namespace, ends.second.className, objectPath, record_,
                  &DHCPHostedAccessPoint::getDHCPProtocolEndPointMoniker);
}

}  // namespace ZR::DHCPClientProvider
