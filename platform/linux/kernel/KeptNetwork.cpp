#include "kernel/KeptNetwork.h"

#include <algorithm>
#include <cstdint>
#include <iterator>
#include <set>
#include <vector>

#include "kernel/InterfaceRules.h"

namespace ZR::Live {
namespace {

// Asking for one link costs about as much as eight of a dump.
constexpr std::size_t dumpedForOne = 8;

constexpr auto indexOf = [](const auto& fact) { return fact.ifindex; };

template <typename Fact>
void replaceLink(std::vector<Fact>& facts, std::uint32_t ifindex, std::vector<Fact>& now) {
    const auto first = std::ranges::lower_bound(facts, ifindex, {}, indexOf);
    const auto last = std::ranges::upper_bound(first, facts.end(), ifindex, {}, indexOf);
    // Most often it is as many as before, and nothing behind them needs to move.
    const auto common = std::min(last - first, std::ssize(now));
    const auto place = std::move(now.begin(), now.begin() + common, first);
    if (place != last) {
        facts.erase(place, last);
    } else {
        facts.insert(place, std::move_iterator(now.begin() + common),
                     std::move_iterator(now.end()));
    }
}

/// Where the far end of a cable lies may change without a message about the near end, and
/// counts where cables are the way out.
bool hasOnlyCables(const NetworkState& state) {
    WayOut wayOut;
    for (const Link& link : state.links) {
        wayOut.add(link, false);
    }
    return wayOut.mayBeByCable();
}

}  // namespace

NetworkState KeptNetwork::read(const NetworkChanges& changes, Deadline deadline) {
    // Until all is done nothing is kept, whatever ends this early.
    std::optional<NetworkState> state = std::exchange(kept_, std::nullopt);
    if (!state || changes.all || !update(*state, changes, deadline)) {
        state = readAll(deadline);
    }
    if (state->certain && state->links.size() >= fewest_ && !hasOnlyCables(*state)) {
        kept_ = state;
    }
    return *std::move(state);
}

NetworkState KeptNetwork::readAll(Deadline deadline) {
    NetworkState state = reader_.read(deadline);
    std::ranges::stable_sort(state.links, {}, indexOf);
    std::ranges::stable_sort(state.addresses, {}, indexOf);
    return state;
}

/// False where it is better, or necessary, to read all.
bool KeptNetwork::update(NetworkState& state, const NetworkChanges& changes, Deadline deadline) {
    std::set<std::uint32_t> asked = changes.links;
    for (const Address& address : state.addresses) {
        // What is left of its time.
        if (address.validLifetime != Address::infinite) {
            asked.insert(address.ifindex);
        }
    }
    if (asked.size() * dumpedForOne > state.links.size()) {
        return false;
    }
    for (const std::uint32_t ifindex : asked) {
        std::optional<NetworkState> now = reader_.readLink(ifindex, deadline);
        if (!now) {
            return false;
        }
        replaceLink(state.links, ifindex, now->links);
        replaceLink(state.addresses, ifindex, now->addresses);
    }
    return true;
}

}  // namespace ZR::Live
