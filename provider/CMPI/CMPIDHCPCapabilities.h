#pragma once

#include <cmpift.h>

#include <string>

#include "Lindows/DHCPCapabilities.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPCapabilities;

/// Serves the DHCP capabilities of the interfaces as instances of
/// "QVXZR_DHCPCapabilities". Built, walked and asked as CMPIDHCPProtocolEndpoint is.
class CMPIDHCPCapabilities {
  public:
    /// Stands on the first of all instances in a namespace.
    CMPIDHCPCapabilities(const CMPIBroker* broker, const CMPIContext* context,
                         std::string nameSpace);
    /// Stands on the first instance that a path names, in the path's namespace.
    CMPIDHCPCapabilities(const CMPIBroker* broker, const CMPIContext* context,
                         const CMPIObjectPath* objectPath);
    ~CMPIDHCPCapabilities();
    CMPIDHCPCapabilities(const CMPIDHCPCapabilities&) = delete;
    CMPIDHCPCapabilities& operator=(const CMPIDHCPCapabilities&) = delete;

    /// Narrows the walk to the key "InstanceID" of the path, if it has one.
    void setObjectPath(const CMPIObjectPath* objectPath);

    explicit operator bool();
    void operator++();

    [[nodiscard]] CMPIObjectPath* getObjectPath() const;
    CMPIInstance* getCMPIInstance(const char** properties) const;

  private:
    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    DHCPCapabilities element_;
};

}  // namespace ZR::DHCPClientProvider
