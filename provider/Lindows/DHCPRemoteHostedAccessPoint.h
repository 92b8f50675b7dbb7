#pragma once

#include <string>
#include <vector>

#include "zrclient/Instrumentation.h"
#include "zrclient/Moniker.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerDHCPRemoteHostedAccessPoint;

/// Joins a computer system to the remote access points (DHCP servers) known on it.
class DHCPRemoteHostedAccessPoint : public Instrumentation {
  public:
    DHCPRemoteHostedAccessPoint();
    ~DHCPRemoteHostedAccessPoint();
    DHCPRemoteHostedAccessPoint(const DHCPRemoteHostedAccessPoint&) = delete;
    DHCPRemoteHostedAccessPoint& operator=(const DHCPRemoteHostedAccessPoint&) = delete;

    /// {"Name"}.
    Moniker getSystemMoniker(Moniker& remoteSAPMoniker);
    /// {"SystemName"}: a filter for all access points of the computer, which has
    /// at least one.
    Moniker getRemoteSAPMoniker(Moniker& systemMoniker);
};

}  // namespace ZR::DHCPClientProvider
