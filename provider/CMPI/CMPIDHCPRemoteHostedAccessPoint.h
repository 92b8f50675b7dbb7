#pragma once

#include <cmpift.h>

#include <cstdint>
#include <string>

#include "CMPI/CMPIDHCPComputerSystem.h"
#include "CMPI/CMPIDHCPRemoteServiceAccessPoint.h"
#include "Lindows/DHCPRemoteHostedAccessPoint.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPRemoteHostedAccessPoint;

/// Serves "QVXZR_DHCPRemoteHostedAccessPoint": a computer system ("Antecedent") and
/// the remote access points (DHCP servers) known on it ("Dependent").
/// Built, walked and asked as CMPIDHCPHostedAccessPoint is.
class CMPIDHCPRemoteHostedAccessPoint {
  public:
    CMPIDHCPRemoteHostedAccessPoint(const CMPIBroker* broker, const CMPIContext* context,
                                    const CMPIObjectPath* objectPath);
    ~CMPIDHCPRemoteHostedAccessPoint();
    CMPIDHCPRemoteHostedAccessPoint(const CMPIDHCPRemoteHostedAccessPoint&) = delete;
    CMPIDHCPRemoteHostedAccessPoint& operator=(const CMPIDHCPRemoteHostedAccessPoint&) = delete;

    explicit operator bool();
    void operator++();
    bool isNotTargetClass(const char* resultClass) const;

    CMPIObjectPath* getAssociatorNames();
    CMPIInstance* getAssociator(const char** properties);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);

    CMPIObjectPath* locateComputer(const CMPIObjectPath* objectPath);
    CMPIObjectPath* locateRemoteSAP(const CMPIObjectPath* objectPath);

  private:
    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    std::int32_t requestedClassId_;
    CMPIDHCPComputerSystem computer_;
    CMPIDHCPRemoteServiceAccessPoint accessPoint_;
    DHCPRemoteHostedAccessPoint record_;
};

}  // namespace ZR::DHCPClientProvider
