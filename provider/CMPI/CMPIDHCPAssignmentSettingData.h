#pragma once

#include <cmpift.h>

#include <string>

namespace ZR::DHCPClientProvider {

extern const std::string loggerCMPIDHCPAssignmentSettingData;

/// Fetches IP assignment setting data from the object manager, as ends of
/// associations: instances of "QVXZR_IPAssignmentSettingData" that other providers serve.
///
/// Placed, the adapter stands on the first instance. It is walked so: the first
/// element, then further ones only as long as another follows the present one;
/// operator bool is asked exactly once per step. Of two instances the second is
/// thus never delivered; with one, the usual case, the walk is right.
class CMPIDHCPAssignmentSettingData {
  public:
    CMPIDHCPAssignmentSettingData(const CMPIBroker* broker, const CMPIContext* context,
                                  std::string nameSpace);
    ~CMPIDHCPAssignmentSettingData();
    CMPIDHCPAssignmentSettingData(const CMPIDHCPAssignmentSettingData&) = delete;
    CMPIDHCPAssignmentSettingData& operator=(const CMPIDHCPAssignmentSettingData&) = delete;

    /// Stands on exactly the instance that the path names. Throws ProviderException
    /// when the object manager has none.
    void setSingleObjectPath(const CMPIObjectPath* objectPath);
    /// Stands on the first of all instances of the path's class, whatever its keys.
    /// Throws ProviderException when the object manager refuses.
    void setObjectPath(const CMPIObjectPath* objectPath);

    explicit operator bool();
    void operator++();

    /// The path that the present instance tells of itself; null without one.
    [[nodiscard]] CMPIObjectPath* getObjectPath() const;
    CMPIInstance* getCMPIInstance(const char** properties) const;

  private:
    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    CMPIInstance* instance_ = nullptr;
    CMPIEnumeration* enumeration_ = nullptr;
    bool first_ = false;
};

}  // namespace ZR::DHCPClientProvider
