#pragma once

#include <string>

#include "Providers.h"
#include "providerutilities/Refusal.h"

namespace ZR::DHCPClientGateway {

/// Makes an existing instance what a client sends, as far as a property list says; null:
/// as far as the client's instance has properties. What is not named keeps its value. A
/// property that is listed and that the client's instance lacks is one without a value.
///
/// Throws Refusal: as find() does for the path; with CMPI_RC_ERR_NOT_SUPPORTED when a
/// property that cannot be changed would, and then nothing is changed; with
/// CMPI_RC_ERR_NO_SUCH_PROPERTY for a property that the class does not have; with
/// CMPI_RC_ERR_INVALID_PARAMETER for a value of another type; with
/// CMPI_RC_ERR_ACCESS_DENIED or CMPI_RC_ERR_FAILED, and the reason, when the change did not
/// take place.
void modifyInstance(const Request& request, const CMPIInstance* wanted, const char** properties);

/// Why the configuration name of an interface did not become what a client wants, as far as
/// this process can see.
[[nodiscard]] Refusal whyNameUnchanged(const std::string& interfaceName, const std::string& wanted,
                                       const std::string& now);

}  // namespace ZR::DHCPClientGateway
