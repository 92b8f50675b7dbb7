#pragma once

#include <cmpift.h>

#include <atomic>
#include <string>
#include <vector>

/// The outer shell of the provider: two factories, the function tables that they
/// hand out, and the request handlers in them.
namespace ZR::DHCPClientProvider {

extern const std::string loggerDHCPClientProvider;

/// The object manager's broker: that of the most recent factory call, null before
/// the first. Factories may run while requests of the other kind do.
extern std::atomic<const CMPIBroker*> broker;

extern const CMPIInstanceMIFT instMIFT__;
extern const CMPIAssociationMIFT assocMIFT__;

/// Appends the identifiers that the class name of an association request stands
/// for: the class's own, or those of the served classes that are related to it
/// through one of the six standard association classes. False when there are none.
/// Null names are legal: no class name is related to all.
bool getClassId(const char* className, const char* nameSpace,
                std::vector<unsigned short>& classIds);

}  // namespace ZR::DHCPClientProvider

CMPI_EXTERN_C CMPIInstanceMI* DHCPClientProvider_Create_InstanceMI(const CMPIBroker* broker,
                                                                   const CMPIContext* ctx,
                                                                   CMPIStatus* rc);
CMPI_EXTERN_C CMPIAssociationMI* DHCPClientProvider_Create_AssociationMI(const CMPIBroker* broker,
                                                                         const CMPIContext* ctx,
                                                                         CMPIStatus* rc);
