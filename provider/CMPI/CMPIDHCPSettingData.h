#pragma once

#include "CMPI/ElementAdapter.h"
#include "Lindows/DHCPSettingData.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPSettingData;

struct DHCPSettingDataRow {
    using Element = DHCPSettingData;
    static constexpr const Classes::Class& servedClass = Classes::dhcpSettingData;
    static const RowSource trace;
    static const ElementClass<Element> elementClass;

    /// Writes the configuration name into the interface's file. Every other property
    /// is ignored; an instance without the name clears it.
    static CMPIStatus modify(const Element& element, const CMPIInstance* newInstance);
};

extern template class ElementAdapter<DHCPSettingDataRow>;

/// Serves the DHCP setting data of the interfaces; filters by "InstanceID".
using CMPIDHCPSettingData = ElementAdapter<DHCPSettingDataRow>;

}  // namespace ZR::DHCPClientProvider
