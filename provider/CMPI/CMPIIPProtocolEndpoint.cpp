#include "CMPI/CMPIIPProtocolEndpoint.h"

#include <utility>

#include "CMPI/ReferencedClass.h"
#include "include/TracePoint.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIIPProtocolEndpoint = loggerCategory;

namespace {

const TraceSource source{"CMPI/CMPIIPProtocolEndpoint", loggerCMPIIPProtocolEndpoint};

}  // namespace

CMPIIPProtocolEndpoint::CMPIIPProtocolEndpoint(const CMPIBroker* broker, const CMPIContext* context,
                                               std::string nameSpace)
    : _broker(broker), _context(context), _namespace(std::move(nameSpace)) {
    traceMethod(ZR_HERE);
}

CMPIIPProtocolEndpoint::~CMPIIPProtocolEndpoint() {
    traceMethod(ZR_HERE);
}

void CMPIIPProtocolEndpoint::setSingleObjectPath(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    instance_ = getReferenced(_broker, _context, objectPath);
    first_ = true;
}

void CMPIIPProtocolEndpoint::setObjectPath(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    enumeration_ = enumerateReferenced(_broker, _context, objectPath, noIPProtocolEndpoint);
    if (hasNext(enumeration_) && takeNext(enumeration_, instance_)) {
        first_ = true;
    }
}

CMPIIPProtocolEndpoint::operator bool() {
    traceMethod(ZR_HERE);
    return std::exchange(first_, false) || hasNext(enumeration_);
}

void CMPIIPProtocolEndpoint::operator++() {
    traceMethod(ZR_HERE);
    instance_ = nullptr;
    if (hasNext(enumeration_)) {
        takeNext(enumeration_, instance_);
    }
}

CMPIObjectPath* CMPIIPProtocolEndpoint::getObjectPath() const {
    const TraceScope scope(ZR_HERE);
    return pathOf(instance_);
}

CMPIInstance* CMPIIPProtocolEndpoint::getCMPIInstance(const char** properties) const {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return instance_;
}

}  // namespace ZR::DHCPClientProvider
