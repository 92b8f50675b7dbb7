#pragma once

#include "CMPI/AssociationAdapter.h"
#include "CMPI/CMPIDHCPCapabilities.h"
#include "CMPI/CMPIDHCPProtocolEndpoint.h"
#include "Lindows/ElementCapabilities.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPElementCapabilities;

struct DHCPElementCapabilitiesAssociation {
    using First = CMPIDHCPProtocolEndpoint;
    using Second = CMPIDHCPCapabilities;
    using Record = ElementCapabilities;

    static constexpr const Classes::Class& servedClass = Classes::dhcpElementCapabilities;
    static const RowSource trace;
    static const AssociationClass<DHCPElementCapabilitiesAssociation> associationClass;
};

extern template class AssociationAdapter<DHCPElementCapabilitiesAssociation>;

/// Serves "QVXZR_DHCPElementCapabilities": a DHCP protocol endpoint and its DHCP capabilities.
using CMPIDHCPElementCapabilities = AssociationAdapter<DHCPElementCapabilitiesAssociation>;

}  // namespace ZR::DHCPClientProvider
