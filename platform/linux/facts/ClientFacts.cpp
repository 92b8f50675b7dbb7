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

}  // namespace ZR::Live
