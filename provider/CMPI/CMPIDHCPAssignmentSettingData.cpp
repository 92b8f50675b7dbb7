#include "CMPI/CMPIDHCPAssignmentSettingData.h"

#include <utility>

#include "CMPI/ReferencedClass.h"
#include "include/TracePoint.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPAssignmentSettingData = loggerCategory;

namespace {

const TraceSource source{"CMPI/CMPIDHCPAssignmentSettingData", loggerCMPIDHCPAssignmentSettingData};

}  // namespace

CMPIDHCPAssignmentSettingData::CMPIDHCPAssignmentSettingData(const CMPIBroker* broker,
                                                             const CMPIContext* context,
                                                             std::string nameSpace)
    : _broker(broker), _context(context), _namespace(std::move(nameSpace)) {
    traceMethod(ZR_HERE);
}

CMPIDHCPAssignmentSettingData::~CMPIDHCPAssignmentSettingData() {
    traceMethod(ZR_HERE);
}

void CMPIDHCPAssignmentSettingData::setSingleObjectPath(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    instance_ = getReferenced(_broker, _context, objectPath);
    first_ = true;
}

void CMPIDHCPAssignmentSettingData::setObjectPath(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    enumeration_ = enumerateReferenced(_broker, _context, objectPath, noIPProtocolEndpoint);
    if (takeNext(enumeration_, instance_)) {
        first_ = true;
    }
}

CMPIDHCPAssignmentSettingData::operator bool() {
    traceMethod(ZR_HERE);
    return std::exchange(first_, false) || hasNext(enumeration_);
}

void CMPIDHCPAssignmentSettingData::operator++() {
    traceMethod(ZR_HERE);
    instance_ = nullptr;
    takeNext(enumeration_, instance_);
}

CMPIObjectPath* CMPIDHCPAssignmentSettingData::getObjectPath() const {
    const TraceScope scope(ZR_HERE);
    return pathOf(instance_);
}

CMPIInstance* CMPIDHCPAssignmentSettingData::getCMPIInstance(const char** properties) const {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return instance_;
}

}  // namespace ZR::DHCPClientProvider
