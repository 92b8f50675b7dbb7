#pragma once

#include "CMPI/AssociationAdapter.h"
#include "CMPI/CMPIDHCPComputerSystem.h"
#include "CMPI/CMPIDHCPRemoteServiceAccessPoint.h"
#include "Lindows/DHCPRemoteHostedAccessPoint.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPRemoteHostedAccessPoint;

struct DHCPRemoteHostedAccessPointAssociation {
    using First = CMPIDHCPComputerSystem;
    using Second = CMPIDHCPRemoteServiceAccessPoint;
    using Record = DHCPRemoteHostedAccessPoint;

    static constexpr const Classes::Class& servedClass = Classes::dhcpRemoteHostedAccessPoint;
    static const RowSource trace;
    static const AssociationClass<DHCPRemoteHostedAccessPointAssociation> associationClass;
};

extern template class AssociationAdapter<DHCPRemoteHostedAccessPointAssociation>;

/// Serves "QVXZR_DHCPRemoteHostedAccessPoint": a computer system and the remote access points
/// (DHCP servers) known on it.
using CMPIDHCPRemoteHostedAccessPoint = AssociationAdapter<DHCPRemoteHostedAccessPointAssociation>;

}  // namespace ZR::DHCPClientProvider
