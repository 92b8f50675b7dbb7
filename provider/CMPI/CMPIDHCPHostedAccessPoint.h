#pragma once

#include "CMPI/AssociationAdapter.h"
#include "CMPI/CMPIDHCPComputerSystem.h"
#include "CMPI/CMPIDHCPProtocolEndpoint.h"
#include "Lindows/HostedAccessPoint.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPHostedAccessPoint;

struct DHCPHostedAccessPointAssociation {
    using First = CMPIDHCPComputerSystem;
    using Second = CMPIDHCPProtocolEndpoint;
    using Record = DHCPHostedAccessPoint;

    static constexpr const Classes::Class& servedClass = Classes::hostedDHCPPoint;
    static const RowSource trace;
    static const AssociationClass<DHCPHostedAccessPointAssociation> associationClass;
};

extern template class AssociationAdapter<DHCPHostedAccessPointAssociation>;

/// Serves "QVXZR_HostedDHCPPoint": a computer system and the DHCP protocol endpoints that it hosts.
using CMPIDHCPHostedAccessPoint = AssociationAdapter<DHCPHostedAccessPointAssociation>;

}  // namespace ZR::DHCPClientProvider
