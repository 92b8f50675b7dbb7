#pragma once

#include <algorithm>
#include <cstdint>

#include "facts/ClientFacts.h"

namespace ZR::Live {

/// The process number of a manager that runs for this network namespace; 0 for none.
[[nodiscard]] inline std::int32_t pidOfManager(const ClientFacts& facts, Client client) {
    const auto found = std::find_if(
        facts.managers.begin(), facts.managers.end(), [&](const ManagerProcess& manager) {
            return manager.client == client && manager.where != ManagerProcess::Where::Elsewhere;
        });
    return found == facts.managers.end() ? 0 : found->pid;
}

}  // namespace ZR::Live
