#pragma once

#include <cmpift.h>

#include "Classes.h"
#include "Providers.h"

namespace ZR::DHCPClientGateway {

/// The instance as a client with this property list gets it: without what the list leaves
/// out, with a null for each listed property that is not known, and without a list for
/// those of them of which some object managers would show the default of the schema: a null
/// and a property that is not there mean the same. Of a class of another provider, properties that
/// it leaves unset stay so. References of associations are always there. Throws Refusal.
[[nodiscard]] const CMPIInstance* completed(const Request& request, const ServedClass& served,
                                            const CMPIInstance* instance, const char** properties);

}  // namespace ZR::DHCPClientGateway
