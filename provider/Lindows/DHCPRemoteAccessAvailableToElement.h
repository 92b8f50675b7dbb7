#pragma once

#include <string>
#include <vector>

#include "zrclient/Instrumentation.h"
#include "zrclient/Moniker.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerDHCPRemoteAccessAvailableToElement;

/// Joins a remote access point (DHCP server) to the DHCP protocol endpoint that
/// uses it.
///
/// The order of access starts at 1 and is what the builders that ran on the record
/// have left: the number of servers after getRemoteServiceAccessPointMoniker, 0
/// after getDHCPProtocolEndpointMoniker for an interface with several.
class DHCPRemoteAccessAvailableToElement : public Instrumentation {
  public:
    DHCPRemoteAccessAvailableToElement();
    ~DHCPRemoteAccessAvailableToElement();
    DHCPRemoteAccessAvailableToElement(const DHCPRemoteAccessAvailableToElement&) = delete;
    DHCPRemoteAccessAvailableToElement& operator=(const DHCPRemoteAccessAvailableToElement&) =
        delete;

    /// {"Name"} of the interface's first access point.
    Moniker getRemoteServiceAccessPointMoniker(Moniker& monikerDHCPEndpoint);
    /// {"Name", "SystemName", "SystemCreationClassName", "CreationClassName"}.
    Moniker getDHCPProtocolEndpointMoniker(Moniker& accesspointmoniker);

    bool getOrderOfAccess(unsigned short& order) const;

  private:
    unsigned short orderOfAccess_ = 1;
};

}  // namespace ZR::DHCPClientProvider
