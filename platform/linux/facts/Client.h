#pragma once

#include <cstdint>
#include <string_view>

#include "zrcommon/BuiltSources.h"

namespace ZR::Live {

/// The programs whose state is read. One source file each, which a build can be without.
enum class Client : std::uint8_t {
    Networkd,
    NetworkManager,
    Wicked,
    Connman,
    Dhclient,
    Dhcpcd,
    Udhcpc,
    Dhcp6c,
    Ipconfig,
    KernelBoot,
    Netplan,
    Ifupdown,
    Ifcfg,
};

/// The name by which people know a program.
[[nodiscard]] constexpr std::string_view nameOf(Client client) noexcept {
    switch (client) {
        case Client::Networkd:
            return "systemd-networkd";
        case Client::NetworkManager:
            return "NetworkManager";
        case Client::Wicked:
            return "wicked";
        case Client::Connman:
            return "connman";
        case Client::Dhclient:
            return "dhclient";
        case Client::Dhcpcd:
            return "dhcpcd";
        case Client::Udhcpc:
            return "udhcpc";
        case Client::Dhcp6c:
            return "dhcp6c";
        case Client::Ipconfig:
            return "ipconfig";
        case Client::KernelBoot:
            return "kernel ip=";
        case Client::Netplan:
            return "netplan";
        case Client::Ifupdown:
            return "ifupdown";
        case Client::Ifcfg:
            return "ifcfg";
    }
    return "unknown";
}

/// Whether the build has what reads the state of a program.
[[nodiscard]] constexpr bool isBuilt(Client client) {
    return Built::has(client == Client::KernelBoot ? "kernel-ip" : nameOf(client));
}

}  // namespace ZR::Live
