#include "CMPI/CMPIDHCPElementSettingData.h"

#include <array>

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPElementSettingData = loggerCategory;

namespace {

using Row = DHCPElementSettingDataAssociation;
using Record = Row::Record;

constexpr std::array ownProperties{
    property<&Record::getIsCurrent>("IsCurrent"),
};

CMPIObjectPath* locateDHCPEndptPath(CMPIDHCPElementSettingData& adapter,
                                    const CMPIObjectPath* objectPath) {
    return adapter.locate<End::first>(Row::trace.at(__func__), objectPath,
                                      &Record::getManagedElementMoniker);
}

CMPIObjectPath* locateDHCPSettingDataPath(CMPIDHCPElementSettingData& adapter,
                                          const CMPIObjectPath* objectPath) {
    return adapter.locate<End::second>(Row::trace.at(__func__), objectPath,
                                       &Record::getDHCPSettingDataMoniker);
}

}  // namespace

const RowSource DHCPElementSettingDataAssociation::trace{
    {"CMPI/CMPIDHCPElementSettingData", loggerCMPIDHCPElementSettingData},
    "~CMPIDHCPElementSettingData",
    __LINE__};

constinit const AssociationClass<DHCPElementSettingDataAssociation>
    DHCPElementSettingDataAssociation::associationClass{
        .first = {"ManagedElement", &locateDHCPEndptPath},
        .second = {"SettingData", &locateDHCPSettingDataPath},
        .ownProperties = ownProperties,
        .walked = End::second,
    };

template class AssociationAdapter<DHCPElementSettingDataAssociation>;

}  // namespace ZR::DHCPClientProvider
