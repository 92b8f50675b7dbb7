#include "CMPI/CMPIDHCPOrderedComponent.h"

#include <array>

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPOrderedComponent = loggerCategory;

namespace {

using Record = DHCPOrderedComponentAssociation::Record;

constexpr std::array ownProperties{
    property<&Record::getAssignedSequence>("AssignedSequence"),
};

}  // namespace

const RowSource DHCPOrderedComponentAssociation::trace{
    {"CMPI/CMPIDHCPOrderedComponent", loggerCMPIDHCPOrderedComponent},
    "~CMPIDHCPOrderedComponent",
    __LINE__};

const AssociationClass<DHCPOrderedComponentAssociation::Record>
    DHCPOrderedComponentAssociation::associationClass{
        "QVXZR_DHCPOrderedComponent",
        87,
        {"GroupComponent", 66, "QVXZR_IPAssignmentSettingData", "CIM_IPAssignmentSettingData",
         "locateAssignmentSetting", &Record::getGroupComponentMoniker},
        {"PartComponent", 85, "QVXZR_DHCPSettingData", "CIM_DHCPSettingData",
         "locateDhcpAssignmentSetting", &Record::getPartComponentMoniker},
        ownProperties,
    };

void DHCPOrderedComponentAssociation::place(Adapter& adapter, const CMPIObjectPath* objectPath) {
    if (!setObjectPath(adapter, objectPath)) {
        const CMPIObjectPath* setting = adapter.locate<End::second>(objectPath);
        adapter.at<End::second>().setObjectPath(setting);
        adapter.at<End::first>().setObjectPath(adapter.locate<End::first>(setting));
    }
}

bool DHCPOrderedComponentAssociation::setObjectPath(Adapter& adapter,
                                                    const CMPIObjectPath* objectPath) {
    const ParameterScope scope(trace.at(__func__), " objectPath=", objectPath);
    if (ProviderUtilities::getKeyCount(objectPath) == 0) {
        return false;
    }
    CMPIObjectPath* reference = nullptr;
    if (ProviderUtilities::getKeyProperty(objectPath, associationClass.second.role, &reference)) {
        adapter.at<End::second>().setObjectPath(reference);
    }
    if (ProviderUtilities::getKeyProperty(objectPath, associationClass.first.role, &reference)) {
        adapter.at<End::first>().setObjectPath(reference);
    }
    return true;
}

template class AssociationAdapter<DHCPOrderedComponentAssociation>;

}  // namespace ZR::DHCPClientProvider
