#pragma once

#include "CMPI/AssociationAdapter.h"
#include "CMPI/CMPIDHCPProtocolEndpoint.h"
#include "CMPI/CMPIDHCPSettingData.h"
#include "Lindows/DHCPElementSettingData.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPElementSettingData;

struct DHCPElementSettingDataAssociation {
    using First = CMPIDHCPProtocolEndpoint;
    using Second = CMPIDHCPSettingData;
    using Record = DHCPElementSettingData;

    static constexpr const Classes::Class& servedClass = Classes::dhcpElementSettingData;
    static const RowSource trace;
    static const AssociationClass<DHCPElementSettingDataAssociation> associationClass;
};

extern template class AssociationAdapter<DHCPElementSettingDataAssociation>;

/// Serves "QVXZR_DHCPElementSettingData": a DHCP protocol endpoint and the DHCP setting data of
/// its interface.
using CMPIDHCPElementSettingData = AssociationAdapter<DHCPElementSettingDataAssociation>;

}  // namespace ZR::DHCPClientProvider
