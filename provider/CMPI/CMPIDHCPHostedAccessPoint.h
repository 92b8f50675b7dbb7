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
    using Adapter = AssociationAdapter<DHCPHostedAccessPointAssociation>;

    static const RowSource trace;
    static const AssociationClass<Record> associationClass;
    static constexpr End walked = End::second;
    static constexpr End referencedFirst = End::first;
    static constexpr Reference other = Reference::own;
    static constexpr Placing firstAsSource = Placing::all;
    static constexpr Placing firstLocated = Placing::all;

    // The pairs run over the endpoints of one computer after the other.
    static bool stands(Adapter& adapter);
    static void step(Adapter& adapter);
};

extern template class AssociationAdapter<DHCPHostedAccessPointAssociation>;

/// Serves "QVXZR_HostedDHCPPoint": a computer system and the DHCP protocol endpoints that it hosts.
using CMPIDHCPHostedAccessPoint = AssociationAdapter<DHCPHostedAccessPointAssociation>;

}  // namespace ZR::DHCPClientProvider
