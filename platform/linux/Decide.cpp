#include "Decide.h"

#include <algorithm>
#include <cstddef>
#include <optional>
#include <span>
#include <utility>

#include "InterfaceDiagnostics.h"
#include "LeaseNodes.h"
#include "Precedence.h"
#include "kernel/InterfaceRules.h"

namespace ZR::Live {
namespace {

using NodeLexicon::Properties;

constexpr std::uint64_t hostNameMaxLength = 64;  // HOST_NAME_MAX of Linux

/// What was found, in the texts of the tree.
struct Written {
    PropertyValue operator()(bool value) const { return value; }
    PropertyValue operator()(std::uint64_t value) const { return value; }
    PropertyValue operator()(const InterfaceName& name) const { return std::string{name.view()}; }
    PropertyValue operator()(const IpAddress& address) const { return address.text(); }
    PropertyValue operator()(const AddressList& list) const {
        std::vector<std::string> texts;
        texts.reserve(list.addresses.size());
        for (const IpAddress& address : list.addresses) {
            texts.push_back(address.text());
        }
        return texts;
    }
};

}  // namespace

std::string describe(const Origin& origin) {
    std::string text{origin.client ? nameOf(*origin.client) : std::string_view{}};
    if (origin.pid != 0) {
        text += ", process " + std::to_string(origin.pid);
    }
    if (!origin.file.empty()) {
        text += text.empty() ? "" : " ";
        text += origin.file;
    }
    return text.empty() ? "kernel" : text;
}

std::vector<Decision> decide(InterfaceView view) {
    std::vector<Decision> decisions;
    decisions.reserve(NodeLexicon::properties.size());
    for (const DecisionRow& row : precedence()) {
        if (!decisions.empty() && decisions.back().property == row.property) {
            continue;
        }
        const auto finding = row.find(view);
        if (!finding) {
            continue;
        }
        if (row.property == Properties::IPv4Address) {
            // The rows below speak about this very address.
            const auto* const ip = std::get_if<IpAddress>(&finding->value);
            const auto own = std::find_if(
                view.addresses.begin(), view.addresses.end(),
                [&](const Address& address) { return ip != nullptr && address.ip == *ip; });
            view.address = own == view.addresses.end() ? nullptr : &*own;
        }
        decisions.push_back({.property = row.property,
                             .value = std::visit(Written{}, finding->value),
                             .reason = row.reason,
                             .origin = finding->origin});
    }
    return decisions;
}

const Decision* decisionOn(Properties property, const std::vector<Decision>& decisions) {
    const auto found =
        std::find_if(decisions.begin(), decisions.end(),
                     [&](const Decision& decision) { return decision.property == property; });
    return found == decisions.end() ? nullptr : &*found;
}

std::shared_ptr<const Snapshot> decide(MachineFacts facts, std::int64_t now, Explain explain) {
    return decide(Machine{std::move(facts), now}, explain);
}

namespace {

/// Finds interfaces that are as they were at another time. They are to be asked for in the
/// order of their indexes.
class Unchanged {
  public:
    explicit Unchanged(const Decided& before)
        : tree_(*before.tree),
          node_(before.tree->first(NodeLexicon::NodeType::NetworkInterface)),
          view_(before.machine->interfaces().begin()),
          end_(before.machine->interfaces().end()) {}

    /// The node of the interface then; none when it is to be decided anew.
    Snapshot::Index find(const InterfaceView& view) {
        // The nodes come in the order of the views.
        for (; view_ != end_ && view_->link->ifindex < view.link->ifindex; ++view_) {
            node_ = tree_.node(node_).nextOfType;
        }
        const bool same = view_ != end_ && *view_->link == *view.link &&
                          view_->hidden == view.hidden && view_->isPlain() && view.isPlain() &&
                          std::ranges::equal(view_->addresses, view.addresses);
        return same ? node_ : Snapshot::none;
    }

  private:
    const Snapshot& tree_;
    Snapshot::Index node_;
    std::span<const InterfaceView>::iterator view_;
    std::span<const InterfaceView>::iterator end_;
};

void addInterface(const Machine& machine, const InterfaceView& view, Snapshot::Index network,
                  Explain explain, std::vector<Diagnostic>& diagnostics, SnapshotBuilder& builder) {
    const auto interface =
        builder.add(network, "NetworkInterface", std::string{describe(*view.link)});
    const std::vector<Decision> decisions = decide(view);
    for (const Decision& decision : decisions) {
        // A link can be renamed, but not by a client of this tree: the kernel forgets
        // the new name at the next start, and leases and settings are found by name.
        const bool readOnly = decision.property == Properties::Name;
        if (explain == Explain::Yes) {
            builder.origin(describe(decision.origin) + ": " + std::string{decision.reason});
        }
        builder.property(decision.property, decision.value, readOnly);
    }
    addLeases({.machine = machine, .view = view, .decisions = decisions, .node = interface},
              explain, builder);
    addDiagnostics(machine, view, decisions, diagnostics);
}

std::shared_ptr<const Snapshot> treeOf(const Machine& machine, Explain explain,
                                       const Decided* before) {
    SnapshotBuilder builder;
    std::optional<Unchanged> unchanged;
    if (before != nullptr && before->tree) {
        unchanged.emplace(*before);
        // As many as then, and those of some new ones.
        constexpr std::size_t more = 64;
        builder.reserve(before->tree->nodes().size() + more, before->tree->propertyCount() + more);
    }
    if (explain == Explain::Yes) {
        builder.origin("kernel: the name of the system");
    }
    const auto computer =
        builder.add(Snapshot::none, "ComputerSystem", NodeLexicon::hostDescription);
    builder.property(Properties::Name, machine.hostName().empty()
                                           ? PropertyValue()
                                           : PropertyValue(machine.hostName()));
    builder.property(Properties::NameMaxLength, hostNameMaxLength);
    const auto network = builder.add(computer, "Network", "Network");
    std::vector<Diagnostic> diagnostics = machine.diagnostics();
    for (const InterfaceView& view : machine.interfaces()) {
        const Snapshot::Index known = unchanged ? unchanged->find(view) : Snapshot::none;
        if (known != Snapshot::none) {
            builder.copy(*before->tree, known, network);
        } else {
            addInterface(machine, view, network, explain, diagnostics, builder);
        }
    }
    if (machine.serviceProcessor()) {
        if (explain == Explain::Yes) {
            builder.origin("service processor, by IPMI");
        }
        addServiceProcessor(*machine.serviceProcessor(), builder);
    }
    for (Diagnostic& diagnostic : diagnostics) {
        builder.diagnostic(std::move(diagnostic));
    }
    return builder.build();
}

}  // namespace

std::shared_ptr<const Snapshot> decide(const Machine& machine, Explain explain) {
    return treeOf(machine, explain, nullptr);
}

Decided decide(std::unique_ptr<const Machine> machine, const Decided& before) {
    auto tree = treeOf(*machine, Explain::No, &before);
    return {.machine = std::move(machine), .tree = std::move(tree)};
}

}  // namespace ZR::Live
