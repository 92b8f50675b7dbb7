#pragma once

#include <cmpift.h>

#include <cstdint>
#include <string>

#include "CMPI/CMPIDHCPComputerSystem.h"
#include "CMPI/CMPIDHCPProtocolEndpoint.h"
#include "Lindows/HostedAccessPoint.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPHostedAccessPoint;

/// Serves "QVXZR_HostedDHCPPoint": a computer system ("Antecedent") and the DHCP
/// protocol endpoints that it hosts ("Dependent").
///
/// An association adapter is built for one request from the path that the client
/// names, and walked: operator bool is asked exactly once per step. What it hands
/// out belongs to the broker, which may also refuse: the answer is then null.
/// Exceptions of its ends and of its record pass. Used by one thread.
class CMPIDHCPHostedAccessPoint {
  public:
    CMPIDHCPHostedAccessPoint(const CMPIBroker* broker, const CMPIContext* context,
                              const CMPIObjectPath* objectPath);
    ~CMPIDHCPHostedAccessPoint();
    CMPIDHCPHostedAccessPoint(const CMPIDHCPHostedAccessPoint&) = delete;
    CMPIDHCPHostedAccessPoint& operator=(const CMPIDHCPHostedAccessPoint&) = delete;

    explicit operator bool();
    void operator++();
    bool isNotTargetClass(const char* resultClass) const;

    CMPIObjectPath* getAssociatorNames();
    CMPIInstance* getAssociator(const char** properties);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);

    CMPIObjectPath* locateComputer(const CMPIObjectPath* objectPath);
    CMPIObjectPath* locateDHCPProtocolEndpoint(const CMPIObjectPath* objectPath);

  private:
    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    std::int32_t requestedClassId_;
    CMPIDHCPComputerSystem computer_;
    CMPIDHCPProtocolEndpoint endpoint_;
    DHCPHostedAccessPoint record_;
};

}  // namespace ZR::DHCPClientProvider
