#pragma once

#include <optional>
#include <string>

#include "formats/IpAddress.h"

namespace ZR::Live {

/// What the kernel was given when it asked for an address at its start (ip=). It does not
/// tell which address that was, nor on which link.
struct BootResponse {
    bool bootp = false;               ///< came by BOOTP, else by DHCP
    std::optional<IpAddress> server;  ///< of the boot files
    std::string origin{};             ///< the file that says so

    bool operator==(const BootResponse&) const = default;
};

}  // namespace ZR::Live
