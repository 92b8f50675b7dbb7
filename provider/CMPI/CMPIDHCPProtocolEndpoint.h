#pragma once

#include "CMPI/ElementAdapter.h"
#include "Lindows/DHCPProtocolEndpoint.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPProtocolEndpoint;

struct DHCPProtocolEndpointRow {
    using Element = DHCPProtocolEndpoint;
    static constexpr const Classes::Class& servedClass = Classes::dhcpProtocolEndpoint;
    static const RowSource trace;
    static const ElementClass<Element> elementClass;
};

extern template class ElementAdapter<DHCPProtocolEndpointRow>;

/// Serves the DHCP protocol endpoints; filters by "SystemName" and "Name".
using CMPIDHCPProtocolEndpoint = ElementAdapter<DHCPProtocolEndpointRow>;

}  // namespace ZR::DHCPClientProvider
