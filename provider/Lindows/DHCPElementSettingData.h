#pragma once

#include <string>
#include <vector>

#include "zrclient/Instrumentation.h"
#include "zrclient/Moniker.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerDHCPElementSettingData;

/// Joins a DHCP protocol endpoint to the DHCP setting data of its interface.
class DHCPElementSettingData : public Instrumentation {
  public:
    DHCPElementSettingData();
    ~DHCPElementSettingData();
    DHCPElementSettingData(const DHCPElementSettingData&) = delete;
    DHCPElementSettingData& operator=(const DHCPElementSettingData&) = delete;

    /// {"InstanceID"}.
    Moniker getDHCPSettingDataMoniker(Moniker& dhcpEndpointMoniker);
    /// {"SystemCreationClassName", "SystemName", "Name"}, the first two as far as
    /// they can be read.
    Moniker getManagedElementMoniker(Moniker& dhcpSettingDataMoniker);

    /// Always 1 (Is Current, CIM 2.41).
    bool getIsCurrent(unsigned short& isCurrent) const;

  private:
    [[maybe_unused]] unsigned short isCurrent_ = 0;  // set here and never read
};

}  // namespace ZR::DHCPClientProvider
