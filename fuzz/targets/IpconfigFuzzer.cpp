// What ipconfig of klibc leaves.
#include "clients/Ipconfig.h"

#include "Input.h"
#include "support/Texts.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    using Protocol = ZR::Live::IpconfigResult::Protocol;
    const auto result = ZR::Live::parseIpconfig(fuzz::text(data, size));
    for (const auto& address : {result.address, result.server}) {
        fuzz::require(!address || (address->isIPv4() && !address->isUnspecified()),
                      "an address is one of IPv4, and not that which stands for none");
    }
    const std::string again =
        fuzz::shellLine("DEVICE", fuzz::textOf(result.interfaceName)) +
        fuzz::shellLine("PROTO", result.protocol == Protocol::Dhcp    ? "dhcp"
                                 : result.protocol == Protocol::Bootp ? "bootp"
                                                                      : "none") +
        fuzz::shellLine("IPV4ADDR", fuzz::textOf(result.address)) +
        fuzz::shellLine("ROOTSERVER", result.server ? fuzz::textOf(result.server) : "0.0.0.0") +
        fuzz::shellLine("DHCPLEASETIME", std::to_string(result.leaseTime)) +
        fuzz::shellLine("UPTIME", result.uptime ? std::to_string(*result.uptime) : "");
    fuzz::require(ZR::Live::parseIpconfig(again) == result, "a result survives being written");
    return 0;
}
