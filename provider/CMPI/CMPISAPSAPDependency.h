#pragma once

#include <cmpift.h>

#include <cstdint>
#include <string>

#include "CMPI/CMPIDHCPProtocolEndpoint.h"
#include "CMPI/CMPIIPProtocolEndpoint.h"
#include "Lindows/SAPSAPDependency.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPISAPSAPDependency;

/// Serves "QVXZR_SAPSAPDependency": an IP protocol endpoint ("Antecedent") and the
/// DHCP protocol endpoint of its interface ("Dependent").
/// Built, walked and asked as CMPIDHCPHostedAccessPoint is.
class CMPISAPSAPDependency {
  public:
    CMPISAPSAPDependency(const CMPIBroker* broker, const CMPIContext* context,
                         const CMPIObjectPath* objectPath);
    ~CMPISAPSAPDependency();
    CMPISAPSAPDependency(const CMPISAPSAPDependency&) = delete;
    CMPISAPSAPDependency& operator=(const CMPISAPSAPDependency&) = delete;

    explicit operator bool();
    void operator++();
    bool isNotTargetClass(const char* resultClass) const;

    CMPIObjectPath* getAssociatorNames();
    CMPIInstance* getAssociator(const char** properties);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);

    CMPIObjectPath* locateIPEndpoint(const CMPIObjectPath* objectPath);
    CMPIObjectPath* locateDHCPEndpoint(const CMPIObjectPath* objectPath);

  private:
    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    std::int32_t requestedClassId_;
    CMPIIPProtocolEndpoint ipEndpoint_;
    CMPIDHCPProtocolEndpoint dhcpEndpoint_;
    SAPSAPDependency record_;
};

}  // namespace ZR::DHCPClientProvider
