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
    using Adapter = AssociationAdapter<DHCPRemoteHostedAccessPointAssociation>;

    static const RowSource trace;
    static const AssociationClass<Record> associationClass;
    static constexpr End walked = End::second;
    static constexpr End referencedFirst = End::second;
    static constexpr Reference other = Reference::own;
    static constexpr Placing firstAsSource = Placing::all;
    static constexpr Placing firstLocated = Placing::all;

    static bool stands(Adapter& adapter);
};

extern template class AssociationAdapter<DHCPRemoteHostedAccessPointAssociation>;

/// Serves "QVXZR_DHCPRemoteHostedAccessPoint": a computer system and the remote access points
/// (DHCP servers) known on it.
using CMPIDHCPRemoteHostedAccessPoint = AssociationAdapter<DHCPRemoteHostedAccessPointAssociation>;

}  // namespace ZR::DHCPClientProvider
