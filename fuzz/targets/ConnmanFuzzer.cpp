// The settings of a service of connman, and what the kernel tells of its own DHCP.
#include "clients/Connman.h"

#include "Input.h"
#include "configuration/KernelBoot.h"
#include "support/Addresses.h"

namespace {

void checkSettings(std::string_view text) {
    const auto settings = ZR::Live::parseConnmanSettings(text);
    fuzz::require(settings.lastAddress.empty() || fuzz::isAddress(AF_INET, settings.lastAddress),
                  "what was leased is an address");
    const std::string again = std::string("[wifi]\nIPv4.method=") +
                              (settings.dhcp4 ? "dhcp" : "manual") +
                              "\nIPv4.DHCP.LastAddress=" + settings.lastAddress + '\n';
    fuzz::require(ZR::Live::parseConnmanSettings(again) == settings,
                  "settings survive being written");
}

void checkKernel(std::string_view text) {
    const auto answer = ZR::Live::parseKernelBoot(text);
    if (!answer) {
        return;
    }
    fuzz::require(answer->server.empty() || fuzz::isAddress(AF_INET, answer->server),
                  "a server is an address");
    const std::string again = std::string("#PROTO: ") + (answer->bootp ? "BOOTP" : "DHCP") +
                              "\nbootserver " + answer->server + '\n';
    fuzz::require(ZR::Live::parseKernelBoot(again) == answer,
                  "what the kernel was told survives being written");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text = fuzz::text(data, size);
    checkSettings(text);
    checkKernel(text);
    return 0;
}
