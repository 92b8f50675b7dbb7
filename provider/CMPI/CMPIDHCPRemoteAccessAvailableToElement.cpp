#include "CMPI/CMPIDHCPRemoteAccessAvailableToElement.h"

#include <array>

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPRemoteAccessAvailableToElement = loggerCategory;

namespace {

using Row = DHCPRemoteAccessAvailableToElementAssociation;
using Record = Row::Record;

constexpr std::array ownProperties{
    property<&Record::getOrderOfAccess>("OrderOfAccess"),
};

CMPIObjectPath* locateRemoteSAP(CMPIDHCPRemoteAccessAvailableToElement& adapter,
                                const CMPIObjectPath* objectPath) {
    return adapter.locate<End::first>(Row::trace.at(__func__), objectPath,
                                      &Record::getRemoteServiceAccessPointMoniker);
}

CMPIObjectPath* locateDHCPEndptPath(CMPIDHCPRemoteAccessAvailableToElement& adapter,
                                    const CMPIObjectPath* objectPath) {
    return adapter.locate<End::second>(Row::trace.at(__func__), objectPath,
                                       &Record::getDHCPProtocolEndpointMoniker);
}

}  // namespace

const RowSource DHCPRemoteAccessAvailableToElementAssociation::trace{
    {"CMPI/CMPIDHCPRemoteAccessAvailableToElement", loggerCMPIDHCPRemoteAccessAvailableToElement},
    "~CMPIDHCPRemoteAccessAvailableToElement",
    __LINE__};

constinit const AssociationClass<DHCPRemoteAccessAvailableToElementAssociation>
    DHCPRemoteAccessAvailableToElementAssociation::associationClass{
        .first = {"Antecedent", &locateRemoteSAP},
        .second = {"Dependent", &locateDHCPEndptPath},
        .ownProperties = ownProperties,
        .walked = End::first,
    };

template class AssociationAdapter<DHCPRemoteAccessAvailableToElementAssociation>;

}  // namespace ZR::DHCPClientProvider
