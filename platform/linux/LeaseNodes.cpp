#include "LeaseNodes.h"

#include <algorithm>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "LeaseRules.h"
#include "zrclient/NodeLexicon.h"

namespace ZR::Live {
namespace {

using NodeLexicon::AddressSource;
using NodeLexicon::ClientState;
using NodeLexicon::Properties;

constexpr const char* nodeType = "DHCPLease";
constexpr const char* nodeDescription = "DHCP lease";

PropertyValue number(std::int64_t value) {
    return static_cast<std::uint64_t>(value);
}

/// Takes out times that are not in order, and such as lie ahead though they are past.
Lease inOrder(Lease lease, std::int64_t now) {
    const std::int64_t end = lease.expires.value_or(Lease::never);
    if (lease.obtained && *lease.obtained > std::min(now, end)) {
        lease.obtained.reset();
    }
    const std::int64_t begin = lease.obtained.value_or(0);
    if (lease.rebinds && (*lease.rebinds > end || *lease.rebinds < begin)) {
        lease.rebinds.reset();
    }
    if (lease.renews && (*lease.renews > lease.rebinds.value_or(end) || *lease.renews < begin)) {
        lease.renews.reset();
    }
    return lease;
}

/// A node under construction: its properties in the order of the lexicon, without those
/// that are not known.
class LeaseNode {
  public:
    LeaseNode(const DecidedInterface& interface, const Origin& origin, std::string_view reason,
              Explain explain, SnapshotBuilder& builder)
        : builder_(builder) {
        builder_.add(interface.node, nodeType, nodeDescription);
        if (explain == Explain::Yes) {
            builder_.origin(describe(origin) + ": " + std::string{reason});
        }
    }

    void family(bool ipv6) {
        add(Properties::Family,
            std::string{ipv6 ? NodeLexicon::familyIPv6 : NodeLexicon::familyIPv4});
    }
    void state(ClientState state) {
        add(Properties::ClientState, std::uint64_t{static_cast<unsigned int>(state)});
    }
    void text(Properties property, std::string_view value) {
        if (!value.empty()) {
            add(property, std::string{value});
        }
    }
    void time(Properties property, const std::optional<std::int64_t>& value) {
        if (value) {
            add(property, number(*value));
        }
    }
    void end(const std::optional<std::int64_t>& value, bool endless) {
        if (endless) {
            add(Properties::LeaseExpires, NodeLexicon::never);
        } else {
            time(Properties::LeaseExpires, value);
        }
    }
    void options(const std::vector<std::uint16_t>& codes) {
        if (!codes.empty()) {
            add(Properties::OptionsReceived, NumberList{{codes.begin(), codes.end()}});
        }
    }
    void clientRuns(bool value) { add(Properties::ClientRuns, value); }
    void process(std::int32_t pid) {
        if (pid > 0) {
            add(Properties::Process, number(pid));
        }
    }

  private:
    void add(Properties property, PropertyValue value) {
        builder_.property(property, std::move(value));
    }

