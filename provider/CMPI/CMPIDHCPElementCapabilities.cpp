#include "CMPI/CMPIDHCPElementCapabilities.h"

#include "CMPI/AssociationAdapter.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPElementCapabilities = loggerCategory;

namespace {

const TraceSource source{"CMPI/CMPIDHCPElementCapabilities", loggerCMPIDHCPElementCapabilities};

constexpr AssociationEnds ends{
    "QVXZR_DHCPElementCapabilities",
    6,
    {"ManagedElement", 4, "QVXZR_DHCPProtocolEndpoint", "CIM_DHCPProtocolEndpoint"},
    {"Capabilities", 5, "QVXZR_DHCPCapabilities", "CIM_DHCPCapabilities"},
};

constexpr std::array<ElementProperty<ElementCapabilities>, 1> ownProperties{{
    property<&ElementCapabilities::getCharacteristics>("Characteristics"),
}};

}  // namespace

CMPIDHCPElementCapabilities::CMPIDHCPElementCapabilities(const CMPIBroker* broker,
                                                         const CMPIContext* context,
                                                         const CMPIObjectPath* objectPath)
    : _broker(broker),
      _context(context),
      _namespace(ProviderUtilities::getNamespace(objectPath)),
      requestedClassId_(ProviderUtilities::getClassId(objectPath)),
      endpoint_(broker, context, _namespace),
      capabilities_(broker, context, _namespace) {
    const ParameterScope scope(ZR_HERE, " _broker=", _broker, " _context=", _context,
                               " objectPath=", objectPath);
    traceVariable(ZR_HERE, "requestedClassId", static_cast<unsigned>(requestedClassId_));
    switch (ends.sourceOf(requestedClassId_)) {
        case Source::first:
            capabilities_.setObjectPath(locateCapabilities(objectPath));
            endpoint_.setObjectPath(objectPath);
            break;
        case Source::second:
            endpoint_.setObjectPath(locateDHCPProtocolEndpoint(objectPath));
            capabilities_.setObjectPath(objectPath);
            break;
        case Source::association:
            if (endpoint_) {
                capabilities_.setObjectPath(locateCapabilities(endpoint_.getObjectPath()));
            }
            break;
        case Source::none:
            break;
    }
}

CMPIDHCPElementCapabilities::~CMPIDHCPElementCapabilities() {
    traceMethod(ZR_HERE);
}

CMPIDHCPElementCapabilities::operator bool() {
    traceMethod(ZR_HERE);
    return stands(ends.sourceOf(requestedClassId_), endpoint_, capabilities_, endpoint_);
}

void CMPIDHCPElementCapabilities::operator++() {
    traceMethod(ZR_HERE);
    step(ends.sourceOf(requestedClassId_), endpoint_, capabilities_, endpoint_);
}

bool CMPIDHCPElementCapabilities::isNotTargetClass(const char* resultClass) const {
    const ParameterScope scope(ZR_HERE, " resultClass=", resultClass);
    return ends.isNotTarget(requestedClassId_, resultClass);
}

CMPIObjectPath* CMPIDHCPElementCapabilities::getAssociatorNames() {
    const TraceScope scope(ZR_HERE);
    return farPath(ends.sourceOf(requestedClassId_), endpoint_, capabilities_);
}

CMPIInstance* CMPIDHCPElementCapabilities::getAssociator(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return farInstance(ends.sourceOf(requestedClassId_), endpoint_, capabilities_, properties);
}

CMPIObjectPath* CMPIDHCPElementCapabilities::getObjectPath() {
    const TraceScope scope(ZR_HERE);
    CMPIObjectPath* path = ProviderUtilities::createObjectPath(_broker, ends.className, _namespace);
    if (path == nullptr) {
        return nullptr;
    }
    CMPIObjectPath* endpoint = endpoint_.getObjectPath();
    ProviderUtilities::setKeyProperty(path, "ManagedElement", endpoint);
    ProviderUtilities::setKeyProperty(path, "Capabilities", locateCapabilities(endpoint));
    return path;
}

CMPIInstance* CMPIDHCPElementCapabilities::getCMPIInstance(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return makeAssociationInstance(_broker, getObjectPath(), ends, record_, ownProperties);
}

CMPIObjectPath* CMPIDHCPElementCapabilities::locateDHCPProtocolEndpoint(
    const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    return locate(_broker, _namespace, ends.first.className, objectPath, record_,
                  &ElementCapabilities::getDHCPEndpointMoniker);
}

CMPIObjectPath* CMPIDHCPElementCapabilities::locateCapabilities(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    return locate(_broker, _namespace, ends.second.className, objectPath, record_,
                  &ElementCapabilities::getDHCPCapabilitiesMoniker);
}

}  // namespace ZR::DHCPClientProvider
