#include "CMPI/CMPIDHCPRemoteHostedAccessPoint.h"

#include "CMPI/AssociationAdapter.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPRemoteHostedAccessPoint = loggerCategory;

namespace {

const TraceSource source{"CMPI/CMPIDHCPRemoteHostedAccessPoint",
                         loggerCMPIDHCPRemoteHostedAccessPoint};

constexpr AssociationEnds ends{
    "QVXZR_DHCPRemoteHostedAccessPoint",
    84,
    {"Antecedent", 1, "QVXZR_ComputerSystem", "CIM_ComputerSystem"},
    {"Dependent", 82, "QVXZR_DHCPRemoteServiceAccessPoint", "CIM_RemoteServiceAccessPoint"},
};

constexpr std::array<ElementProperty<DHCPRemoteHostedAccessPoint>, 0> ownProperties{};

}  // namespace

CMPIDHCPRemoteHostedAccessPoint::CMPIDHCPRemoteHostedAccessPoint(const CMPIBroker* broker,
                                                                 const CMPIContext* context,
                                                                 const CMPIObjectPath* objectPath)
    : _broker(broker),
      _context(context),
      _namespace(ProviderUtilities::getNamespace(objectPath)),
      requestedClassId_(ProviderUtilities::getClassId(objectPath)),
      computer_(broker, context, _namespace),
      accessPoint_(broker, context, _namespace) {
    const ParameterScope scope(ZR_HERE, " _broker=", _broker, " _context=", _context,
                               " objectPath=", objectPath);
    traceVariable(ZR_HERE, "requestedClassId", static_cast<unsigned>(requestedClassId_));
    switch (ends.sourceOf(requestedClassId_)) {
        case Source::first:
            accessPoint_.setObjectPath(locateRemoteSAP(objectPath));
            computer_.setObjectPath(objectPath);
            break;
        case Source::second:
            computer_.setObjectPath(locateComputer(objectPath));
            accessPoint_.setObjectPath(objectPath);
            break;
        case Source::association:
            if (accessPoint_) {
                computer_.setObjectPath(locateComputer(accessPoint_.getObjectPath()));
            }
            break;
        case Source::none:
            break;
    }
}

CMPIDHCPRemoteHostedAccessPoint::~CMPIDHCPRemoteHostedAccessPoint() {
    traceMethod(ZR_HERE);
}

CMPIDHCPRemoteHostedAccessPoint::operator bool() {
    traceMethod(ZR_HERE);
    const Source walk = ends.sourceOf(requestedClassId_);
    if (walk == Source::association) {
        // Nothing steps the computer end on. Were it asked alone, a second computer
        // would keep the walk going for ever.
        const bool either = static_cast<bool>(computer_) || static_cast<bool>(accessPoint_);
        return either && static_cast<bool>(accessPoint_);
    }
    return stands(walk, computer_, accessPoint_, accessPoint_);
}

void CMPIDHCPRemoteHostedAccessPoint::operator++() {
    traceMethod(ZR_HERE);
    step(ends.sourceOf(requestedClassId_), computer_, accessPoint_, accessPoint_);
}

bool CMPIDHCPRemoteHostedAccessPoint::isNotTargetClass(const char* resultClass) const {
    const ParameterScope scope(ZR_HERE, " resultClass=", resultClass);
    return ends.isNotTarget(requestedClassId_, resultClass);
}

CMPIObjectPath* CMPIDHCPRemoteHostedAccessPoint::getAssociatorNames() {
    const TraceScope scope(ZR_HERE);
    return farPath(ends.sourceOf(requestedClassId_), computer_, accessPoint_);
}

CMPIInstance* CMPIDHCPRemoteHostedAccessPoint::getAssociator(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return farInstance(ends.sourceOf(requestedClassId_), computer_, accessPoint_, properties);
}

CMPIObjectPath* CMPIDHCPRemoteHostedAccessPoint::getObjectPath() {
    const TraceScope scope(ZR_HERE);
    CMPIObjectPath* path = ProviderUtilities::createObjectPath(_broker, ends.className, _namespace);
    if (path == nullptr) {
        return nullptr;
    }
    ProviderUtilities::setKeyProperty(path, "Dependent", accessPoint_.getObjectPath());
    ProviderUtilities::setKeyProperty(path, "Antecedent", computer_.getObjectPath());
    return path;
}

CMPIInstance* CMPIDHCPRemoteHostedAccessPoint::getCMPIInstance(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return makeAssociationInstance(_broker, getObjectPath(), ends, record_, ownProperties);
}

CMPIObjectPath* CMPIDHCPRemoteHostedAccessPoint::locateComputer(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    return locate(_broker, _namespace, ends.first.className, objectPath, record_,
                  &DHCPRemoteHostedAccessPoint::getSystemMoniker);
}

CMPIObjectPath* CMPIDHCPRemoteHostedAccessPoint::locateRemoteSAP(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    return locate(_broker, _namespace, ends.second.className, objectPath, record_,
                  &DHCPRemoteHostedAccessPoint::getRemoteSAPMoniker);
}

}  // namespace ZR::DHCPClientProvider
