// The state files and connection profiles of NetworkManager, and the names of the lease
// files of its built-in client; what is in those has the form of networkd's.
#include "clients/NetworkManager.h"

#include "Input.h"
#include "support/Addresses.h"

namespace {

void checkDevice(std::string_view text) {
    const auto device = ZR::Live::parseNetworkManagerDevice(text);
    std::string again = std::string("[device]\nmanaged=") + (device.managed ? "true" : "false") +
                        "\nconnection-uuid=" + device.profile + '\n';
    if (device.dhcp4) {
        again += "[dhcp4]\ndhcp4.ip_address=" + fuzz::textOf(device.address4) +
                 "\ndhcp4.dhcp_server_identifier=" + fuzz::textOf(device.server4) + '\n';
        again += "dhcp4.expiry=" + std::to_string(device.expires4) + '\n';
    }
    again += device.dhcp6 ? "[dhcp6]\nwhatever=1\n" : "";
    fuzz::require(device.dhcp4 || (!device.address4 && !device.server4),
                  "only a lease has an address");
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
