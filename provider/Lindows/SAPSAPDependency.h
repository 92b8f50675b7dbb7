#pragma once

#include <string>
#include <vector>

#include "zrclient/Instrumentation.h"
#include "zrclient/Moniker.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerSAPSAPDependency;

/// Joins an IP protocol endpoint to the DHCP protocol endpoint of the same interface.
class SAPSAPDependency : public Instrumentation {
  public:
    SAPSAPDependency();
    ~SAPSAPDependency();
    SAPSAPDependency(const SAPSAPDependency&) = delete;
    SAPSAPDependency& operator=(const SAPSAPDependency&) = delete;

    /// {"Name", "SystemName", "CreationClassName", "SystemCreationClassName"}; a key
    /// that the endpoint lacks is empty, as long as it has the other. Nothing is looked up.
    Moniker getIPSAPMoniker(Moniker& moniker);
    /// {"Name", "SystemName"}.
    Moniker getDHCPSAPMoniker(Moniker& moniker);

    /// AddressOrigin (CIM 2.41) of the node on which the record stands; 0 (unknown)
    /// when it tells none.
    bool getAddressOrigin(unsigned short& origin) const;
};

}  // namespace ZR::DHCPClientProvider
