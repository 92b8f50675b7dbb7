#pragma once

#include <cmpift.h>

#include <cstdint>
#include <string>

#include "CMPI/CMPIDHCPProtocolEndpoint.h"
#include "CMPI/CMPIDHCPSettingData.h"
#include "Lindows/DHCPElementSettingData.h"

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPElementSettingData;

/// Serves "QVXZR_DHCPElementSettingData": a DHCP protocol endpoint
/// ("ManagedElement") and the DHCP setting data of its interface ("SettingData").
/// Built, walked and asked as CMPIDHCPHostedAccessPoint is.
class CMPIDHCPElementSettingData {
  public:
    CMPIDHCPElementSettingData(const CMPIBroker* broker, const CMPIContext* context,
                               const CMPIObjectPath* objectPath);
    ~CMPIDHCPElementSettingData();
    CMPIDHCPElementSettingData(const CMPIDHCPElementSettingData&) = delete;
    CMPIDHCPElementSettingData& operator=(const CMPIDHCPElementSettingData&) = delete;

    explicit operator bool();
    void operator++();
    bool isNotTargetClass(const char* resultClass) const;

    CMPIObjectPath* getAssociatorNames();
    CMPIInstance* getAssociator(const char** properties);
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);

    CMPIObjectPath* locateDHCPEndptPath(const CMPIObjectPath* objectPath);
    CMPIObjectPath* locateDHCPSettingDataPath(const CMPIObjectPath* objectPath);

  private:
    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    std::int32_t requestedClassId_;
    CMPIDHCPProtocolEndpoint endpoint_;
    CMPIDHCPSettingData setting_;
    DHCPElementSettingData record_;
};

}  // namespace ZR::DHCPClientProvider
