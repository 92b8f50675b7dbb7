#include "CMPI/CMPIDHCPRemoteHostedAccessPoint.h"

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPRemoteHostedAccessPoint = loggerCategory;

namespace {

using Row = DHCPRemoteHostedAccessPointAssociation;
using Record = Row::Record;

CMPIObjectPath* locateComputer(CMPIDHCPRemoteHostedAccessPoint& adapter,
                               const CMPIObjectPath* objectPath) {
    return adapter.locate<End::first>(Row::trace.at(__func__), objectPath,
                                      &Record::getSystemMoniker);
}

CMPIObjectPath* locateRemoteSAP(CMPIDHCPRemoteHostedAccessPoint& adapter,
                                const CMPIObjectPath* objectPath) {
    return adapter.locate<End::second>(Row::trace.at(__func__), objectPath,
                                       &Record::getRemoteSAPMoniker);
}

bool accessPointStands(CMPIDHCPRemoteHostedAccessPoint& adapter) {
    // Nothing steps the computer end on: were its word enough, a second computer would
    // keep the walk going for ever. It is asked all the same, since asking it uses up
    // its first instance, and traces.
    static_cast<void>(static_cast<bool>(adapter.first()));
    return static_cast<bool>(adapter.second());
}

}  // namespace

const RowSource DHCPRemoteHostedAccessPointAssociation::trace{
    {"CMPI/CMPIDHCPRemoteHostedAccessPoint", loggerCMPIDHCPRemoteHostedAccessPoint},
    "~CMPIDHCPRemoteHostedAccessPoint",
    __LINE__};

constinit const AssociationClass<DHCPRemoteHostedAccessPointAssociation>
    DHCPRemoteHostedAccessPointAssociation::associationClass{
        .first = {"Antecedent", &locateComputer},
        .second = {"Dependent", &locateRemoteSAP},
        .walked = End::second,
        .stands = &accessPointStands,
        .other = Reference::own,
    };

template class AssociationAdapter<DHCPRemoteHostedAccessPointAssociation>;

}  // namespace ZR::DHCPClientProvider
