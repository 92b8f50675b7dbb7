#include "CMPI/CMPIDHCPElementSettingData.h"

#include "CMPI/AssociationAdapter.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPElementSettingData = loggerCategory;

namespace {

const TraceSource source{"CMPI/CMPIDHCPElementSettingData", loggerCMPIDHCPElementSettingData};

constexpr AssociationEnds ends{
    "QVXZR_DHCPElementSettingData",
    86,
    {"ManagedElement", 4, "QVXZR_DHCPProtocolEndpoint", "CIM_DHCPProtocolEndpoint"},
    {"SettingData", 85, "QVXZR_DHCPSettingData", "CIM_DHCPSettingData"},
};

constexpr std::array<ElementProperty<DHCPElementSettingData>, 1> ownProperties{{
    property<&DHCPElementSettingData::getIsCurrent>("IsCurrent"),
}};

}  // namespace

CMPIDHCPElementSettingData::CMPIDHCPElementSettingData(const CMPIBroker* broker,
                                                       const CMPIContext* context,
                                                       const CMPIObjectPath* objectPath)
    : _broker(broker),
      _context(context),
      _namespace(ProviderUtilities::getNamespace(objectPath)),
      requestedClassId_(ProviderUtilities::getClassId(objectPath)),
      endpoint_(broker, context, _namespace),
      setting_(broker, context, _namespace) {
    const ParameterScope scope(ZR_HERE, " _broker=", _broker, " _context=", _context,
                               " objectPath=", objectPath);
    traceVariable(ZR_HERE, "requestedClassId", static_cast<unsigned>(requestedClassId_));
    switch (ends.sourceOf(requestedClassId_)) {
        case Source::first:
            setting_.setObjectPath(locateDHCPSettingDataPath(objectPath));
            endpoint_.setObjectPath(objectPath);
            break;
        case Source::second:
            endpoint_.setObjectPath(locateDHCPEndptPath(objectPath));
            setting_.setObjectPath(objectPath);
            break;
        case Source::association:
            if (setting_) {
                endpoint_.setObjectPath(locateDHCPEndptPath(setting_.getObjectPath()));
            }
            break;
        case Source::none:
            break;
    }
}

CMPIDHCPElementSettingData::~CMPIDHCPElementSettingData() {
    traceMethod(ZR_HERE);
}

CMPIDHCPElementSettingData::operator bool() {
    traceMethod(ZR_HERE);
    return stands(ends.sourceOf(requestedClassId_), endpoint_, setting_, setting_);
}

void CMPIDHCPElementSettingData::operator++() {
    traceMethod(ZR_HERE);
    step(ends.sourceOf(requestedClassId_), endpoint_, setting_, setting_);
}

bool CMPIDHCPElementSettingData::isNotTargetClass(const char* resultClass) const {
    const ParameterScope scope(ZR_HERE, " resultClass=", resultClass);
    return ends.isNotTarget(requestedClassId_, resultClass);
}

CMPIObjectPath* CMPIDHCPElementSettingData::getAssociatorNames() {
    const TraceScope scope(ZR_HERE);
    return farPath(ends.sourceOf(requestedClassId_), endpoint_, setting_);
}

CMPIInstance* CMPIDHCPElementSettingData::getAssociator(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return farInstance(ends.sourceOf(requestedClassId_), endpoint_, setting_, properties);
}

CMPIObjectPath* CMPIDHCPElementSettingData::getObjectPath() {
    const TraceScope scope(ZR_HERE);
    CMPIObjectPath* path = ProviderUtilities::createObjectPath(_broker, ends.className, _namespace);
    if (path == nullptr) {
        return nullptr;
    }
    CMPIObjectPath* setting = setting_.getObjectPath();
    ProviderUtilities::setKeyProperty(path, "SettingData", setting);
    ProviderUtilities::setKeyProperty(path, "ManagedElement", locateDHCPEndptPath(setting));
    return path;
}

CMPIInstance* CMPIDHCPElementSettingData::getCMPIInstance(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return makeAssociationInstance(_broker, getObjectPath(), ends, record_, ownProperties);
}

CMPIObjectPath* CMPIDHCPElementSettingData::locateDHCPEndptPath(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    return locate(_broker, _namespace, ends.first.className, objectPath, record_,
                  &DHCPElementSettingData::getManagedElementMoniker);
}

CMPIObjectPath* CMPIDHCPElementSettingData::locateDHCPSettingDataPath(
    const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    return locate(_broker, _namespace, ends.second.className, objectPath, record_,
                  &DHCPElementSettingData::getDHCPSettingDataMoniker);
}

}  // namespace ZR::DHCPClientProvider
