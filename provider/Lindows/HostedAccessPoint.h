#pragma once

#include <string>
#include <vector>

#include "zrclient/Instrumentation.h"
#include "zrclient/Moniker.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerDHCPHostedAccessPoint;

/// Joins a computer system to the DHCP protocol endpoints that it hosts.
class DHCPHostedAccessPoint : public Instrumentation {
  public:
    DHCPHostedAccessPoint();
    ~DHCPHostedAccessPoint();
    DHCPHostedAccessPoint(const DHCPHostedAccessPoint&) = delete;
    DHCPHostedAccessPoint& operator=(const DHCPHostedAccessPoint&) = delete;

    /// {"SystemName"}: a filter for all endpoints of the computer, which is not
    /// looked up.
    Moniker getDHCPProtocolEndPointMoniker(Moniker& moniker);
    /// {"Name"}.
    Moniker getSystemMoniker(Moniker& endPointMoniker);
};

}  // namespace ZR::DHCPClientProvider
