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
    using Adapter = AssociationAdapter<DHCPOrderedComponentAssociation>;

    static const RowSource trace;
    static const AssociationClass<Record> associationClass;
    static constexpr End walked = End::second;
    static constexpr End referencedFirst = End::second;
    static constexpr Reference other = Reference::located;
    static constexpr Placing firstAsSource = Placing::single;
    static constexpr Placing firstLocated = Placing::single;

    static void place(Adapter& adapter, const CMPIObjectPath* objectPath);
    /// Narrows the ends to the references of an association path, as far as it has
    /// them. False, with nothing done, when the path has no keys at all.
    static bool setObjectPath(Adapter& adapter, const CMPIObjectPath* objectPath);
};

extern template class AssociationAdapter<DHCPOrderedComponentAssociation>;

/// Serves "QVXZR_DHCPOrderedComponent": an IP assignment setting data and the DHCP setting data
/// in it.
using CMPIDHCPOrderedComponent = AssociationAdapter<DHCPOrderedComponentAssociation>;

}  // namespace ZR::DHCPClientProvider
