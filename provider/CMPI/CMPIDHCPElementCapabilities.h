#pragma once

#include <cmpift.h>

#include <cstdint>
#include <string>

#include "CMPI/CMPIDHCPCapabilities.h"
#include "CMPI/CMPIDHCPProtocolEndpoint.h"
#include "Lindows/ElementCapabilities.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPElementCapabilities;

/// Serves "QVXZR_DHCPElementCapabilities": a DHCP protocol endpoint
/// ("ManagedElement") and its capabilities ("Capabilities").
/// Built, walked and asked as CMPIDHCPHostedAccessPoint is.
class CMPIDHCPElementCapabilities {
  public:
    CMPIDHCPElementCapabilities(const CMPIBroker* broker, const CMPIContext* context,
                                const CMPIObjectPath* objectPath);
    ~CMPIDHCPElementCapabilities();
    CMPIDHCPElementCapabilities(const CMPIDHCPElementCapabilities&) = delete;
    CMPIDHCPElementCapabilities& operator=(const CMPIDHCPElementCapabilities&) = delete;

    explicit operator bool();
    void operator++();
    bool isNotTargetClass(const char* resultClass) const;

    CMPIObjectPath* getAssociatorNames();
    CMPIInstance* getAssociator(const char** properties);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);

    CMPIObjectPath* locateDHCPProtocolEndpoint(const CMPIObjectPath* objectPath);
    CMPIObjectPath* locateCapabilities(const CMPIObjectPath* objectPath);

  private:
    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    std::int32_t requestedClassId_;
    CMPIDHCPProtocolEndpoint endpoint_;
    CMPIDHCPCapabilities capabilities_;
    ElementCapabilities record_;
};

}  // namespace ZR::DHCPClientProvider
