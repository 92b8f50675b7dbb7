#pragma once

#include <cmpift.h>

#include "Classes.h"
#include "Providers.h"

namespace ZR::DHCPClientGateway {

/// Whether a property list, null for all properties, has a property. Names compare without
/// regard to case.
[[nodiscard]] bool lists(const char** properties, const char* name) noexcept;

/// The instance as a client with this property list gets it: without what the list leaves
/// out, and with a null for each further property of the class, where some object managers
/// would put the default of the schema. Of a class of another provider, properties that it
/// leaves unset stay so. References of associations are always there. Throws Refusal.
[[nodiscard]] const CMPIInstance* completed(const Request& request, const ServedClass& served,
                                            const Object& object, const char** properties);

}  // namespace ZR::DHCPClientGateway
