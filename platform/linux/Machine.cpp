#include "Machine.h"

#include <linux/if.h>

#include <algorithm>
#include <utility>

#include "kernel/InterfaceRules.h"

namespace ZR::Live {
namespace {

// A client sets the address some moments after it took down when the lease ends.
constexpr std::int64_t renamedTolerance = 10;  // seconds

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

bool concerns(const ClientProcess& process, const Link& link) {
    const bool all = process.interfaces.empty();
    return all ? (link.flags & IFF_BROADCAST) != 0 : process.serves(link.name);
}

/// Whether an address is what a client made of a lease, as far as their ends tell.
bool endsWith(const Address& address, const Lease& lease, std::int64_t now) {
    if (!lease.expires) {
        return false;
    }
    if (address.validLifetime == Address::infinite) {
        // udhcpc sets no other addresses. That they have no end tells little, so that
        // the client must run.
        return lease.clientAlive &&
               (*lease.expires == Lease::never || lease.client == Client::Udhcpc);
    }
    if (*lease.expires == Lease::never) {
        return false;
    }
    const std::int64_t difference = *lease.expires - now - address.validLifetime;
    return difference >= -renamedTolerance && difference <= renamedTolerance;
}

}  // namespace

Machine::Machine(MachineFacts facts, std::int64_t now) : facts_(std::move(facts)) {
    auto& links = facts_.links;
    auto& addresses = facts_.addresses;
    sortByIndex(links);
    sortByIndex(addresses);
    views_.reserve(links.size());
    auto address = addresses.begin();
    for (const Link& link : links) {
        const auto first = std::find_if(address, addresses.end(), [&](const Address& candidate) {
            return candidate.ifindex >= link.ifindex;
        });
        const auto last = std::find_if(first, addresses.end(), [&](const Address& candidate) {
            return candidate.ifindex != link.ifindex;
        });
        address = last;
        if (isNetworkInterface(link, first != last)) {
            views_.push_back({.link = &link,
                              .addresses = {first, last},
                              .leases = {},
                              .leases6 = {},
                              .enslaved = isEnslaved(link),
                              .processes = {}});
        }
    }
    byName_.resize(views_.size());
    for (std::size_t i = 0; i < byName_.size(); ++i) {
        byName_[i] = i;
    }
    std::sort(byName_.begin(), byName_.end(), [&](std::size_t a, std::size_t b) {
        return views_[a].link->name < views_[b].link->name;
    });
    collectLeases(now);
    collectClients();
    collectSockets();
    collectBootLease();
}

void Machine::collectLeases(std::int64_t now) {
    for (const Lease& lease : facts_.clients.leases) {
        const bool over = lease.expires && *lease.expires <= now;
        if (lease.released || (over && !lease.outlivesEnd)) {
            continue;
        }
        InterfaceView* view = nullptr;
        if (lease.ifindex != 0) {
            view = find(lease.ifindex);
        } else if (lease.interfaceName) {
            view = find(*lease.interfaceName);
        }
        if (view == nullptr && lease.ifindex == 0) {
            view = findByAddress(lease, now);
        } else if (view != nullptr && lease.ifindex != 0 && lease.interfaceName &&
                   view->link->name != *lease.interfaceName) {
            continue;  // names two links
        }
        if (view == nullptr || addressOf(lease, *view) == nullptr) {
            continue;
        }
        if (over) {
            view->formerLease = &lease;
        } else {
            (lease.address.isIPv4() ? view->leases : view->leases6).push_back(&lease);
        }
    }
    const auto alive = [](const Lease* lease) { return lease->clientAlive; };
    for (InterfaceView& view : views_) {
        std::stable_partition(view.leases.begin(), view.leases.end(), alive);
        std::stable_partition(view.leases6.begin(), view.leases6.end(), alive);
    }
}

void Machine::collectClients() {
    for (const LinkConfiguration& management : facts_.clients.managements) {
        if (InterfaceView* const view = find(management.ifindex)) {
            view->management = &management;
        }
    }
    for (const LinkConfiguration& configuration : facts_.clients.configurations) {
        InterfaceView* const view =
            configuration.interfaceName ? find(*configuration.interfaceName) : nullptr;
        if (view != nullptr && view->configuration == nullptr) {
            view->configuration = &configuration;
        }
    }
    for (const ClientProcess& process : facts_.clients.processes) {
        for (InterfaceView& view : views_) {
            if (concerns(process, *view.link)) {
                view.processes.push_back(&process);
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

InterfaceView* Machine::find(std::uint32_t ifindex) {
    const auto found = std::lower_bound(views_.begin(), views_.end(), ifindex,
                                        [](const InterfaceView& view, std::uint32_t wanted) {
                                            return view.link->ifindex < wanted;
                                        });
    return found != views_.end() && found->link->ifindex == ifindex ? &*found : nullptr;
}

InterfaceView* Machine::find(const InterfaceName& name) {
    const auto found = std::lower_bound(byName_.begin(), byName_.end(), name,
                                        [&](std::size_t position, const InterfaceName& wanted) {
                                            return views_[position].link->name < wanted;
                                        });
    return found != byName_.end() && views_[*found].link->name == name ? &views_[*found] : nullptr;
}

InterfaceView* Machine::findByAddress(const Lease& lease, std::int64_t now) {
    const auto found = holders(lease.address);
    const bool meant =
        found.size() == 1 && (!lease.interfaceName || endsWith(*found.front().address, lease, now));
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
                           holder->management != nullptr || holder->configuration != nullptr ||
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
