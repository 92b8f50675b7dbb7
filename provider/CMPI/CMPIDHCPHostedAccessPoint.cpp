#include "CMPI/CMPIDHCPHostedAccessPoint.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPHostedAccessPoint = loggerCategory;

namespace {

using Row = DHCPHostedAccessPointAssociation;
using Record = Row::Record;

CMPIObjectPath* locateComputer(CMPIDHCPHostedAccessPoint& adapter,
                               const CMPIObjectPath* objectPath) {
    return adapter.locate<End::first>(Row::trace.at(__func__), objectPath,
                                      &Record::getSystemMoniker);
}

CMPIObjectPath* locateDHCPProtocolEndpoint(CMPIDHCPHostedAccessPoint& adapter,
                                           const CMPIObjectPath* objectPath) {
    return adapter.locate<End::second>(Row::trace.at(__func__), objectPath,
                                       &Record::getDHCPProtocolEndPointMoniker);
}

// The pairs run over the endpoints of one computer after the other.

bool eitherStands(CMPIDHCPHostedAccessPoint& adapter) {
    return static_cast<bool>(adapter.first()) || static_cast<bool>(adapter.second());
}

void stepToNextPair(CMPIDHCPHostedAccessPoint& adapter) {
    auto& computer = adapter.first();
    auto& endpoint = adapter.second();
    ++endpoint;
    if (endpoint) {
        return;
    }
    ++computer;
    if (computer) {
        endpoint.setObjectPath(locateDHCPProtocolEndpoint(adapter, computer.getObjectPath()));
    }
}

}  // namespace

const RowSource DHCPHostedAccessPointAssociation::trace{
    {"CMPI/CMPIDHCPHostedAccessPoint", loggerCMPIDHCPHostedAccessPoint},
    "~CMPIDHCPHostedAccessPoint",
    __LINE__};

constinit const AssociationClass<DHCPHostedAccessPointAssociation>
    DHCPHostedAccessPointAssociation::associationClass{
        .first = {"Antecedent", &locateComputer},
        .second = {"Dependent", &locateDHCPProtocolEndpoint},
        .walked = End::second,
        .stands = &eitherStands,
        .step = &stepToNextPair,
        .referencedFirst = End::first,
        .other = Reference::own,
    };

template class AssociationAdapter<DHCPHostedAccessPointAssociation>;

}  // namespace ZR::DHCPClientProvider
