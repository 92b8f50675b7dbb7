#include "CMPI/CMPISAPSAPDependency.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPISAPSAPDependency = loggerCategory;

const RowSource SAPSAPDependencyAssociation::trace{
    {"CMPI/CMPISAPSAPDependency", loggerCMPISAPSAPDependency}, "~CMPISAPSAPDependency", __LINE__};

const AssociationClass<SAPSAPDependencyAssociation::Record>
    SAPSAPDependencyAssociation::associationClass{
        "QVXZR_SAPSAPDependency",
        8,
        {"Antecedent", 9, "QVXZR_IPProtocolEndpoint", "CIM_IPProtocolEndpoint", "locateIPEndpoint",
         &Record::getIPSAPMoniker},
        {"Dependent", 4, "QVXZR_DHCPProtocolEndpoint", "CIM_DHCPProtocolEndpoint",
         "locateDHCPEndpoint", &Record::getDHCPSAPMoniker},
        {},
    };

void SAPSAPDependencyAssociation::place(Adapter& adapter, const CMPIObjectPath* objectPath) {
    auto& dhcpEndpoint = adapter.at<End::second>();
    if (dhcpEndpoint) {
        // The endpoint's path is fetched but not used: the IP endpoint is located
        // from the source path itself.
        static_cast<void>(dhcpEndpoint.getObjectPath());
        adapter.at<End::first>().setObjectPath(adapter.locate<End::first>(objectPath));
    }
}

void SAPSAPDependencyAssociation::inspect(End located, const TracePoint& at, const Moniker& found) {
    if (located == End::second) {
        traceVariable(at, "KEY Count", static_cast<unsigned>(found.getKeyCount()));
    }
}

template class AssociationAdapter<SAPSAPDependencyAssociation>;

}  // namespace ZR::DHCPClientProvider
