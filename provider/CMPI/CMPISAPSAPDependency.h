#pragma once

#include "CMPI/AssociationAdapter.h"
#include "CMPI/CMPIDHCPProtocolEndpoint.h"
#include "CMPI/CMPIIPProtocolEndpoint.h"
#include "Lindows/SAPSAPDependency.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPISAPSAPDependency;

struct SAPSAPDependencyAssociation {
    using First = CMPIIPProtocolEndpoint;
    using Second = CMPIDHCPProtocolEndpoint;
    using Record = SAPSAPDependency;
    using Adapter = AssociationAdapter<SAPSAPDependencyAssociation>;

    static const RowSource trace;
    static const AssociationClass<Record> associationClass;
    static constexpr End walked = End::second;
    static constexpr End referencedFirst = End::second;
    static constexpr Reference other = Reference::located;
    static constexpr Placing firstAsSource = Placing::all;
    static constexpr Placing firstLocated = Placing::single;

    static void place(Adapter& adapter, const CMPIObjectPath* objectPath);
    static void inspect(End located, const TracePoint& at, const Moniker& found);
};

extern template class AssociationAdapter<SAPSAPDependencyAssociation>;

/// Serves "QVXZR_SAPSAPDependency": an IP protocol endpoint and the DHCP protocol endpoint of
/// its interface.
using CMPISAPSAPDependency = AssociationAdapter<SAPSAPDependencyAssociation>;

}  // namespace ZR::DHCPClientProvider
