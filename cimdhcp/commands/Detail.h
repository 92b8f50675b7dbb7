#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "client/ClassLookup.h"
#include "client/MachineInterfaces.h"
#include "text/Style.h"

namespace cimdhcp {

/// All that is told of one interface.
struct InterfaceDetail {
    InterfaceOverview overview;
    ServedInstances served;          ///< those of this interface alone
    std::vector<std::string> notes;  ///< of the diagnostics, those about it

    bool operator==(const InterfaceDetail&) const = default;
};

/// The interfaces of the names given, in that order; a name may have the system before it,
/// "BMC%eth0", else it means those of all systems. What the diagnostics tell of an interface is
/// moved from the machine to it, and those about others are dropped. Throws Failure for a name
/// that no interface has.
[[nodiscard]] std::vector<InterfaceDetail> detailsOf(const std::vector<std::string>& names,
                                                     const ServedInstances& served,
                                                     MachineInterfaces& machine);

/// Throws Failure: there is no such interface, but these, of which the one that was likely
/// meant is told.
[[noreturn]] void refuseInterface(const std::string& name, const std::vector<std::string>& known);

/// The interfaces in blocks for a person: what is known of each at a glance, its leases with
/// their times, and the endpoint, the servers and the setting as their classes tell them.
[[nodiscard]] std::string detailText(const std::vector<InterfaceDetail>& details, std::int64_t now,
                                     const ClassLookup& classes, std::optional<std::size_t> width,
                                     const Style& style = {});

/// As overviewJson(), each interface with "endpoint", "accessPoints" and "setting" (instances,
/// see instanceJson(); null for what no provider serves) and "notes".
[[nodiscard]] std::string detailJson(const std::vector<InterfaceDetail>& details, std::int64_t now);

}  // namespace cimdhcp
