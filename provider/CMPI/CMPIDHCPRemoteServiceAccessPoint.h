#pragma once

#include "CMPI/ElementAdapter.h"
#include "Lindows/DHCPRemoteServiceAccessPoint.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPRemoteServiceAccessPoint;

struct DHCPRemoteServiceAccessPointRow {
    using Element = DHCPRemoteServiceAccessPoint;
    static constexpr const Classes::Class& servedClass = Classes::dhcpRemoteServiceAccessPoint;
    static const RowSource trace;
    static const ElementClass<Element> elementClass;
};

extern template class ElementAdapter<DHCPRemoteServiceAccessPointRow>;

/// Serves the DHCP servers that the interfaces talk to; filters by "SystemName" and
/// "Name".
using CMPIDHCPRemoteServiceAccessPoint = ElementAdapter<DHCPRemoteServiceAccessPointRow>;

}  // namespace ZR::DHCPClientProvider
