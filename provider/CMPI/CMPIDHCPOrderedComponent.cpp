#include "CMPI/CMPIDHCPOrderedComponent.h"

#include "CMPI/AssociationAdapter.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPOrderedComponent = loggerCategory;

namespace {

const TraceSource source{"CMPI/CMPIDHCPOrderedComponent", loggerCMPIDHCPOrderedComponent};

constexpr AssociationEnds ends{
    "QVXZR_DHCPOrderedComponent",
    87,
    {"GroupComponent", 66, "QVXZR_IPAssignmentSettingData", "CIM_IPAssignmentSettingData"},
    {"PartComponent", 85, "QVXZR_DHCPSettingData", "CIM_DHCPSettingData"},
};

constexpr std::array<ElementProperty<DHCPOrderedComponent>, 1> ownProperties{{
    property<&DHCPOrderedComponent::getAssignedSequence>("AssignedSequence"),
}};

}  // namespace

CMPIDHCPOrderedComponent::CMPIDHCPOrderedComponent(const CMPIBroker* broker,
                                                   const CMPIContext* context,
                                                   const CMPIObjectPath* objectPath)
    : _broker(broker),
      _context(context),
      _namespace(ProviderUtilities::getNamespace(objectPath)),
      requestedClassId_(ProviderUtilities::getClassId(objectPath)),
      assignment_(broker, context, _namespace),
      setting_(broker, context, _namespace) {
    const ParameterScope scope(ZR_HERE, " _broker=", _broker, " _context=", _context,
                               " objectPath=", objectPath);
    traceVariable(ZR_HERE, "requestedClassId", static_cast<unsigned>(requestedClassId_));
    switch (ends.sourceOf(requestedClassId_)) {
        case Source::first:
            setting_.setObjectPath(locateDhcpAssignmentSetting(objectPath));
            assignment_.setSingleObjectPath(objectPath);
            break;
        case Source::second:
            assignment_.setSingleObjectPath(locateAssignmentSetting(objectPath));
            setting_.setObjectPath(objectPath);
            break;
        case Source::association:
            if (!setObjectPath(objectPath)) {
                const CMPIObjectPath* settingPath = locateDhcpAssignmentSetting(objectPath);
                setting_.setObjectPath(settingPath);
                assignment_.setObjectPath(locateAssignmentSetting(settingPath));
            }
            break;
        case Source::none:
            break;
    }
}

CMPIDHCPOrderedComponent::~CMPIDHCPOrderedComponent() {
    traceMethod(ZR_HERE);
}

CMPIDHCPOrderedComponent::operator bool() {
    traceMethod(ZR_HERE);
    return stands(ends.sourceOf(requestedClassId_), assignment_, setting_, setting_);
}

void CMPIDHCPOrderedComponent::operator++() {
    traceMethod(ZR_HERE);
    step(ends.sourceOf(requestedClassId_), assignment_, setting_, setting_);
}

bool CMPIDHCPOrderedComponent::isNotTargetClass(const char* resultClass) const {
    const ParameterScope scope(ZR_HERE, " resultClass=", resultClass);
    return ends.isNotTarget(requestedClassId_, resultClass);
}

CMPIObjectPath* CMPIDHCPOrderedComponent::getAssociatorNames() {
    const TraceScope scope(ZR_HERE);
    return farPath(ends.sourceOf(requestedClassId_), assignment_, setting_);
}

CMPIInstance* CMPIDHCPOrderedComponent::getAssociator(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return farInstance(ends.sourceOf(requestedClassId_), assignment_, setting_, properties);
}

CMPIObjectPath* CMPIDHCPOrderedComponent::getObjectPath() {
    const TraceScope scope(ZR_HERE);
    CMPIObjectPath* path = ProviderUtilities::createObjectPath(_broker, ends.className, _namespace);
    if (path == nullptr) {
        return nullptr;
    }
    CMPIObjectPath* setting = setting_.getObjectPath();
    ProviderUtilities::setKeyProperty(path, "PartComponent", setting);
    ProviderUtilities::setKeyProperty(path, "GroupComponent", locateAssignmentSetting(setting));
    return path;
}

CMPIInstance* CMPIDHCPOrderedComponent::getCMPIInstance(const char** properties) {
    const ParameterScope scope(ZR_HERE, " properties=", properties);
    return makeAssociationInstance(_broker, getObjectPath(), ends, record_, ownProperties);
}

CMPIObjectPath* CMPIDHCPOrderedComponent::locateAssignmentSetting(
    const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    return locate(_broker, _namespace, ends.first.className, objectPath, record_,
                  &DHCPOrderedComponent::getGroupComponentMoniker);
}

CMPIObjectPath* CMPIDHCPOrderedComponent::locateDhcpAssignmentSetting(
    const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    return locate(_broker, _namespace, ends.second.className, objectPath, record_,
                  &DHCPOrderedComponent::getPartComponentMoniker);
}

bool CMPIDHCPOrderedComponent::setObjectPath(const CMPIObjectPath* objectPath) {
    const ParameterScope scope(ZR_HERE, " objectPath=", objectPath);
    if (ProviderUtilities::getKeyCount(objectPath) == 0) {
        return false;
    }
    CMPIObjectPath* reference = nullptr;
    if (ProviderUtilities::getKeyProperty(objectPath, ends.second.role, &reference)) {
        setting_.setObjectPath(reference);
    }
    if (ProviderUtilities::getKeyProperty(objectPath, ends.first.role, &reference)) {
        assignment_.setObjectPath(reference);
    }
    return true;
}

}  // namespace ZR::DHCPClientProvider
