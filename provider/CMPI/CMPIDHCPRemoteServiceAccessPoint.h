#pragma once

#include <cmpift.h>

#include <string>

#include "Lindows/DHCPRemoteServiceAccessPoint.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPRemoteServiceAccessPoint;

/// Serves the DHCP servers that the interfaces talk to as instances of
/// "QVXZR_DHCPRemoteServiceAccessPoint". Built, walked and asked as CMPIDHCPProtocolEndpoint is.
class CMPIDHCPRemoteServiceAccessPoint {
  public:
    /// Stands on the first of all instances in a namespace.
    CMPIDHCPRemoteServiceAccessPoint(const CMPIBroker* broker, const CMPIContext* context,
                                     std::string nameSpace);
    /// Stands on the first instance that a path names, in the path's namespace.
    CMPIDHCPRemoteServiceAccessPoint(const CMPIBroker* broker, const CMPIContext* context,
                                     const CMPIObjectPath* objectPath);
    ~CMPIDHCPRemoteServiceAccessPoint();
    CMPIDHCPRemoteServiceAccessPoint(const CMPIDHCPRemoteServiceAccessPoint&) = delete;
    CMPIDHCPRemoteServiceAccessPoint& operator=(const CMPIDHCPRemoteServiceAccessPoint&) = delete;

    /// Narrows the walk to the keys "SystemName" and "Name" of the path, as far as
    /// it has them.
    void setObjectPath(const CMPIObjectPath* objectPath);

    explicit operator bool() const;
    void operator++();

    [[nodiscard]] CMPIObjectPath* getObjectPath() const;
    CMPIInstance* getCMPIInstance(const char** properties) const;

  private:
    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    DHCPRemoteServiceAccessPoint element_;
};

}  // namespace ZR::DHCPClientProvider
