#include "clients/ManagerBuses.h"

#include <algorithm>
#include <string>
#include <utility>
#include <variant>

namespace ZR::Live {
namespace {

constexpr std::chrono::milliseconds timeToRespond{60};
constexpr std::chrono::seconds pause{30};

std::string_view addNetworkd(std::string_view json, ClientFacts& facts) {
    const auto parsed = parseNetworkdDescription(json);
    if (const auto* const reason = std::get_if<std::string_view>(&parsed)) {
        return *reason;
    }
    addNetworkdDescription(std::get<NetworkdDescription>(parsed), startOfSystem(), facts);
    return {};
}

/// Whether there is anything that a manager could tell. networkd runs on many a machine
/// where it has no links, which its files tell.
bool isToBeAsked(const ClientFacts& facts, Client client) {
    return facts.runs(client) &&
           (client != Client::Networkd ||
            std::any_of(facts.managements.begin(), facts.managements.end(),
                        [&](const LinkConfiguration& each) { return each.client == client; }));
}

}  // namespace

ManagerBuses::ManagerBuses(Ways ways)
    : managers_{
          {{Client::Networkd, std::move(ways.networkd), addNetworkd},
           {Client::NetworkManager, std::move(ways.networkManager), addNetworkManagerDescription},
           {Client::Connman, std::move(ways.connman), addConnmanServices}}} {}

void ManagerBuses::consult(ClientFacts& facts, Time now) {
    for (Manager& manager : managers_) {
        if (!manager.ask || now < manager.rest || !isToBeAsked(facts, manager.client)) {
            continue;
        }
        const BusResponse response = manager.ask(std::chrono::steady_clock::now() + timeToRespond);
        if (!response.reason.empty()) {
            facts.diagnostics.emplace_back(response.reason);
            manager.rest = now + pause;
        } else if (!response.json.empty()) {
            const std::string_view reason = manager.add(response.json, facts);
            if (!reason.empty()) {
                facts.diagnostics.emplace_back("cannot use what " +
                                                   std::string{nameOf(manager.client)} +
                                                   " says: " + std::string{reason},
                                               Diagnostic::Kind::Damaged);
            }
        }
    }
}

}  // namespace ZR::Live
