#include "client/InterfaceState.h"

#include <algorithm>
#include <optional>

#include "zrclient/NodeLexicon.h"

namespace cimdhcp {

namespace {

using ZR::NodeLexicon::AddressSource;
using ZR::NodeLexicon::ClientState;

bool is(std::optional<std::uint64_t> number, ClientState state) {
    return number == static_cast<std::uint64_t>(state);
}

bool hasPassed(std::optional<std::int64_t> moment, std::int64_t now) {
    return moment && *moment <= now;
}

/// What a client itself, or the endpoint of it, tells.
InterfaceState told(std::optional<std::uint64_t> clientState) {
    if (is(clientState, ClientState::Bound)) {
        return InterfaceState::bound;
    }
    if (is(clientState, ClientState::Rebinding)) {
        return InterfaceState::rebinding;
    }
    const bool asks =
        is(clientState, ClientState::Init) || is(clientState, ClientState::Selecting) ||
        is(clientState, ClientState::Requesting) || is(clientState, ClientState::InitReboot) ||
        is(clientState, ClientState::Rebooting);
    return asks ? InterfaceState::asking : InterfaceState::unknown;
}

bool isIPv4(const LeaseOverview& lease) {
    return lease.family == ZR::NodeLexicon::familyIPv4;
}

/// A client that does not tell its state, nor when its lease ends: it asks for one, unless
/// the address of the interface was obtained by it, or may have been.
InterfaceState withoutTimes(const LeaseOverview& lease, const InterfaceOverview& interface) {
    const bool hasAddress = isIPv4(lease) && interface.address && !interface.address->empty();
    if (!hasAddress || (!lease.address.empty() && lease.address != interface.address)) {
        return lease.address.empty() ? InterfaceState::asking : InterfaceState::unknown;
    }
    switch (static_cast<AddressSource>(interface.addressSource.value_or(0))) {
        case AddressSource::DHCP:
        case AddressSource::BOOTP:
            return InterfaceState::bound;
        case AddressSource::Unknown:
            return InterfaceState::unknown;
        default:
            return lease.address.empty() ? InterfaceState::asking : InterfaceState::unknown;
    }
}

/// How well a lease stands for its interface.
int rankOf(const LeaseOverview& lease, const InterfaceOverview& interface) {
    constexpr int held = 4;
    constexpr int firstFamily = 2;
    return (lease.address.empty() ? 0 : held) + (isIPv4(lease) ? firstFamily : 0) +
           (!lease.address.empty() && lease.address == interface.address ? 1 : 0);
}

}  // namespace

std::string_view wordOf(InterfaceState state) noexcept {
    const auto* const found =
        std::find_if(stateWords.begin(), stateWords.end(),
                     [state](const StateWord& each) { return each.state == state; });
    return found == stateWords.end() ? stateWords.back().word : found->word;
}

const LeaseOverview* leadingLease(const InterfaceOverview& interface) noexcept {
    const LeaseOverview* leading = nullptr;
    if (interface.leases) {
        for (const LeaseOverview& lease : *interface.leases) {
            if (leading == nullptr || rankOf(lease, interface) > rankOf(*leading, interface)) {
                leading = &lease;
            }
        }
    }
    return leading;
}

InterfaceState stateOf(const LeaseOverview& lease, const InterfaceOverview& interface,
                       std::int64_t now) noexcept {
    if (hasPassed(lease.expires, now)) {
        return InterfaceState::expired;
    }
    const InterfaceState own = told(lease.clientState);
    if (own == InterfaceState::unknown && (lease.address.empty() || !lease.expires)) {
        return withoutTimes(lease, interface);
    }
    if (own != InterfaceState::bound && own != InterfaceState::unknown) {
        return own;
    }
    // Where no client runs, none asks.
    if (lease.clientRuns == false) {
        return InterfaceState::bound;
    }
    return hasPassed(lease.rebinds, now)  ? InterfaceState::rebinding
           : hasPassed(lease.renews, now) ? InterfaceState::renewing
                                          : InterfaceState::bound;
}

InterfaceState stateOf(const InterfaceOverview& interface, std::int64_t now) noexcept {
    if (!interface.dhcp) {
        return InterfaceState::unknown;
    }
    if (!*interface.dhcp) {
        return InterfaceState::off;
    }
    if (interface.active == false) {
        return InterfaceState::noLink;
    }
    if (const LeaseOverview* const lease = leadingLease(interface)) {
        return stateOf(*lease, interface, now);
    }
    // A tree that has neither a lease nor an address does not make an endpoint right.
    const bool bare = interface.leases && interface.address == "";
    return bare ? InterfaceState::unknown : told(interface.clientState);
}

}  // namespace cimdhcp
