#include "CMPI/CMPIDHCPOrderedComponent.h"

#include <array>

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPOrderedComponent = loggerCategory;

namespace {

using Row = DHCPOrderedComponentAssociation;
using Record = Row::Record;

constexpr std::array ownProperties{
    property<&Record::getAssignedSequence>("AssignedSequence"),
};

constexpr const char* groupRole = "GroupComponent";
constexpr const char* partRole = "PartComponent";

CMPIObjectPath* locateAssignmentSetting(CMPIDHCPOrderedComponent& adapter,
                                        const CMPIObjectPath* objectPath) {
    return adapter.locate<End::first>(Row::trace.at(__func__), objectPath,
                                      &Record::getGroupComponentMoniker);
}

CMPIObjectPath* locateDhcpAssignmentSetting(CMPIDHCPOrderedComponent& adapter,
                                            const CMPIObjectPath* objectPath) {
    return adapter.locate<End::second>(Row::trace.at(__func__), objectPath,
                                       &Record::getPartComponentMoniker);
}

/// Narrows the ends to the references of an association path, as far as it has
/// them. False, with nothing done, when the path has no keys at all.
bool setObjectPath(CMPIDHCPOrderedComponent& adapter, const CMPIObjectPath* objectPath) {
    const ParameterScope scope(Row::trace.at(__func__), " objectPath=", objectPath);
    if (ProviderUtilities::getKeyCount(objectPath) == 0) {
        return false;
    }
    CMPIObjectPath* reference = nullptr;
    if (ProviderUtilities::getKeyProperty(objectPath, partRole, &reference)) {
        adapter.second().setObjectPath(reference);
    }
    if (ProviderUtilities::getKeyProperty(objectPath, groupRole, &reference)) {
        adapter.first().setObjectPath(reference);
    }
    return true;
}

void placeByReferences(CMPIDHCPOrderedComponent& adapter, const CMPIObjectPath* objectPath) {
    if (!setObjectPath(adapter, objectPath)) {
        const CMPIObjectPath* setting = locateDhcpAssignmentSetting(adapter, objectPath);
        adapter.second().setObjectPath(setting);
        adapter.first().setObjectPath(locateAssignmentSetting(adapter, setting));
    }
}

}  // namespace

const RowSource DHCPOrderedComponentAssociation::trace{
    {"CMPI/CMPIDHCPOrderedComponent", loggerCMPIDHCPOrderedComponent},
    "~CMPIDHCPOrderedComponent",
    __LINE__};

constinit const AssociationClass<DHCPOrderedComponentAssociation>
    DHCPOrderedComponentAssociation::associationClass{
        .first = {groupRole, &locateAssignmentSetting},
        .second = {partRole, &locateDhcpAssignmentSetting},
        .ownProperties = ownProperties,
        .walked = End::second,
        .place = &placeByReferences,
        .placeFirstAsSource = &CMPIDHCPAssignmentSettingData::setSingleObjectPath,
        .placeFirstLocated = &CMPIDHCPAssignmentSettingData::setSingleObjectPath,
    };

template class AssociationAdapter<DHCPOrderedComponentAssociation>;

}  // namespace ZR::DHCPClientProvider
