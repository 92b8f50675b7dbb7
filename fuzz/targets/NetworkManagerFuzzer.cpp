// The state files and connection profiles of NetworkManager, and the names of the lease
// files of its built-in client; what is in those has the form of networkd's.
#include "clients/NetworkManager.h"

#include "Input.h"
#include "support/Texts.h"

namespace {

void checkDevice(std::string_view text) {
    const auto device = ZR::Live::parseNetworkManagerDevice(text);
    std::string again = std::string("[device]\nmanaged=") + (device.managed ? "true" : "false") +
                        "\nconnection-uuid=" + device.profile + '\n';
    for (const auto& [name, value] : device.options4) {
        again += "[dhcp4]\ndhcp4." + name + '=' + value + '\n';
    }
    for (const auto& [name, value] : device.options6) {
        again += "[dhcp6]\ndhcp6." + name + '=' + value + '\n';
    }
    const auto lease4 = ZR::Live::networkManagerLease4(device.options4);
    fuzz::require(!lease4 || lease4->address.isIPv4(), "a DHCPv4 lease has an IPv4 address");
    const auto lease6 = ZR::Live::networkManagerLease6(device.options6);
    fuzz::require(!lease6 || !lease6->address.isIPv4(), "a DHCPv6 lease has an IPv6 address");
    fuzz::require(ZR::Live::parseNetworkManagerDevice(again) == device,
                  "a device survives being written");
}

void checkProfile(std::string_view text) {
    const auto profile = ZR::Live::parseNetworkManagerProfile(text);
    std::string again = "[connection]\nuuid=" + profile.uuid +
                        "\ninterface-name=" + fuzz::textOf(profile.interfaceName) +
                        "\n[ipv4]\nmethod=" + profile.method4 + '\n';
    std::size_t number = 1;
    for (const auto& address : profile.addresses4) {
        fuzz::require(address.isIPv4(), "a fixed address is one of IPv4");
        again +=
            "address" + std::to_string(number++) + '=' + fuzz::textOf(address) + "/24,192.0.2.1\n";
    }
    again += "[ipv6]\nmethod=" + profile.method6 +
             "\n[.nmmeta]\nexternal=" + (profile.external ? "true" : "false") + '\n';
    fuzz::require(ZR::Live::parseNetworkManagerProfile(again) == profile,
                  "a profile survives being written");
}

void checkName(std::string_view name) {
    if (const auto interface = ZR::Live::internalLeaseInterface(name)) {
        fuzz::require(name.ends_with('-' + fuzz::textOf(interface) + ".lease"),
                      "the name tells the interface");
    }
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text = fuzz::text(data, size);
    checkDevice(text);
    checkProfile(text);
    checkName(text);
    return 0;
}
