#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "Machine.h"
#include "zrclient/LiveSource.h"
#include "zrclient/NodeLexicon.h"
#include "zrclient/Snapshot.h"

namespace ZR::Live {

/// What a value was taken from. All empty: the kernel's links and addresses. Borrows
/// the facts.
struct Origin {
    std::optional<Client> client;
    std::string_view file;
    std::int32_t pid = 0;  ///< of a process; 0 for none

    bool operator==(const Origin&) const = default;
};

/// For people: "dhclient /var/lib/dhcp/dhclient.leases", "dhcpcd, process 17", "kernel".
[[nodiscard]] std::string describe(const Origin& origin);

/// A value, and what it was taken from.
struct Finding {
    PropertyValue value;
    Origin origin{};
};

/// One row of the precedence table: where the value of a property may come from.
struct DecisionRow {
    NodeLexicon::Properties property;
    std::string_view reason;
    /// nullopt: this row cannot tell, the next one of the property is asked.
    std::optional<Finding> (*answer)(const InterfaceView& view);
};

/// The precedence table: of each property the first row that answers counts. A
/// property that no row answers is left out.
[[nodiscard]] std::span<const DecisionRow> precedence();

/// A property that was decided, and why so. Borrows the facts.
struct Decision {
    NodeLexicon::Properties property{};
    PropertyValue value;
    std::string_view reason;
    Origin origin{};

    bool operator==(const Decision&) const = default;
};

/// Decides all properties of one interface, in the order of the table.
[[nodiscard]] std::vector<Decision> decide(InterfaceView view);

/// The tree of a machine: the computer, its network, and the interfaces in it; behind
/// it the service processor, where there is one; and what could not be read as remarks.
/// Depends on nothing but the facts and the time, in seconds since the epoch.
[[nodiscard]] std::shared_ptr<const Snapshot> decide(MachineFacts facts, std::int64_t now,
                                                     Explain explain = Explain::No);

}  // namespace ZR::Live
