#pragma once

#include <cmpift.h>

#include <cstdint>
#include <string>

#include "CMPI/CMPIDHCPProtocolEndpoint.h"
#include "CMPI/CMPIDHCPRemoteServiceAccessPoint.h"
#include "Lindows/DHCPRemoteAccessAvailableToElement.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPRemoteAccessAvailableToElement;

/// Serves "QVXZR_DHCPRemoteAccessAvailableToElement": a remote access point (DHCP
/// server, "Antecedent") and the DHCP protocol endpoint that uses it ("Dependent").
/// Built, walked and asked as CMPIDHCPHostedAccessPoint is.
class CMPIDHCPRemoteAccessAvailableToElement {
  public:
    CMPIDHCPRemoteAccessAvailableToElement(const CMPIBroker* broker, const CMPIContext* context,
                                           const CMPIObjectPath* objectPath);
    ~CMPIDHCPRemoteAccessAvailableToElement();
    CMPIDHCPRemoteAccessAvailableToElement(const CMPIDHCPRemoteAccessAvailableToElement&) = delete;
    CMPIDHCPRemoteAccessAvailableToElement& operator=(
        const CMPIDHCPRemoteAccessAvailableToElement&) = delete;

    explicit operator bool();
    void operator++();
    bool isNotTargetClass(const char* resultClass) const;

    CMPIObjectPath* getAssociatorNames();
    CMPIInstance* getAssociator(const char** properties);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);

    CMPIObjectPath* locateRemoteSAP(const CMPIObjectPath* objectPath);
    CMPIObjectPath* locateDHCPEndptPath(const CMPIObjectPath* objectPath);

  private:
    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    std::int32_t requestedClassId_;
    CMPIDHCPRemoteServiceAccessPoint accessPoint_;
    CMPIDHCPProtocolEndpoint endpoint_;
    DHCPRemoteAccessAvailableToElement record_;
};

}  // namespace ZR::DHCPClientProvider
