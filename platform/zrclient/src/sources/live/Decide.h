#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "Address.h"
#include "Lease.h"
#include "Link.h"
#include "ServiceProcessor.h"
#include "zrclient/NodeLexicon.h"
#include "zrclient/Snapshot.h"

namespace ZR::Live {

/// Everything that was read of the machine.
struct MachineFacts {
    std::string hostName;
    std::vector<Link> links;
    std::vector<Address> addresses;
    std::vector<Lease> leases;
    std::vector<Management> managements;
    std::vector<ClientProcess> processes;
    std::optional<ServiceProcessor> serviceProcessor = std::nullopt;

    bool operator==(const MachineFacts&) const = default;
};

/// The facts that concern one interface. Borrows them.
struct InterfaceView {
    const Link* link = nullptr;
    std::span<const Address> addresses;  ///< of all families, in the kernel's order
    std::vector<const Lease*> leases;    ///< live ones of IPv4, those of running clients first
    const Management* management = nullptr;
    bool enslaved = false;
    bool dhcp4Process = false;         ///< a DHCPv4 client runs on the link
    bool dhcp6Process = false;         ///< a DHCPv6 client runs on the link
    const Address* address = nullptr;  ///< the one that was decided on
};

/// One row of the precedence table: where the value of a property may come from.
struct DecisionRow {
    NodeLexicon::Properties property;
    std::string_view reason;
    /// nullopt: this row cannot tell, the next one of the property is asked.
    std::optional<PropertyValue> (*answer)(const InterfaceView& view);
};

/// The precedence table: of each property the first row that answers counts. A
/// property that no row answers is left out.
[[nodiscard]] std::span<const DecisionRow> precedence();

/// A property that was decided, and why so.
struct Decision {
    NodeLexicon::Properties property{};
    PropertyValue value;
    std::string_view reason;

    bool operator==(const Decision&) const = default;
};

/// All facts arranged by interface, in the order of their indexes.
///
/// A lease is live when its link exists, it was not released, its end lies in the
/// future, and the kernel has its address on that very link. The last of these
/// removes every stale claim: files outlive all else.
class Machine {
  public:
    /// `now`: seconds since the epoch.
    Machine(MachineFacts facts, std::int64_t now);
    Machine(const Machine&) = delete;  // the views point into the facts
    Machine& operator=(const Machine&) = delete;
    ~Machine() = default;

    /// Decides all properties of one interface, in the order of the table.
    [[nodiscard]] static std::vector<Decision> decide(InterfaceView view);

    [[nodiscard]] std::span<const InterfaceView> interfaces() const { return views_; }
    [[nodiscard]] const std::string& hostName() const { return facts_.hostName; }
    [[nodiscard]] const std::optional<ServiceProcessor>& serviceProcessor() const {
        return facts_.serviceProcessor;
    }

  private:
    void collectLeases(std::int64_t now);
    void collectClients();
    InterfaceView* find(std::uint32_t ifindex);
    InterfaceView* find(std::string_view name);

    MachineFacts facts_;
    std::vector<InterfaceView> views_;  // by ifindex
    std::vector<std::size_t> byName_;   // positions in views_, by name
};

/// The tree of a machine: the computer, its network, and the interfaces in it; behind
/// it the service processor, where there is one.
/// Depends on nothing but the facts and the time.
[[nodiscard]] std::shared_ptr<const Snapshot> decide(MachineFacts facts, std::int64_t now);

}  // namespace ZR::Live
