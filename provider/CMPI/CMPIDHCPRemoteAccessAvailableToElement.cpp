#include "CMPI/CMPIDHCPRemoteAccessAvailableToElement.h"

#include <array>

namespace ZR::DHCPClientProvider {

const std::string loggerCMPIDHCPRemoteAccessAvailableToElement = loggerCategory;

namespace {

using Record = DHCPRemoteAccessAvailableToElementAssociation::Record;

constexpr std::array ownProperties{
    property<&Record::getOrderOfAccess>("OrderOfAccess"),
};

}  // namespace

const RowSource DHCPRemoteAccessAvailableToElementAssociation::trace{
    {"CMPI/CMPIDHCPRemoteAccessAvailableToElement", loggerCMPIDHCPRemoteAccessAvailableToElement},
    "~CMPIDHCPRemoteAccessAvailableToElement",
    __LINE__};

const AssociationClass<DHCPRemoteAccessAvailableToElementAssociation::Record>
    DHCPRemoteAccessAvailableToElementAssociation::associationClass{
        "QVXZR_DHCPRemoteAccessAvailableToElement",
        83,
        {"Antecedent", 82, "QVXZR_DHCPRemoteServiceAccessPoint", "CIM_RemoteServiceAccessPoint",
         "locateRemoteSAP", &Record::getRemoteServiceAccessPointMoniker},
        {"Dependent", 4, "QVXZR_DHCPProtocolEndpoint", "CIM_DHCPProtocolEndpoint",
         "locateDHCPEndptPath", &Record::getDHCPProtocolEndpointMoniker},
        ownProperties,
    };

template class AssociationAdapter<DHCPRemoteAccessAvailableToElementAssociation>;

}  // namespace ZR::DHCPClientProvider
