#pragma once

#include <cmpift.h>

#include <string>

#include "Lindows/DHCPProtocolEndpoint.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPProtocolEndpoint;

/// Serves the DHCP protocol endpoints as instances of "QVXZR_DHCPProtocolEndpoint".
///
/// An element adapter is built for one request and walked: while it is true, ask
/// it for an object path or an instance, and step on. What it hands out belongs to
/// the broker, which may also refuse: the answer is then null. It borrows broker
/// and context, and lets the exceptions of its element pass. Used by one thread.
class CMPIDHCPProtocolEndpoint {
  public:
    /// Stands on the first of all instances in a namespace.
    CMPIDHCPProtocolEndpoint(const CMPIBroker* broker, const CMPIContext* context,
                             std::string nameSpace);
    /// Stands on the first instance that a path names, in the path's namespace.
    CMPIDHCPProtocolEndpoint(const CMPIBroker* broker, const CMPIContext* context,
                             const CMPIObjectPath* objectPath);
    ~CMPIDHCPProtocolEndpoint();
    CMPIDHCPProtocolEndpoint(const CMPIDHCPProtocolEndpoint&) = delete;
    CMPIDHCPProtocolEndpoint& operator=(const CMPIDHCPProtocolEndpoint&) = delete;

    /// Narrows the walk to the keys "SystemName" and "Name" of the path, as far as
    /// it has them. Filters add up; none is ever taken away.
    void setObjectPath(const CMPIObjectPath* objectPath);

    explicit operator bool();
    void operator++();

    [[nodiscard]] CMPIObjectPath* getObjectPath() const;
    /// The property list is not looked at: an instance always has all that is known.
    CMPIInstance* getCMPIInstance(const char** properties) const;

  private:
    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    DHCPProtocolEndpoint element_;
};

}  // namespace ZR::DHCPClientProvider
