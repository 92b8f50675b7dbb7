#include "CMPI/CMPIDHCPComputerSystem.h"

#include <utility>

#include "CMPI/ReferencedClass.h"
#include "include/TracePoint.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPComputerSystem = loggerCategory;

namespace {

const TraceSource source{"CMPI/CMPIDHCPComputerSystem", loggerCMPIDHCPComputerSystem};

}  // namespace

CMPIDHCPComputerSystem::CMPIDHCPComputerSystem(const CMPIBroker* broker, const CMPIContext* context,
                                               std::string nameSpace)
    : _broker(broker), _context(context), _namespace(std::move(nameSpace)) {
    traceMethod(ZR_HERE);
}

CMPIDHCPComputerSystem::~CMPIDHCPComputerSystem() {
    traceMethod(ZR_HERE);
}

void CMPIDHCPComputerSystem::setObjectPath(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    enumeration_ = enumerateReferenced(_broker, _context, objectPath, noComputerSystem);
    if (hasNext(enumeration_) && takeNext(enumeration_, instance_)) {
        first_ = true;
    }
}

CMPIDHCPComputerSystem::operator bool() {
    traceMethod(ZR_HERE);
    return std::exchange(first_, false) || hasNext(enumeration_);
}

void CMPIDHCPComputerSystem::operator++() {
    traceMethod(ZR_HERE);
    instance_ = nullptr;
    takeNext(enumeration_, instance_);
}

CMPIObjectPath* CMPIDHCPComputerSystem::getObjectPath() const {
    const TraceScope scope(ZR_HERE);
    return pathOf(instance_);
}

CMPIInstance* CMPIDHCPComputerSystem::getCMPIInstance(const char** properties) const {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return instance_;
}

}  // namespace ZR::DHCPClientProvider
