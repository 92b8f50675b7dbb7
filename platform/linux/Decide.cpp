#include "Decide.h"

#include <algorithm>
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

std::shared_ptr<const Snapshot> decide(const Machine& machine, Explain explain) {
    SnapshotBuilder builder;
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

}  // namespace ZR::Live
