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

    static constexpr const Classes::Class& servedClass = Classes::sapSapDependency;
    static const RowSource trace;
    static const AssociationClass<SAPSAPDependencyAssociation> associationClass;
};

extern template class AssociationAdapter<SAPSAPDependencyAssociation>;

/// Serves "QVXZR_SAPSAPDependency": an IP protocol endpoint and the DHCP protocol endpoint of
/// its interface.
using CMPISAPSAPDependency = AssociationAdapter<SAPSAPDependencyAssociation>;

}  // namespace ZR::DHCPClientProvider
