#include "Lease.h"

#include <algorithm>

namespace ZR::Live {

std::string_view nameOf(Client client) noexcept {
    switch (client) {
        case Client::Networkd:
            return "systemd-networkd";
        case Client::NetworkManager:
            return "NetworkManager";
        case Client::Wicked:
            return "wicked";
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
        case Client::Netplan:
            return "netplan";
        case Client::Ifupdown:
            return "ifupdown";
        case Client::Ifcfg:
            return "ifcfg";
    }
    return "unknown";
}

bool ClientFacts::runs(Client client) const noexcept {
    return std::any_of(managers.begin(), managers.end(), [client](const ManagerProcess& manager) {
        return manager.client == client && manager.where != ManagerProcess::Where::Elsewhere;
    });
}

}  // namespace ZR::Live
