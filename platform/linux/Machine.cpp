#include "Machine.h"

#include <linux/if.h>
#include <linux/rtnetlink.h>

#include <algorithm>
#include <numeric>
#include <set>
#include <utility>

#include "LeaseRules.h"
#include "kernel/InterfaceRules.h"

namespace ZR::Live {
namespace {

// An order by name costs as much as many walks over all interfaces, and on most machines few
// are looked for by name.
constexpr std::size_t mostWalks = 32;

const Address* addressOf(const Lease& lease, const InterfaceView& view) {
    const auto found =
        std::find_if(view.addresses.begin(), view.addresses.end(),
                     [&](const Address& address) { return address.ip == lease.address; });
    return found == view.addresses.end() ? nullptr : &*found;
}

/// Keeps the kernel's order among equals, which is the order of precedence of the
/// addresses of one link.
template <typename Fact>
void sortByIndex(std::vector<Fact>& facts) {
    const auto before = [](const Fact& a, const Fact& b) { return a.ifindex < b.ifindex; };
    // Most dumps come in order already.
    if (!std::is_sorted(facts.begin(), facts.end(), before)) {
        std::stable_sort(facts.begin(), facts.end(), before);
    }
}

bool contains(const std::vector<std::uint32_t>& indexes, std::uint32_t ifindex) {
    return std::find(indexes.begin(), indexes.end(), ifindex) != indexes.end();
}

/// Whether a configuration that names its link by hardware address means this one. A link
/// that lies upon another has the other's address.
bool means(const LinkConfiguration& configuration, const Link& link) {
    return configuration.hardwareAddress == link.hardwareAddress &&
           (link.kind.empty() || link.kind == "veth") && (link.flags & IFF_LOWER_UP) == 0 &&
           configuration.names.take(link.name);
}

/// Whether a client was told to run on named links and is known by those that it hears:
/// the names may be old.
bool isKnownByIndex(const ClientProcess& process) {
    return !process.interfaces.empty() && process.heardLinks &&
           process.heardLinks->size() >= process.interfaces.size();
}

/// The links on which running clients and managers were told to take an address by DHCP.
class ClaimedLinks {
  public:
    explicit ClaimedLinks(const ClientFacts& clients) {
        for (const ClientProcess& process : clients.processes) {
            if (isKnownByIndex(process)) {
                indexes_.insert(process.heardLinks->begin(), process.heardLinks->end());
            } else {
                names_.insert(process.interfaces.begin(), process.interfaces.end());
            }
        }
        for (const LinkConfiguration& management : clients.managements) {
            if (!management.dhcp4.value_or(false) && !management.dhcp6.value_or(false)) {
                continue;
            }
            if (management.ifindex != 0) {
                indexes_.insert(management.ifindex);
            } else if (!management.hardwareAddress.empty()) {
                withoutCables_.push_back(&management);
            } else if (management.interfaceName) {
                names_.insert(*management.interfaceName);
            }
        }
    }

    [[nodiscard]] bool contain(const Link& link) const {
        return (link.flags & IFF_LOOPBACK) == 0 &&
               (indexes_.contains(link.ifindex) || names_.contains(link.name) ||
                std::any_of(withoutCables_.begin(), withoutCables_.end(),
                            [&](const LinkConfiguration* each) { return means(*each, link); }));
    }

