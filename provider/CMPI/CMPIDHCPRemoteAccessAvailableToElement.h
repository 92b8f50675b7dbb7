#pragma once

#include "CMPI/AssociationAdapter.h"
#include "CMPI/CMPIDHCPProtocolEndpoint.h"
#include "CMPI/CMPIDHCPRemoteServiceAccessPoint.h"
#include "Lindows/DHCPRemoteAccessAvailableToElement.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPRemoteAccessAvailableToElement;

struct DHCPRemoteAccessAvailableToElementAssociation {
    using First = CMPIDHCPRemoteServiceAccessPoint;
    using Second = CMPIDHCPProtocolEndpoint;
    using Record = DHCPRemoteAccessAvailableToElement;

    static constexpr const Classes::Class& servedClass =
        Classes::dhcpRemoteAccessAvailableToElement;
    static const RowSource trace;
    static const AssociationClass<DHCPRemoteAccessAvailableToElementAssociation> associationClass;
};

extern template class AssociationAdapter<DHCPRemoteAccessAvailableToElementAssociation>;

/// Serves "QVXZR_DHCPRemoteAccessAvailableToElement": a remote access point (DHCP server) and
/// the DHCP protocol endpoint that uses it.
using CMPIDHCPRemoteAccessAvailableToElement =
    AssociationAdapter<DHCPRemoteAccessAvailableToElementAssociation>;

}  // namespace ZR::DHCPClientProvider
