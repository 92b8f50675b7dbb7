// What ipconfig of klibc leaves.
#include "clients/Ipconfig.h"

#include "Input.h"
#include "support/Addresses.h"
#include "support/ShellText.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    using Protocol = ZR::Live::IpconfigResult::Protocol;
    const auto result = ZR::Live::parseIpconfig(fuzz::text(data, size));
    for (const std::string& address : {result.address, result.server}) {
        fuzz::require(
            address.empty() || (fuzz::isAddress(AF_INET, address) && address != "0.0.0.0"),
            "an address is one, and not that which stands for none");
    }
    const std::string again =
        fuzz::shellLine("DEVICE", result.interfaceName) +
        fuzz::shellLine("PROTO", result.protocol == Protocol::Dhcp    ? "dhcp"
                                 : result.protocol == Protocol::Bootp ? "bootp"
                                                                      : "none") +
        fuzz::shellLine("IPV4ADDR", result.address) +
        fuzz::shellLine("ROOTSERVER", result.server.empty() ? "0.0.0.0" : result.server) +
        fuzz::shellLine("DHCPLEASETIME", std::to_string(result.leaseTime));
    fuzz::require(ZR::Live::parseIpconfig(again) == result, "a result survives being written");
    return 0;
}