  private:
    std::set<std::uint32_t> indexes_;
    std::set<InterfaceName> names_;
    std::vector<const LinkConfiguration*> withoutCables_;
};

/// Whether an address looks as one that DHCPv6 gave, or a router announced, and no lease is
/// known of it.
bool mayBeLeased6(const Address& address, const InterfaceView& view) {
    return !address.ip.isIPv4() && address.scope == RT_SCOPE_UNIVERSE &&
           address.validLifetime != Address::infinite &&
           std::none_of(view.leases6.begin(), view.leases6.end(),
                        [&](const Lease* lease) { return lease->address == address.ip; });
}

bool holdsLease(const ClientProcess& process, const InterfaceView& view) {
    const auto& leases = process.ipv6 ? view.leases6 : view.leases;
    return std::any_of(leases.begin(), leases.end(), [&](const Lease* lease) {
        return lease->clientAlive && lease->client == process.client;
    });
}

/// Whether a client says itself what it does with a link, which its process cannot tell.
bool speaksItself(const ClientProcess& process, const InterfaceView& view) {
    return std::any_of(view.managements.begin(), view.managements.end(),
                       [&](const LinkConfiguration* management) {
                           return management->client == process.client &&
                                  (process.ipv6 ? management->dhcp6 : management->dhcp4);
                       });
}

/// Whether a dhcpcd has an address that it was told (its option -S). It gives those without an
/// end, has no lease of them, and does not listen on the link for a server's.
bool wasToldAddress(const ClientProcess& process, const InterfaceView& view) {
    return process.client == Client::Dhcpcd && !process.ipv6 && view.leases.empty() &&
           view.isHeardBy(process) == false &&
           std::any_of(view.addresses.begin(), view.addresses.end(), [](const Address& each) {
               return each.ip.isIPv4() && each.scope == RT_SCOPE_UNIVERSE &&
                      each.validLifetime == Address::infinite;
           });
}

}  // namespace

const LinkConfiguration* InterfaceView::dhcpManagement(bool ipv6) const {
    const auto found = std::find_if(
        managements.begin(), managements.end(), [&](const LinkConfiguration* management) {
            return (ipv6 ? management->dhcp6 : management->dhcp4).value_or(false);
        });
    return found == managements.end() ? nullptr : *found;
}

const ClientProcess* InterfaceView::process(bool ipv6) const {
    const auto found =
        std::find_if(processes.begin(), processes.end(),
                     [&](const ClientProcess* process) { return process->ipv6 == ipv6; });
    return found == processes.end() ? nullptr : *found;
}

std::optional<bool> InterfaceView::isHeardBy(const ClientProcess& process) const {
    return process.heardLinks ? std::optional{contains(*process.heardLinks, link->ifindex)}
                              : std::nullopt;
}

bool InterfaceView::isPlain() const {
    const bool alone = leases.empty() && leases6.empty() && ended.empty() && managements.empty() &&
                       configurations.empty() && processes.empty() && socket == nullptr &&
                       openSocket == nullptr && strayed == nullptr && !unheard && !unheard6;
    return alone && !enslaved && std::ranges::all_of(addresses, [](const Address& each) {
               return each.validLifetime == Address::infinite;
           });
}

Machine::Machine(MachineFacts facts, std::int64_t now) : facts_(std::move(facts)), now_(now) {
    sortByIndex(facts_.links);
    sortByIndex(facts_.addresses);
    collectInterfaces();
    collectLeases();
    collectManagements();
    collectProcesses();
    collectHidden();
    collectUnheard();
    collectSockets();
    collectBootLease();
    findNextChange();
}

void Machine::collectInterfaces() {
    const auto& links = facts_.links;
    const auto& addresses = facts_.addresses;
    std::vector<std::span<const Address>> ofLinks;
    ofLinks.reserve(links.size());
    WayOut wayOut;
    auto address = addresses.begin();
    for (const Link& link : links) {
        const auto first = std::find_if(address, addresses.end(), [&](const Address& candidate) {
            return candidate.ifindex >= link.ifindex;
        });
        const auto last = std::find_if(first, addresses.end(), [&](const Address& candidate) {
            return candidate.ifindex != link.ifindex;
        });
        address = last;
        ofLinks.emplace_back(first, last);
        wayOut.add(link, first != last);
    }
    const ClaimedLinks claimed{facts_.clients};
    views_.reserve(links.size());
    for (std::size_t i = 0; i < links.size(); ++i) {
        const Link& link = links[i];
        if (isNetworkInterface(link, !ofLinks[i].empty()) || wayOut.isBy(link) ||
            claimed.contain(link)) {
            InterfaceView& view = views_.emplace_back();
            view.link = &link;
            view.addresses = ofLinks[i];
            view.enslaved = isEnslaved(link);
        }
    }
}

void Machine::collectLeases() {
    for (Lease& lease : facts_.clients.leases) {
        InterfaceView* const view = lease.released ? nullptr : findLink(lease);
        const Address* const address = view == nullptr ? nullptr : addressOf(lease, *view);
        if (address == nullptr) {
            continue;
        }
        switch (settle(lease, *address, now_)) {
            case Standing::Live:
                (lease.address.isIPv4() ? view->leases : view->leases6).push_back(&lease);
                break;
            case Standing::Ended:
                view->ended.push_back(&lease);
                break;
            case Standing::Foreign:
                break;
        }
    }
    const auto alive = [](const Lease* lease) { return lease->clientAlive; };
    for (InterfaceView& view : views_) {
        std::stable_partition(view.leases.begin(), view.leases.end(), alive);
        std::stable_partition(view.leases6.begin(), view.leases6.end(), alive);
    }
}

void Machine::collectManagements() {
    for (const LinkConfiguration& management : facts_.clients.managements) {
        if (InterfaceView* const view = find(management)) {
            view->managements.push_back(&management);
        }
    }
    for (const LinkConfiguration& configuration : facts_.clients.configurations) {
        if (InterfaceView* const view = find(configuration)) {
            view->configurations.push_back(&configuration);
        }
    }
}

void Machine::addProcess(const ClientProcess& process, InterfaceView& view) const {
    const bool known =
        std::find(view.processes.begin(), view.processes.end(), &process) != view.processes.end();
    if (!known && !speaksItself(process, view) && !wasToldAddress(process, view)) {
        view.processes.push_back(&process);
    }
}

void Machine::collectProcesses() {
    for (const ClientProcess& process : facts_.clients.processes) {
        if (!process.interfaces.empty() && !isKnownByIndex(process)) {
            for (const InterfaceName& name : process.interfaces) {
                if (InterfaceView* const view = find(name)) {
                    addProcess(process, *view);
                }
            }
        }
        // Whose the packet sockets are is not always to be known.
        const auto& heard =
            process.heardLinks ? *process.heardLinks : facts_.clients.sockets.packetLinks;
        if (process.heardLinks || process.interfaces.empty()) {
            for (const std::uint32_t ifindex : heard) {
                if (InterfaceView* const view = find(ifindex)) {
                    addProcess(process, *view);
                }
            }
        }
        if (process.interfaces.empty()) {
            for (InterfaceView& view : views_) {
                if (holdsLease(process, view)) {
                    addProcess(process, view);
                }
            }
        }
    }
}

/// A client that was started under names which links no longer have, and that no socket gives
/// away: a udhcpc sleeps without any while it is bound. nullptr without one.
const ClientProcess* Machine::findStrayed() {
    for (const auto* processes : {&facts_.clients.processes, &facts_.clients.hiddenClients}) {
        for (const ClientProcess& process : *processes) {
            const bool named =
                std::any_of(process.interfaces.begin(), process.interfaces.end(),
                            [&](const InterfaceName& name) { return find(name) != nullptr; });
            const bool heard = process.heardLinks && !process.heardLinks->empty();
            if (!process.ipv6 && !process.interfaces.empty() && !named && !heard) {
                return &process;
            }
        }
    }
    return nullptr;
}

void Machine::collectHidden() {
    const auto& hidden = facts_.clients.hiddenClients;
    const ClientProcess* const strayed = findStrayed();
    for (InterfaceView& view : views_) {
        const bool unexplained = view.leases.empty() && view.managements.empty() &&
                                 view.processes.empty() &&
                                 std::any_of(view.addresses.begin(), view.addresses.end(),
                                             [](const Address& each) { return each.ip.isIPv4(); });
        view.strayed = unexplained ? strayed : nullptr;
        const Link& link = *view.link;
        view.hidden = facts_.clients.processesHidden || view.strayed != nullptr ||
                      std::any_of(hidden.begin(), hidden.end(), [&](const ClientProcess& process) {
                          return process.interfaces.empty() ? (link.flags & IFF_BROADCAST) != 0
                                                            : process.serves(link.name);
                      });
    }
}

/// A manager may have taken a link since it wrote of it, and connman names no links.
void Machine::collectUnheard() {
    const ClientFacts& clients = facts_.clients;
    for (const Client manager : clients.unheardManagers) {
        for (InterfaceView& view : views_) {
            const Link& link = *view.link;
            const auto said = std::find_if(
                view.managements.begin(), view.managements.end(),
                [&](const LinkConfiguration* each) { return each->client == manager; });
            const bool known = said != view.managements.end();
            // networkd writes of each link that it takes before it does anything to it.
            const bool leftAlone = (link.flags & IFF_BROADCAST) == 0 || view.enslaved ||
                                   contains(clients.unmanagedLinks, link.ifindex) ||
                                   (manager == Client::Networkd && !known);
            if (leftAlone) {
                continue;
            }
            if (!known || !(*said)->dhcp4) {
                view.unheard = manager;
                view.hidden = true;
            }
            if (std::any_of(view.addresses.begin(), view.addresses.end(),
                            [&](const Address& each) { return mayBeLeased6(each, view); })) {
                view.unheard6 = manager;
            }
        }
    }
}

void Machine::collectSockets() {
    // A socket of all links tells of one link only together with another one that hears
    // it, and then no more than the process would, where that can be seen.
    const bool clientSeen =
        std::any_of(facts_.clients.processes.begin(), facts_.clients.processes.end(),
                    [](const ClientProcess& process) { return !process.ipv6; }) ||
        facts_.clients.runs(Client::Dhcpcd);
    for (const PortSocket& socket : facts_.clients.sockets.bound) {
        if (socket.address) {
            for (const Holder& holder : holders(*socket.address)) {
                holder.view->socket = &socket;
            }
        } else if (!clientSeen) {
            for (const std::uint32_t ifindex : facts_.clients.sockets.packetLinks) {
                if (InterfaceView* const view = find(ifindex)) {
                    view->openSocket = &socket;
                }
            }
        }
    }
}

void Machine::findNextChange() {
    const auto consider = [this](std::optional<std::int64_t> time) {
        if (time && *time > now_) {
            changesAt_ = std::min(changesAt_, *time);
        }
    };
    for (const InterfaceView& view : views_) {
        for (const auto* leases : {&view.leases, &view.leases6}) {
            for (const Lease* lease : *leases) {
                consider(lease->expires);
                if (lease->clientAlive) {
                    consider(lease->rebinds);
                }
            }
        }
    }
}

std::int32_t Machine::processOf(Client manager) const {
    const auto& managers = facts_.clients.managers;
    const auto found =
        std::find_if(managers.begin(), managers.end(), [&](const ManagerProcess& process) {
            return process.client == manager && process.where != ManagerProcess::Where::Elsewhere;
        });
    return found == managers.end() ? 0 : found->pid;
}

const Link* Machine::linkOf(std::uint32_t ifindex) const {
    const auto found = std::lower_bound(
        facts_.links.begin(), facts_.links.end(), ifindex,
        [](const Link& link, std::uint32_t wanted) { return link.ifindex < wanted; });
    return found != facts_.links.end() && found->ifindex == ifindex ? &*found : nullptr;
}

InterfaceView* Machine::find(std::uint32_t ifindex) {
    const auto found = std::lower_bound(views_.begin(), views_.end(), ifindex,
                                        [](const InterfaceView& view, std::uint32_t wanted) {
                                            return view.link->ifindex < wanted;
                                        });
    return found != views_.end() && found->link->ifindex == ifindex ? &*found : nullptr;
}

InterfaceView* Machine::find(const InterfaceName& name) {
    if (walks_ < mostWalks) {
        ++walks_;
        const auto found = std::ranges::find_if(
            views_, [&](const InterfaceView& view) { return view.link->name == name; });
        return found == views_.end() ? nullptr : &*found;
    }
    if (byName_.empty()) {
        byName_.resize(views_.size());
        std::iota(byName_.begin(), byName_.end(), std::size_t{0});
        std::ranges::sort(byName_, {},
                          [&](std::size_t position) { return views_[position].link->name; });
    }
    const auto found = std::lower_bound(byName_.begin(), byName_.end(), name,
                                        [&](std::size_t position, const InterfaceName& wanted) {
                                            return views_[position].link->name < wanted;
                                        });
    return found != byName_.end() && views_[*found].link->name == name ? &views_[*found] : nullptr;
}

InterfaceView* Machine::find(const LinkConfiguration& configuration) {
    if (configuration.ifindex != 0) {
        return find(configuration.ifindex);
    }
    if (!configuration.hardwareAddress.empty()) {
        const auto found = std::find_if(
            views_.begin(), views_.end(),
            [&](const InterfaceView& view) { return means(configuration, *view.link); });
        return found == views_.end() ? nullptr : &*found;
    }
    return configuration.interfaceName ? find(*configuration.interfaceName) : nullptr;
}

InterfaceView* Machine::findLink(const Lease& lease) {
    if (lease.ifindex != 0) {
        InterfaceView* const view = find(lease.ifindex);
        const bool namesTwo =
            view != nullptr && lease.interfaceName && view->link->name != *lease.interfaceName;
        return namesTwo ? nullptr : view;
    }
    InterfaceView* const view = lease.interfaceName ? find(*lease.interfaceName) : nullptr;
    return view != nullptr && addressOf(lease, *view) != nullptr ? view : findByAddress(lease);
}

InterfaceView* Machine::findByAddress(const Lease& lease) {
    const auto found = holders(lease.address);
    const bool meant = found.size() == 1 &&
                       (!lease.interfaceName || endsTogether(lease, *found.front().address, now_));
    return meant ? found.front().view : nullptr;
}

void Machine::collectBootLease() {
    if (!facts_.clients.boot) {
        return;
    }
    InterfaceView* holder = nullptr;
    const Address* only = nullptr;
    for (InterfaceView& view : views_) {
        for (const Address& address : view.addresses) {
            if (address.ip.isIPv4()) {
                if (only != nullptr) {
                    return;
                }
                only = &address;
                holder = &view;
            }
        }
    }
    const bool spokenFor = holder == nullptr || !holder->leases.empty() ||
                           !holder->managements.empty() || !holder->configurations.empty() ||
                           !holder->processes.empty() || holder->socket != nullptr;
    if (spokenFor || only->validLifetime != Address::infinite) {
        return;
    }
    const BootResponse& boot = *facts_.clients.boot;
    bootLease_ = Lease{.client = Client::KernelBoot,
                       .interfaceName = {},
                       .ifindex = holder->link->ifindex,
                       .address = only->ip,
                       .server = boot.server,
                       .bootp = boot.bootp,
                       .expires = Lease::never,
                       .origin = boot.origin};
    holder->leases.push_back(&*bootLease_);
}

std::span<const Machine::Holder> Machine::holders(const IpAddress& address) {
    if (byAddress_.empty()) {
        for (InterfaceView& view : views_) {
            for (const Address& each : view.addresses) {
                byAddress_.push_back({.address = &each, .view = &view});
            }
        }
        std::sort(byAddress_.begin(), byAddress_.end(),
                  [](const Holder& a, const Holder& b) { return a.address->ip < b.address->ip; });
    }
    const auto first = std::lower_bound(
        byAddress_.begin(), byAddress_.end(), address,
        [](const Holder& holder, const IpAddress& wanted) { return holder.address->ip < wanted; });
    const auto last = std::find_if(first, byAddress_.end(), [&](const Holder& holder) {
        return holder.address->ip != address;
    });
    return {first, last};
}

}  // namespace ZR::Live
