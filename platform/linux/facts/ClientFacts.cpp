#include "facts/ClientFacts.h"

#include <algorithm>

namespace ZR::Live {

bool ClientFacts::runs(Client client) const noexcept {
    return std::any_of(managers.begin(), managers.end(), [client](const ManagerProcess& manager) {
        return manager.client == client && manager.where != ManagerProcess::Where::Elsewhere;
    });
}

bool ClientFacts::runsElsewhere(Client client) const noexcept {
    return !runs(client) &&
           std::any_of(managers.begin(), managers.end(), [client](const ManagerProcess& manager) {
               return manager.client == client;
           });
}

std::int32_t pidOfManager(const ClientFacts& facts, Client client) {
    const auto found = std::find_if(
        facts.managers.begin(), facts.managers.end(), [&](const ManagerProcess& manager) {
            return manager.client == client && manager.where != ManagerProcess::Where::Elsewhere;
        });
    return found == facts.managers.end() ? 0 : found->pid;
}

}  // namespace ZR::Live
