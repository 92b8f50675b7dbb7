#include "clients/Lease.h"

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

bool ClientProcess::serves(std::string_view interface) const noexcept {
    return interfaces.empty() ||
           std::find(interfaces.begin(), interfaces.end(), interface) != interfaces.end();
}

bool ClientFacts::runs(Client client) const noexcept {
    return std::any_of(managers.begin(), managers.end(), [client](const ManagerProcess& manager) {
        return manager.client == client && manager.where != ManagerProcess::Where::Elsewhere;
    });
}

bool ClientFacts::socketsStandAlone() const noexcept {
    return !sockets.empty() &&
           std::none_of(processes.begin(), processes.end(),
                        [](const ClientProcess& process) { return !process.ipv6; }) &&
           std::none_of(managers.begin(), managers.end(), [](const ManagerProcess& manager) {
               return manager.where != ManagerProcess::Where::Elsewhere;
           });
}

bool ClientFacts::runsElsewhere(Client client) const noexcept {
    return !runs(client) &&
           std::any_of(managers.begin(), managers.end(), [client](const ManagerProcess& manager) {
               return manager.client == client;
           });
}

}  // namespace ZR::Live
