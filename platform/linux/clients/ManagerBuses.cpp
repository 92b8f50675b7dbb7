#include "clients/ManagerBuses.h"

#include <algorithm>
#include <string>
#include <utility>
#include <variant>

namespace ZR::Live {
namespace {

// A busy machine needs some of it for a manager that is well; a request waits for one that is
// not, and its snapshot then lacks what the manager knows.
constexpr std::chrono::milliseconds timeToRespond{250};
constexpr std::chrono::seconds firstPause{1};
constexpr std::chrono::seconds longestPause{30};

/// A template: where the build does not ask networkd, this is not to need what does.
template <bool asked>
std::string_view addNetworkd(std::string_view json, ClientFacts& facts) {
    const auto parsed = parseNetworkdDescription(json);
    if (const auto* const reason = std::get_if<std::string_view>(&parsed)) {
        return *reason;
    }
    addNetworkdDescription(std::get<NetworkdDescription>(parsed), startOfSystem(), facts);
    return {};
}

using Adding = std::string_view (*)(std::string_view json, ClientFacts& facts);

/// What adds what a manager says; null where the build does not ask it.
template <Client manager>
constexpr Adding addingOf() {
    if constexpr (!isAskable(manager)) {
        return nullptr;
    } else if constexpr (manager == Client::Networkd) {
        return addNetworkd<isAskable(manager)>;
    } else if constexpr (manager == Client::NetworkManager) {
        return addNetworkManagerDescription;
    } else {
        static_assert(manager == Client::Connman);
        return addConnmanServices;
    }
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
    : managers_{{{Client::Networkd, std::move(ways.networkd), addingOf<Client::Networkd>()},
                 {Client::NetworkManager, std::move(ways.networkManager),
                  addingOf<Client::NetworkManager>()},
                 {Client::Connman, std::move(ways.connman), addingOf<Client::Connman>()}}} {}

/// Adds what it says; false when it says nothing that can be used.
bool ManagerBuses::hear(const Manager& manager, std::string_view json, ClientFacts& facts) {
    if (json.empty()) {
        return false;
    }
    const std::string_view reason = manager.add(json, facts);
    if (!reason.empty()) {
        facts.diagnostics.emplace_back("cannot use what " + std::string{nameOf(manager.client)} +
                                           " says: " + std::string{reason},
                                       Diagnostic::Kind::Damaged);
    }
    return reason.empty();
}

void ManagerBuses::consult(ClientFacts& facts, Time now) {
    for (Manager& manager : managers_) {
        if (!manager.ask || !isToBeAsked(facts, manager.client)) {
            continue;
        }
        if (now >= manager.rest) {
            BusResponse response = manager.ask(std::chrono::steady_clock::now() + timeToRespond);
            manager.reason = std::move(response.reason);
            if (manager.reason.empty()) {
                manager.pause = {};
                if (hear(manager, response.json, facts)) {
                    continue;
                }
            } else {
                manager.pause = std::clamp(2 * manager.pause, firstPause, longestPause);
                manager.rest = now + manager.pause;
            }
        }
        facts.unheardManagers.push_back(manager.client);
        if (!manager.reason.empty()) {
            // It does not come to an end where the build does not ask.
            facts.diagnostics.emplace_back(manager.reason, Built::has("bus")
                                                               ? Diagnostic::Kind::Unreadable
                                                               : Diagnostic::Kind::Note);
        }
    }
}

}  // namespace ZR::Live
