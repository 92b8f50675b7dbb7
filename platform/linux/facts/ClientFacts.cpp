#include "facts/ClientFacts.h"

#include <algorithm>

namespace ZR::Live {

bool ClientFacts::runs(Client client) const noexcept {
    return std::any_of(managers.begin(), managers.end(), [client](const ManagerProcess& manager) {
        return manager.client == client && manager.where != ManagerProcess::Where::Elsewhere;
    });
}

bool ClientFacts::socketsStandAlone() const noexcept {
    return !sockets.bound.empty() &&
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
