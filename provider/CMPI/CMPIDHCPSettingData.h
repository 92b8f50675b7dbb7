#pragma once

#include <cmpift.h>

#include <string>

#include "Lindows/DHCPSettingData.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPSettingData;

/// Serves the DHCP setting data of the interfaces as instances of
/// "QVXZR_DHCPSettingData". Built, walked and asked as CMPIDHCPProtocolEndpoint is.
class CMPIDHCPSettingData {
  public:
    /// Stands on the first of all instances in a namespace.
    CMPIDHCPSettingData(const CMPIBroker* broker, const CMPIContext* context,
                        std::string nameSpace);
    /// Stands on the first instance that a path names, in the path's namespace.
    CMPIDHCPSettingData(const CMPIBroker* broker, const CMPIContext* context,
                        const CMPIObjectPath* objectPath);
    ~CMPIDHCPSettingData();
    CMPIDHCPSettingData(const CMPIDHCPSettingData&) = delete;
    CMPIDHCPSettingData& operator=(const CMPIDHCPSettingData&) = delete;

    /// Narrows the walk to the key "InstanceID" of the path, if it has one.
    void setObjectPath(const CMPIObjectPath* objectPath);

    explicit operator bool() const;
    void operator++();

    [[nodiscard]] CMPIObjectPath* getObjectPath() const;
    CMPIInstance* getCMPIInstance(const char** properties) const;

    /// Writes the configuration name of the new instance into the file of the
    /// interface on which the adapter stands. Every other property is ignored; an
    /// instance without the name clears it. CMPI_RC_ERR_FAILED when there is no
    /// new instance, or the element refuses.
    CMPIStatus modifyInstance(const CMPIInstance* newInstance);

  private:
    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    DHCPSettingData element_;
};

}  // namespace ZR::DHCPClientProvider
