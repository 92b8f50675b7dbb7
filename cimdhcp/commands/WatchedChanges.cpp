#include "commands/WatchedChanges.h"

#include <algorithm>
#include <map>
#include <utility>

#include "client/InterfaceState.h"
#include "text/DisplayText.h"
#include "text/Times.h"
#include "zrclient/NodeLexicon.h"

namespace cimdhcp {

namespace {

// Seconds that a client and its server may take over a renewal, and its files to show it.
constexpr std::int64_t timeToRenew = 3;
// Some clients' times are told as a distance from now, which rounds to either side.
constexpr std::int64_t rounding = 1;

std::string wordOfLease(const LeaseOverview& lease, const InterfaceOverview& interface,
                        std::int64_t now) {
    InterfaceState state = stateOf(lease, interface, now);
    const bool asksAgain = state == InterfaceState::renewing || state == InterfaceState::rebinding;
    if (asksAgain && lease.expires.value_or(now + 1) > now) {
        state = stateOf(lease, interface, now - timeToRenew);
    }
    return std::string(wordOf(state));
}

WatchedState watchedLease(const LeaseOverview& lease, const InterfaceOverview& interface,
                          std::int64_t now) {
    WatchedState state{lease.family,  wordOfLease(lease, interface, now),
                       lease.address, lease.server,
                       lease.client,  lease.obtained,
                       lease.expires};
    if (state.server.empty() && !lease.address.empty() && interface.servers &&
        interface.servers->size() == 1) {
        state.server = interface.servers->front();
    }
    return state;
}

/// Of an interface of which no lease is known.
WatchedState withoutLease(const InterfaceOverview& interface, std::int64_t now) {
    WatchedState state;
    const InterfaceState word = stateOf(interface, now);
    state.word = wordOf(word);
    if (word == InterfaceState::bound) {
        state.address = interface.address.value_or("");
        if (interface.servers && !interface.servers->empty()) {
            state.server = interface.servers->front();
        }
    }
    return state;
}

std::vector<WatchedState> statesOf(const InterfaceOverview& interface, std::int64_t now) {
    std::vector<WatchedState> states;
    const InterfaceState word = stateOf(interface, now);
    const bool leases = interface.dhcp == true && interface.leases && !interface.leases->empty() &&
                        word != InterfaceState::noLink;
    if (!leases) {
        return {withoutLease(interface, now)};
    }
    for (const char* family : {ZR::NodeLexicon::familyIPv4, ZR::NodeLexicon::familyIPv6}) {
        InterfaceOverview ofFamily = interface;
        std::erase_if(*ofFamily.leases,
                      [family](const LeaseOverview& lease) { return lease.family != family; });
        if (const LeaseOverview* const lease = leadingLease(ofFamily)) {
            states.push_back(watchedLease(*lease, interface, now));
        }
    }
    return states.empty() ? std::vector{withoutLease(interface, now)} : states;
}

using ById = std::map<std::pair<std::string_view, std::string_view>, const WatchedInterface*>;

ById byId(std::span<const WatchedInterface> all) {
    ById found;
    for (const WatchedInterface& each : all) {
        found.emplace(std::pair(std::string_view(each.id.system), std::string_view(each.id.name)),
                      &each);
    }
    return found;
}

const WatchedState* find(const std::vector<WatchedState>& states, const std::string& family) {
    const auto found =
        std::find_if(states.begin(), states.end(),
                     [&family](const WatchedState& each) { return each.family == family; });
    return found == states.end() ? nullptr : &*found;
}

WatchedState only(std::string_view word, const std::string& family = "") {
    WatchedState state;
    state.family = family;
    state.word = word;
    return state;
}

/// What one side lacks has not changed, as far as is known.
bool differ(const std::string& one, const std::string& other) {
    return !one.empty() && !other.empty() && one != other;
}

bool later(std::optional<std::int64_t> before, std::optional<std::int64_t> after) {
    return before && after && *after > *before + rounding;
}

/// What tells when a lease began may come some moments after the address.
bool renewed(const WatchedState& before, const WatchedState& after) {
    return before.obtained ? later(before.obtained, after.obtained)
                           : !after.obtained && later(before.expires, after.expires);
}

/// A server that was not known at first is told when it is.
bool hasOtherServer(const WatchedState& before, const WatchedState& after) {
    return !after.server.empty() && before.server != after.server;
}

bool differ(const WatchedState& before, const WatchedState& after) {
    return before.word != after.word || before.address != after.address ||
           hasOtherServer(before, after) || differ(before.client, after.client) ||
           renewed(before, after);
}

/// A side without leases stands for the first family of the other one.
void addChanges(const InterfaceId& id, const std::vector<WatchedState>& before,
                const std::vector<WatchedState>& after, std::vector<WatchedChange>& changes) {
    const auto add = [&](const WatchedState& was, const WatchedState& is) {
        if (differ(was, is)) {
            changes.push_back({id, was, is});
        }
    };
    const bool leasesBefore = !before.front().family.empty();
    const bool leasesAfter = !after.front().family.empty();
    if (!leasesBefore) {
        add(before.front(), after.front());
        for (std::size_t i = 1; i < after.size(); ++i) {
            add(only(noLease, after[i].family), after[i]);
        }
        return;
    }
    for (const WatchedState& was : before) {
        const WatchedState* const is = leasesAfter ? find(after, was.family) : &after.front();
        add(was, is == nullptr ? only(noLease, was.family) : *is);
    }
    for (const WatchedState& is : after) {
        if (leasesAfter && find(before, is.family) == nullptr) {
            add(only(noLease, is.family), is);
        }
    }
}

std::string with(const std::string& text, const char* word, const std::string& what) {
    return what.empty() ? text : text + (text.empty() ? "" : " ") + word + printable(what);
}

std::string untilText(const WatchedState& state) {
    if (!state.expires) {
        return "";
    }
    return *state.expires >= static_cast<std::int64_t>(ZR::NodeLexicon::never)
               ? ", without an end"
               : " until " + isoText(*state.expires);
}

Json stateJson(const WatchedState& state) {
    if (state.word == absentInterface) {
        return nullptr;
    }
    const bool known = state.word != wordOf(InterfaceState::unknown);
    return JsonMembers{{"state", known ? Json(state.word) : Json(nullptr)},
                       {"address", textOrNull(state.address)},
                       {"server", textOrNull(state.server)},
                       {"client", textOrNull(state.client)},
                       {"expires", state.expires ? Json(isoText(*state.expires)) : Json(nullptr)}};
}

}  // namespace

std::vector<WatchedInterface> watchedStates(std::span<const InterfaceOverview> interfaces,
                                            std::int64_t now) {
    std::vector<WatchedInterface> watched;
    watched.reserve(interfaces.size());
    for (const InterfaceOverview& interface : interfaces) {
        watched.push_back({{interface.system, interface.name}, statesOf(interface, now)});
    }
    return watched;
}

std::optional<std::int64_t> nextStates(std::span<const InterfaceOverview> interfaces,
                                       std::int64_t now) {
    std::optional<std::int64_t> next;
    const auto consider = [&](std::optional<std::int64_t> moment, std::int64_t delay) {
        if (moment && *moment + delay > now && (!next || *moment + delay < *next)) {
            next = *moment + delay;
        }
    };
    for (const InterfaceOverview& interface : interfaces) {
        if (!interface.leases) {
            continue;
        }
        for (const LeaseOverview& lease : *interface.leases) {
            consider(lease.renews, timeToRenew);
            consider(lease.rebinds, timeToRenew);
            consider(lease.expires, 0);
        }
    }
    return next;
}

std::vector<WatchedChange> changesBetween(std::span<const WatchedInterface> before,
                                          std::span<const WatchedInterface> after) {
    const std::vector<WatchedState> absent{only(absentInterface)};
    std::vector<WatchedChange> changes;
    const ById former = byId(before);
    ById gone = former;
    for (const WatchedInterface& is : after) {
        const std::pair<std::string_view, std::string_view> id(is.id.system, is.id.name);
        const auto was = former.find(id);
        addChanges(is.id, was == former.end() ? absent : was->second->states, is.states, changes);
        gone.erase(id);
    }
    for (const WatchedInterface& was : before) {
        if (gone.contains({was.id.system, was.id.name})) {
            addChanges(was.id, was.states, absent, changes);
        }
    }
    return changes;
}

std::string changeText(const WatchedChange& change, std::string_view arrow) {
    const auto& [id, before, after] = change;
    const std::string to = ' ' + std::string(arrow) + ' ';
    std::string text = printable(id.name);
    text += (id.system == hostSystem ? "  " : " (" + printable(id.system) + ")  ") + before.word;
    if (before.word != after.word) {
        text = with(text, "", before.address) + to + after.word;
        if (after.address.empty() || after.address == before.address) {
            return text;
        }
        return with(with(text, "", after.address), "from ", after.server);
    }
    if (before.address != after.address) {
        const std::string none = "no address";
        text += ' ' + (before.address.empty() ? none : printable(before.address)) + to;
        return after.address.empty() ? text + none
                                     : with(text + printable(after.address), "from ", after.server);
    }
    text = with(text, "", before.address);
    if (differ(before.client, after.client)) {
        return with(text, "by ", before.client) + to + "by " + printable(after.client);
    }
    if (hasOtherServer(before, after)) {
        return with(text, "from ", before.server) + to + "from " + printable(after.server);
    }
    return text + ", renewed" + untilText(after);
}

JsonMembers changeJson(const WatchedChange& change) {
    const std::string& family =
        change.after.family.empty() ? change.before.family : change.after.family;
    return {{"interface", change.id.name},
            {"system", change.id.system},
            {"family", textOrNull(family)},
            {"before", stateJson(change.before)},
            {"after", stateJson(change.after)}};
}

}  // namespace cimdhcp
