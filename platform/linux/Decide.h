#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "Machine.h"
#include "Precedence.h"
#include "zrclient/NodeLexicon.h"
#include "zrclient/Snapshot.h"
#include "zrlinux/LiveSource.h"

namespace ZR::Live {

/// A property that was decided, and why so. Borrows the facts.
struct Decision {
    NodeLexicon::Properties property{};
    PropertyValue value;
    std::string_view reason;
    Origin origin{};

    bool operator==(const Decision&) const = default;
};

/// For people: "dhclient /var/lib/dhcp/dhclient.leases", "dhcpcd, process 17", "kernel".
[[nodiscard]] std::string describe(const Origin& origin);

/// Decides all properties of one interface, in the order of the table.
[[nodiscard]] std::vector<Decision> decide(InterfaceView view);

/// The decision on a property; null when it was left out.
[[nodiscard]] const Decision* decisionOn(NodeLexicon::Properties property,
                                         const std::vector<Decision>& decisions);

/// The tree of a machine: the computer, its network, the interfaces in it, and below each its
/// leases; behind it the service processor, where there is one; and what could not be read,
/// or is not as it looks, as diagnostics. Depends on nothing but the facts and their time.
[[nodiscard]] std::shared_ptr<const Snapshot> decide(const Machine& machine,
                                                     Explain explain = Explain::No);

/// A machine, and the tree that was decided of it without explanations.
struct Decided {
    std::unique_ptr<const Machine> machine;
    std::shared_ptr<const Snapshot> tree;
};

/// The same tree. What did not change since another time, as is most of a machine with
/// thousands of links, is taken from what was decided then.
[[nodiscard]] Decided decide(std::unique_ptr<const Machine> machine, const Decided& before);

/// The same as of a machine of these facts. `now`: seconds since the epoch.
[[nodiscard]] std::shared_ptr<const Snapshot> decide(MachineFacts facts, std::int64_t now,
                                                     Explain explain = Explain::No);

}  // namespace ZR::Live
