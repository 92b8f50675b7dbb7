#include "CMPI/CMPIDHCPHostedAccessPoint.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPHostedAccessPoint = loggerCategory;

const RowSource DHCPHostedAccessPointAssociation::trace{
    {"CMPI/CMPIDHCPHostedAccessPoint", loggerCMPIDHCPHostedAccessPoint},
    "~CMPIDHCPHostedAccessPoint",
    __LINE__};

const AssociationClass<DHCPHostedAccessPointAssociation::Record>
    DHCPHostedAccessPointAssociation::associationClass{
        "QVXZR_HostedDHCPPoint",
        34,
        {"Antecedent", 1, "QVXZR_ComputerSystem", "CIM_ComputerSystem", "locateComputer",
         &Record::getSystemMoniker},
        {"Dependent", 4, "QVXZR_DHCPProtocolEndpoint", "CIM_DHCPProtocolEndpoint",
         "locateDHCPProtocolEndpoint", &Record::getDHCPProtocolEndPointMoniker},
        {},
    };

bool DHCPHostedAccessPointAssociation::stands(Adapter& adapter) {
    return static_cast<bool>(adapter.at<End::first>()) ||
           static_cast<bool>(adapter.at<End::second>());
}

void DHCPHostedAccessPointAssociation::step(Adapter& adapter) {
    auto& computer = adapter.at<End::first>();
    auto& endpoint = adapter.at<End::second>();
    if (endpoint) {
        return;
    }
    ++computer;
    if (computer) {
        endpoint.setObjectPath(adapter.locate<End::second>(computer.getObjectPath()));
    }
}

template class AssociationAdapter<DHCPHostedAccessPointAssociation>;

}  // namespace ZR::DHCPClientProvider
