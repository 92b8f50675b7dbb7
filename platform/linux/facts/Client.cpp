#include "facts/Client.h"

namespace ZR::Live {

std::string_view nameOf(Client client) noexcept {
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

}  // namespace ZR::Live
