#include "CMPI/CMPISAPSAPDependency.h"

#include "CMPI/AssociationAdapter.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPISAPSAPDependency = loggerCategory;

namespace {

const TraceSource source{"CMPI/CMPISAPSAPDependency", loggerCMPISAPSAPDependency};

constexpr AssociationEnds ends{
    "QVXZR_SAPSAPDependency",
    8,
    {"Antecedent", 9, "QVXZR_IPProtocolEndpoint", "CIM_IPProtocolEndpoint"},
    {"Dependent", 4, "QVXZR_DHCPProtocolEndpoint", "CIM_DHCPProtocolEndpoint"},
};

constexpr std::array<ElementProperty<SAPSAPDependency>, 0> ownProperties{};

}  // namespace

CMPISAPSAPDependency::CMPISAPSAPDependency(const CMPIBroker* broker, const CMPIContext* context,
                                           const CMPIObjectPath* objectPath)
    : _broker(broker),
      _context(context),
      _namespace(ProviderUtilities::getNamespace(objectPath)),
      requestedClassId_(ProviderUtilities::getClassId(objectPath)),
      ipEndpoint_(broker, context, _namespace),
      dhcpEndpoint_(broker, context, _namespace) {
    const ParameterScope scope(ZR_HERE, " _broker=", _broker, " _context=", _context,
                               " objectPath=", objectPath);
    traceVariable(ZR_HERE, "requestedClassId", static_cast<unsigned>(requestedClassId_));
    switch (ends.sourceOf(requestedClassId_)) {
        case Source::first:
            dhcpEndpoint_.setObjectPath(locateDHCPEndpoint(objectPath));
            ipEndpoint_.setObjectPath(objectPath);
            break;
        case Source::second:
            ipEndpoint_.setSingleObjectPath(locateIPEndpoint(objectPath));
            dhcpEndpoint_.setObjectPath(objectPath);
            break;
        case Source::association:
            if (dhcpEndpoint_) {
                // The endpoint's path is fetched but not used: the IP endpoint is
                // located from the source path itself.
                static_cast<void>(dhcpEndpoint_.getObjectPath());
                ipEndpoint_.setObjectPath(locateIPEndpoint(objectPath));
            }
            break;
        case Source::none:
            break;
    }
}

CMPISAPSAPDependency::~CMPISAPSAPDependency() {
    traceMethod(ZR_HERE);
}

CMPISAPSAPDependency::operator bool() {
    traceMethod(ZR_HERE);
    return stands(ends.sourceOf(requestedClassId_), ipEndpoint_, dhcpEndpoint_, dhcpEndpoint_);
}

void CMPISAPSAPDependency::operator++() {
    traceMethod(ZR_HERE);
    step(ends.sourceOf(requestedClassId_), ipEndpoint_, dhcpEndpoint_, dhcpEndpoint_);
}

bool CMPISAPSAPDependency::isNotTargetClass(const char* resultClass) const {
    const ParameterScope scope(ZR_HERE, " resultClass=", resultClass);
    return ends.isNotTarget(requestedClassId_, resultClass);
}

CMPIObjectPath* CMPISAPSAPDependency::getAssociatorNames() {
    const TraceScope scope(ZR_HERE);
    return farPath(ends.sourceOf(requestedClassId_), ipEndpoint_, dhcpEndpoint_);
}

CMPIInstance* CMPISAPSAPDependency::getAssociator(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return farInstance(ends.sourceOf(requestedClassId_), ipEndpoint_, dhcpEndpoint_, properties);
}

CMPIObjectPath* CMPISAPSAPDependency::getObjectPath() {
    const TraceScope scope(ZR_HERE);
    CMPIObjectPath* path = ProviderUtilities::createObjectPath(_broker, ends.className, _namespace);
    if (path == nullptr) {
        return nullptr;
    }
    CMPIObjectPath* dhcpEndpoint = dhcpEndpoint_.getObjectPath();
    ProviderUtilities::setKeyProperty(path, "Dependent", dhcpEndpoint);
    ProviderUtilities::setKeyProperty(path, "Antecedent", locateIPEndpoint(dhcpEndpoint));
    return path;
}

CMPIInstance* CMPISAPSAPDependency::getCMPIInstance(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return makeAssociationInstance(_broker, getObjectPath(), ends, record_, ownProperties);
}

CMPIObjectPath* CMPISAPSAPDependency::locateIPEndpoint(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    return locate(_broker, _namespace, ends.first.className, objectPath, record_,
                  &SAPSAPDependency::getIPSAPMoniker);
}

CMPIObjectPath* CMPISAPSAPDependency::locateDHCPEndpoint(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    const TracePoint at = ZR_HERE;
    return locate(_broker, _namespace, ends.second.className, objectPath, record_,
                  &SAPSAPDependency::getDHCPSAPMoniker, [&at](const Moniker& far) {
                      traceVariable(at, "KEY Count", static_cast<unsigned>(far.getKeyCount()));
                  });
}

}  // namespace ZR::DHCPClientProvider
