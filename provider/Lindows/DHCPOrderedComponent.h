#pragma once

#include <string>
#include <vector>

#include "zrclient/Instrumentation.h"
#include "zrclient/Moniker.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerDHCPOrderedComponent;

/// Joins an IP assignment setting data (the group) to the DHCP setting data in it.
class DHCPOrderedComponent : public Instrumentation {
  public:
    DHCPOrderedComponent();
    ~DHCPOrderedComponent();
    DHCPOrderedComponent(const DHCPOrderedComponent&) = delete;
    DHCPOrderedComponent& operator=(const DHCPOrderedComponent&) = delete;

    /// {"InstanceID"}: the given one and "%dhcp". The interface must exist; whether
    /// it uses DHCP does not matter.
    Moniker getGroupComponentMoniker(Moniker& dhcpDataMoniker);
    /// {"InstanceID"}.
    Moniker getPartComponentMoniker(Moniker& ipSettingDataMoniker);

    /// Always 1: every DHCP setting is the first in its assignment.
    bool getAssignedSequence(unsigned long long& sequence) const;
};

}  // namespace ZR::DHCPClientProvider
