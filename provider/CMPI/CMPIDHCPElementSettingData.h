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

    static const RowSource trace;
    static const AssociationClass<Record> associationClass;
    static constexpr End walked = End::second;
    static constexpr End referencedFirst = End::second;
    static constexpr Reference other = Reference::located;
    static constexpr Placing firstAsSource = Placing::all;
    static constexpr Placing firstLocated = Placing::all;
};

extern template class AssociationAdapter<DHCPElementSettingDataAssociation>;

/// Serves "QVXZR_DHCPElementSettingData": a DHCP protocol endpoint and the DHCP setting data of
/// its interface.
using CMPIDHCPElementSettingData = AssociationAdapter<DHCPElementSettingDataAssociation>;

}  // namespace ZR::DHCPClientProvider
