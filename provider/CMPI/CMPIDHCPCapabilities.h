#pragma once

#include "CMPI/ElementAdapter.h"
#include "Lindows/DHCPCapabilities.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPCapabilities;

struct DHCPCapabilitiesRow {
    using Element = DHCPCapabilities;
    static constexpr const Classes::Class& servedClass = Classes::dhcpCapabilities;
    static const RowSource trace;
    static const ElementClass<Element> elementClass;
};

extern template class ElementAdapter<DHCPCapabilitiesRow>;

/// Serves the DHCP capabilities of the interfaces; filters by "InstanceID".
using CMPIDHCPCapabilities = ElementAdapter<DHCPCapabilitiesRow>;

}  // namespace ZR::DHCPClientProvider
