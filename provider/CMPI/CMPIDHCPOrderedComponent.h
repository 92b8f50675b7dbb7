#pragma once

#include <cmpift.h>

#include <cstdint>
#include <string>

#include "CMPI/CMPIDHCPAssignmentSettingData.h"
#include "CMPI/CMPIDHCPSettingData.h"
#include "Lindows/DHCPOrderedComponent.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPOrderedComponent;

/// Serves "QVXZR_DHCPOrderedComponent": an IP assignment setting data
/// ("GroupComponent") and the DHCP setting data in it ("PartComponent").
/// Built, walked and asked as CMPIDHCPHostedAccessPoint is.
class CMPIDHCPOrderedComponent {
  public:
    CMPIDHCPOrderedComponent(const CMPIBroker* broker, const CMPIContext* context,
                             const CMPIObjectPath* objectPath);
    ~CMPIDHCPOrderedComponent();
    CMPIDHCPOrderedComponent(const CMPIDHCPOrderedComponent&) = delete;
    CMPIDHCPOrderedComponent& operator=(const CMPIDHCPOrderedComponent&) = delete;

    explicit operator bool();
    void operator++();
    bool isNotTargetClass(const char* resultClass) const;

    CMPIObjectPath* getAssociatorNames();
    CMPIInstance* getAssociator(const char** properties);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);

    CMPIObjectPath* locateAssignmentSetting(const CMPIObjectPath* objectPath);
    CMPIObjectPath* locateDhcpAssignmentSetting(const CMPIObjectPath* objectPath);

    /// Narrows the ends to the references of an association path, as far as it has
    /// them. False, with nothing done, when the path has no keys at all.
    bool setObjectPath(const CMPIObjectPath* objectPath);

  private:
    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    std::int32_t requestedClassId_;
    CMPIDHCPAssignmentSettingData assignment_;
    CMPIDHCPSettingData setting_;
    DHCPOrderedComponent record_;
};

}  // namespace ZR::DHCPClientProvider
