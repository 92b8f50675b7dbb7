#pragma once

#include <array>
#include <cstdint>
#include <string_view>

#include "client/MachineInterfaces.h"

namespace cimdhcp {

/// The state of an interface's DHCP client.
enum class InterfaceState : std::uint8_t {
    off,
    noLink,
    asking,
    bound,
    renewing,
    rebinding,
    expired,
    unknown,
};

struct StateWord {
    InterfaceState state;
    std::string_view word;
    std::string_view meaning;  ///< for the help and the manual page
};

/// Every state with its word, in the order of a lease's life. No other words are shown.
inline constexpr std::array<StateWord, 8> stateWords{{
    {InterfaceState::off, "off", "DHCP is off: no client has the interface"},
    {InterfaceState::noLink, "no link", "DHCP is on, and the link is down or without a cable"},
    {InterfaceState::asking, "asking", "a client asks for a lease, and has none"},
    {InterfaceState::bound, "bound", "there is a lease"},
    {InterfaceState::renewing, "renewing", "there is one; the client asks its server to extend it"},
    {InterfaceState::rebinding, "rebinding",
     "there is one; the client asks any server to extend it"},
    {InterfaceState::expired, "expired", "the lease has ended"},
    {InterfaceState::unknown, "?", "not known; standard error tells more"},
}};

[[nodiscard]] std::string_view wordOf(InterfaceState state) noexcept;

/// The lease that stands for the interface: one that is held rather than one that is asked
/// for, IPv4 rather than IPv6, that of the interface's own address rather than another.
/// Null when there is none or none is known. Lives as long as the interface.
[[nodiscard]] const LeaseOverview* leadingLease(const InterfaceOverview& interface) noexcept;

/// The state of one lease of the interface. `now` in seconds since the epoch. The value map
/// of CIM's ClientState has no client that renews: this follows from the lease's times.
[[nodiscard]] InterfaceState stateOf(const LeaseOverview& lease, const InterfaceOverview& interface,
                                     std::int64_t now) noexcept;

/// The state of the interface: that of its leading lease, unless DHCP is off or the link is
/// down; where leases are not known, what the classes tell.
[[nodiscard]] InterfaceState stateOf(const InterfaceOverview& interface, std::int64_t now) noexcept;

}  // namespace cimdhcp
