#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "client/MachineInterfaces.h"
#include "text/JsonText.h"

namespace cimdhcp {

/// The words of stateWords, and these two.
inline constexpr std::string_view absentInterface = "absent";  ///< there is no such interface
inline constexpr std::string_view noLease = "none";            ///< no lease of the family

/// What is watched of one interface, or of its leases of one family.
struct WatchedState {
    std::string family;  ///< empty: of the interface as such, which has no lease
    std::string word;
    std::string address;  ///< empty: there is none, or it is not known; so for the others
    std::string server;
    std::string client;
    std::optional<std::int64_t> obtained;  ///< seconds since the epoch
    std::optional<std::int64_t> expires;   ///< the same; NodeLexicon::never: it has no end

    bool operator==(const WatchedState&) const = default;
};

struct WatchedInterface {
    InterfaceId id;
    std::vector<WatchedState> states;  ///< at least one; each family stands once

    bool operator==(const WatchedInterface&) const = default;
};

/// What is watched of interfaces, in their order. A client that asks its server in time
/// hears from it at once: that it renews is told when it has had no success for a while.
[[nodiscard]] std::vector<WatchedInterface> watchedStates(
    std::span<const InterfaceOverview> interfaces, std::int64_t now);

/// The next moment at which the states become others, though nothing happens; none: never.
[[nodiscard]] std::optional<std::int64_t> nextStates(std::span<const InterfaceOverview> interfaces,
                                                     std::int64_t now);

struct WatchedChange {
    InterfaceId id;
    WatchedState before;
    WatchedState after;

    bool operator==(const WatchedChange&) const = default;
};

/// In the order of the interfaces; those that are gone come last.
[[nodiscard]] std::vector<WatchedChange> changesBetween(std::span<const WatchedInterface> before,
                                                        std::span<const WatchedInterface> after);

/// "eth0  bound 192.0.2.17 -> 192.0.2.40 from 192.0.2.1", printable and without a line feed.
[[nodiscard]] std::string changeText(const WatchedChange& change, std::string_view arrow);

/// "interface", "system", "family", "before" and "after", each of the latter {"state",
/// "address", "server", "client", "expires"}, or null for an interface that is not there.
/// What is not known is null.
[[nodiscard]] JsonMembers changeJson(const WatchedChange& change);

}  // namespace cimdhcp
