#pragma once

#include <string>
#include <vector>

#include "zrclient/Instrumentation.h"
#include "zrclient/Moniker.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerElementCapabilities;

/// Joins a DHCP protocol endpoint to its DHCP capabilities.
class ElementCapabilities : public Instrumentation {
  public:
    ElementCapabilities();
    ~ElementCapabilities();
    ElementCapabilities(const ElementCapabilities&) = delete;
    ElementCapabilities& operator=(const ElementCapabilities&) = delete;

    /// {"InstanceID"}: the interface name. For an interface that does not exist it
    /// is the name of the last one, or empty on a machine without any.
    Moniker getDHCPCapabilitiesMoniker(Moniker& monikerDHCPEndpoint);
    /// {"Name"}.
    Moniker getDHCPEndpointMoniker(Moniker& monikerCapabilities);

    /// Adds nothing; always false.
    bool getCharacteristics(std::vector<unsigned short>& characteristics) const;
};

}  // namespace ZR::DHCPClientProvider
