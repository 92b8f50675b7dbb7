// The settings of a service of connman, and what the kernel tells of its own DHCP.
#include "clients/Connman.h"

#include "Input.h"
#include "configuration/ConfigurationFiles.h"
#include "support/Texts.h"

namespace {

void checkSettings(std::string_view text) {
    const auto settings = ZR::Live::parseConnmanSettings(text);
    fuzz::require(!settings.lastAddress || settings.lastAddress->isIPv4(),
                  "what was leased is an IPv4 address");
    const std::string again =
        std::string("[wifi]\nIPv4.method=") + (settings.dhcp4 ? "dhcp" : "manual") +
        "\nIPv4.DHCP.LastAddress=" + fuzz::textOf(settings.lastAddress) + '\n';
    fuzz::require(ZR::Live::parseConnmanSettings(again) == settings,
                  "settings survive being written");
}

void checkKernel(std::string_view text) {
    const auto response = ZR::Live::parseKernelBoot(text);
    if (!response) {
        return;
    }
    fuzz::require(!response->server || response->server->isIPv4(), "a server is an IPv4 address");
    const std::string again = std::string("#PROTO: ") + (response->bootp ? "BOOTP" : "DHCP") +
                              "\nbootserver " + fuzz::textOf(response->server) + '\n';
    fuzz::require(ZR::Live::parseKernelBoot(again) == response,
                  "a response survives being written");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text = fuzz::text(data, size);
    checkSettings(text);
    checkKernel(text);
    return 0;
}
