#pragma once

#include <string>

#include "providerutilities/Refusal.h"

namespace ZR::DHCPClientGateway {

/// Why the configuration name of an interface did not become what a client wants, as far as
/// this process can see.
[[nodiscard]] Refusal whyNameUnchanged(const std::string& interfaceName, const std::string& wanted,
                                       const std::string& now);

}  // namespace ZR::DHCPClientGateway
