#include "CMPI/CMPIDHCPElementSettingData.h"

#include <array>

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPElementSettingData = loggerCategory;

namespace {

using Record = DHCPElementSettingDataAssociation::Record;

constexpr std::array ownProperties{
    property<&Record::getIsCurrent>("IsCurrent"),
};

}  // namespace

const RowSource DHCPElementSettingDataAssociation::trace{
    {"CMPI/CMPIDHCPElementSettingData", loggerCMPIDHCPElementSettingData},
    "~CMPIDHCPElementSettingData",
    __LINE__};

const AssociationClass<DHCPElementSettingDataAssociation::Record>
    DHCPElementSettingDataAssociation::associationClass{
        "QVXZR_DHCPElementSettingData",
        86,
        {"ManagedElement", 4, "QVXZR_DHCPProtocolEndpoint", "CIM_DHCPProtocolEndpoint",
         "locateDHCPEndptPath", &Record::getManagedElementMoniker},
        {"SettingData", 85, "QVXZR_DHCPSettingData", "CIM_DHCPSettingData",
         "locateDHCPSettingDataPath", &Record::getDHCPSettingDataMoniker},
        ownProperties,
    };

template class AssociationAdapter<DHCPElementSettingDataAssociation>;

}  // namespace ZR::DHCPClientProvider
