#pragma once

#include <array>
#include <memory>
#include <string_view>

#include "formats/Files.h"
#include "ipmi/IpmiTransport.h"

namespace ZR::Live {

/// Where the kernel's IPMI device interface shows the first service processor; which
/// of the names there is, is a matter of the device manager.
inline constexpr std::array<std::string_view, 3> ipmiDevices{"/dev/ipmi0", "/dev/ipmi/0",
                                                             "/dev/ipmidev/0"};

/// The way through the kernel's IPMI device interface (linux/ipmi.h), which needs
/// root. The driver makes the device only once a processor has responded to it.
[[nodiscard]] std::unique_ptr<IpmiTransport> ipmiDevice(const Roots& roots);

}  // namespace ZR::Live