    SnapshotBuilder& builder_;
};

/// Renewing has no value of its own, and only a client that runs asks other servers.
ClientState stateOf(const Lease& lease, std::int64_t now) {
    return lease.clientAlive && lease.rebinds && *lease.rebinds <= now ? ClientState::Rebinding
                                                                       : ClientState::Bound;
}

void addLease(const Lease& claim, const DecidedInterface& interface, Explain explain,
              SnapshotBuilder& builder) {
    const std::int64_t now = interface.machine.now();
    const Lease lease = inOrder(claim, now);
    const std::int32_t pid = lease.pid != 0      ? lease.pid
                             : lease.clientAlive ? interface.machine.processOf(lease.client)
                                                 : 0;
    LeaseNode node{interface,
                   {.client = lease.client, .file = lease.origin, .pid = pid},
                   "a live lease",
                   explain,
                   builder};
    node.family(!lease.address.isIPv4());
    node.state(stateOf(lease, now));
    node.text(Properties::Address, lease.address.text());
    node.text(Properties::ServerAddress, lease.server ? lease.server->text() : std::string{});
    node.time(Properties::LeaseObtained, lease.obtained);
    node.time(Properties::RenewalTime, lease.renews);
    node.time(Properties::RebindingTime, lease.rebinds);
    node.end(lease.expires, isEndless(lease, now));
    node.options(lease.options);
    node.text(Properties::ClientIdentifier, lease.clientIdentifier);
    node.text(Properties::Client, nameOf(lease.client));
    node.process(pid);
    node.text(Properties::Source, lease.origin);
    // Of a client that is not seen it is not known.
    if (lease.clientAlive || !interface.view.hidden) {
        node.clientRuns(lease.clientAlive);
    }
}

/// The address that the interface shows, if DHCP gave it.
const Address* addressByDhcp(const DecidedInterface& interface) {
    const auto isValue = [&](Properties property, const PropertyValue& value) {
        const Decision* const decision = decisionOn(property, interface.decisions);
        return decision != nullptr && decision->value == value;
    };
    const PropertyValue dhcp{std::uint64_t{static_cast<unsigned int>(AddressSource::DHCP)}};
    if (!isValue(Properties::AddressSource, dhcp)) {
        return nullptr;
    }
    const auto& addresses = interface.view.addresses;
    const auto found =
        std::find_if(addresses.begin(), addresses.end(), [&](const Address& address) {
            return address.ip.isIPv4() && isValue(Properties::IPv4Address, address.ip.text());
        });
    return found == addresses.end() ? nullptr : &*found;
}

/// Whoever has the link and of whom no lease of this family is known.
void addClient(const Origin& origin, std::string_view reason, bool ipv6,
               const DecidedInterface& interface, Explain explain, SnapshotBuilder& builder) {
    LeaseNode node{interface, origin, reason, explain, builder};
    // Another client's lease leaves nothing for this one.
    const bool unclaimed = !ipv6 && interface.view.leases.empty();
    const Address* const address = unclaimed ? addressByDhcp(interface) : nullptr;
    node.family(ipv6);
    node.state(ClientState::Unknown);
    if (address != nullptr) {
        node.text(Properties::Address, address->ip.text());
        if (address->validLifetime != Address::infinite) {
            node.time(Properties::LeaseExpires, interface.machine.now() + address->validLifetime);
        }
    }
    node.text(Properties::Client, origin.client ? nameOf(*origin.client) : std::string_view{});
    node.process(origin.pid);
    node.text(Properties::Source, origin.file);
}

bool isHeldBy(Client client, const std::vector<const Lease*>& leases) {
    return std::any_of(leases.begin(), leases.end(), [&](const Lease* lease) {
        return lease->clientAlive && lease->client == client;
    });
}

/// Adds the nodes of one family; false when there is none.
bool addFamily(bool ipv6, const DecidedInterface& interface, Explain explain,
               SnapshotBuilder& builder) {
    const InterfaceView& view = interface.view;
    const std::vector<const Lease*>& leases = ipv6 ? view.leases6 : view.leases;
    bool any = false;
    for (auto lease = leases.begin(); lease != leases.end(); ++lease) {
        // Of two claims on one address the first counts, which is that of a running client.
        if (std::none_of(leases.begin(), lease, [&](const Lease* before) {
                return before->address == (*lease)->address;
            })) {
            addLease(**lease, interface, explain, builder);
            any = true;
        }
    }
    if (const LinkConfiguration* const management = view.dhcpManagement(ipv6)) {
        if (!isHeldBy(management->client, leases)) {
            addClient({.client = management->client,
                       .file = management->origin,
                       .pid = interface.machine.processOf(management->client)},
                      "the link's manager uses DHCP", ipv6, interface, explain, builder);
        }
        // What runs besides may be what the manager started.
        return true;
    }
    for (auto each = view.processes.begin(); each != view.processes.end(); ++each) {
        const ClientProcess* const process = *each;
        // One that waits for its first lease may run beside the parent that waits for it.
        const bool told =
            std::any_of(view.processes.begin(), each, [&](const ClientProcess* before) {
                return before->client == process->client && before->ipv6 == ipv6;
            });
        if (process->ipv6 == ipv6 && !told && !isHeldBy(process->client, leases)) {
            addClient({.client = process->client, .file = {}, .pid = process->pid},
                      "a client runs on the link", ipv6, interface, explain, builder);
            any = true;
        }
    }
    return any;
}

}  // namespace

void addLeases(const DecidedInterface& interface, Explain explain, SnapshotBuilder& builder) {
    const Decision* const enabled = decisionOn(Properties::DHCPEnabled, interface.decisions);
    if (enabled == nullptr || enabled->value != PropertyValue{true}) {
        return;
    }
    const bool any4 = addFamily(false, interface, explain, builder);
    const bool any6 = addFamily(true, interface, explain, builder);
    if (!any4 && !any6) {
        addClient(enabled->origin, enabled->reason, false, interface, explain, builder);
    }
}

}  // namespace ZR::Live
