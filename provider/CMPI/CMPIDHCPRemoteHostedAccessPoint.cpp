#include "CMPI/CMPIDHCPRemoteHostedAccessPoint.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPRemoteHostedAccessPoint = loggerCategory;

const RowSource DHCPRemoteHostedAccessPointAssociation::trace{
    {"CMPI/CMPIDHCPRemoteHostedAccessPoint", loggerCMPIDHCPRemoteHostedAccessPoint},
    "~CMPIDHCPRemoteHostedAccessPoint",
    __LINE__};

const AssociationClass<DHCPRemoteHostedAccessPointAssociation::Record>
    DHCPRemoteHostedAccessPointAssociation::associationClass{
        "QVXZR_DHCPRemoteHostedAccessPoint",
        84,
        {"Antecedent", 1, "QVXZR_ComputerSystem", "CIM_ComputerSystem", "locateComputer",
         &Record::getSystemMoniker},
        {"Dependent", 82, "QVXZR_DHCPRemoteServiceAccessPoint", "CIM_RemoteServiceAccessPoint",
         "locateRemoteSAP", &Record::getRemoteSAPMoniker},
        {},
    };

bool DHCPRemoteHostedAccessPointAssociation::stands(Adapter& adapter) {
    // Nothing steps the computer end on: were its word enough, a second computer would
    // keep the walk going for ever. It is asked all the same, which is how it notices
    // that its first instance was seen.
    static_cast<void>(static_cast<bool>(adapter.at<End::first>()));
    return static_cast<bool>(adapter.at<End::second>());
}

template class AssociationAdapter<DHCPRemoteHostedAccessPointAssociation>;

}  // namespace ZR::DHCPClientProvider
