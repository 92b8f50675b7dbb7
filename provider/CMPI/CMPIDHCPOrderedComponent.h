#pragma once

#include "CMPI/AssociationAdapter.h"
#include "CMPI/CMPIDHCPAssignmentSettingData.h"
#include "CMPI/CMPIDHCPSettingData.h"
#include "Lindows/DHCPOrderedComponent.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPOrderedComponent;

struct DHCPOrderedComponentAssociation {
    using First = CMPIDHCPAssignmentSettingData;
    using Second = CMPIDHCPSettingData;
    using Record = DHCPOrderedComponent;

    static constexpr const Classes::Class& servedClass = Classes::dhcpOrderedComponent;
    static const RowSource trace;
    static const AssociationClass<DHCPOrderedComponentAssociation> associationClass;
};

extern template class AssociationAdapter<DHCPOrderedComponentAssociation>;

/// Serves "QVXZR_DHCPOrderedComponent": an IP assignment setting data and the DHCP setting data
/// in it.
using CMPIDHCPOrderedComponent = AssociationAdapter<DHCPOrderedComponentAssociation>;

}  // namespace ZR::DHCPClientProvider
