#include "Decide.h"

#include <linux/if.h>
#include <linux/if_addr.h>
#include <linux/rtnetlink.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <utility>

#include "InterfaceRules.h"

namespace ZR::Live {
namespace {

using NodeLexicon::AddressSource;
using NodeLexicon::Properties;
using Answer = std::optional<PropertyValue>;

constexpr std::uint64_t interfaceNameMaxLength = 15;  // IFNAMSIZ without the NUL
constexpr std::uint64_t hostNameMaxLength = 64;       // HOST_NAME_MAX of Linux

PropertyValue source(AddressSource value) {
    return std::uint64_t{static_cast<unsigned int>(value)};
}

bool isUsableIPv4(const Address& address) {
    return address.family == AF_INET && (address.flags & (IFA_F_TENTATIVE | IFA_F_DADFAILED)) == 0;
}

template <typename Condition>
Answer firstIPv4(const InterfaceView& view, Condition condition) {
    for (const Address& address : view.addresses) {
        if (isUsableIPv4(address) && condition(address)) {
            return address.text;
        }
    }
    return std::nullopt;
}

bool isLinkLocal(const Address& address) {
    return address.scope == RT_SCOPE_LINK && address.text.starts_with("169.254.");
}

const Lease* leaseOf(const InterfaceView& view) {
    for (const Lease* lease : view.leases) {
        if (view.address != nullptr && lease->address == view.address->text) {
            return lease;
        }
    }
    return nullptr;
}

bool hasLeaseOf(const InterfaceView& view, Client client) {
    return std::any_of(view.leases.begin(), view.leases.end(),
                       [&](const Lease* lease) { return lease->client == client; });
}

bool managerWantsDhcp4(const InterfaceView& view) {
    return view.management != nullptr && view.management->dhcp4.value_or(false);
}

/// Each server once, that of the interface's own address first. Where two clients
/// claim one address, only the first is heard: the one that runs.
std::vector<std::string> servers(const InterfaceView& view) {
    std::vector<std::string> found;
    std::vector<std::string_view> heard;
    const auto hear = [&](const Lease& lease) {
        if (std::find(heard.begin(), heard.end(), lease.address) != heard.end()) {
            return;
        }
        heard.emplace_back(lease.address);
        if (!lease.server.empty() &&
            std::find(found.begin(), found.end(), lease.server) == found.end()) {
            found.push_back(lease.server);
        }
    };
    if (const Lease* own = leaseOf(view)) {
        hear(*own);
    }
    for (const Lease* lease : view.leases) {
        hear(*lease);
    }
    return found;
}

constexpr std::array rows{
    DecisionRow{Properties::Name, "the kernel's name of the link",
                [](const InterfaceView& view) -> Answer { return view.link->name; }},
    DecisionRow{Properties::NameMaxLength, "the kernel takes no longer names",
                [](const InterfaceView& /*view*/) -> Answer { return interfaceNameMaxLength; }},
    DecisionRow{Properties::InterfaceState, "administrative and operational state of the link",
                [](const InterfaceView& view) -> Answer {
                    return std::uint64_t{isActive(*view.link) ? 1U : 0U};
                }},

    DecisionRow{Properties::IPv4Address, "the address that a DHCP server leased",
                [](const InterfaceView& view) -> Answer {
                    return view.leases.empty() ? Answer{} : Answer{view.leases.front()->address};
                }},
    DecisionRow{Properties::IPv4Address, "the first address of its network with global scope",
                [](const InterfaceView& view) {
                    return firstIPv4(view, [](const Address& address) {
                        return (address.flags & IFA_F_SECONDARY) == 0 &&
                               address.scope == RT_SCOPE_UNIVERSE;
                    });
                }},
    DecisionRow{Properties::IPv4Address, "a further address, or one of the site's",
                [](const InterfaceView& view) {
                    return firstIPv4(view, [](const Address& address) {
                        return address.scope == RT_SCOPE_UNIVERSE || address.scope == RT_SCOPE_SITE;
                    });
                }},
    DecisionRow{Properties::IPv4Address, "a link-local address is better than none",
                [](const InterfaceView& view) {
                    return firstIPv4(view, [](const Address& address) {
                        return address.scope == RT_SCOPE_LINK;
                    });
                }},

    DecisionRow{Properties::DHCPEnabled, "the master owns the addresses of its ports",
                [](const InterfaceView& view) { return view.enslaved ? Answer{false} : Answer{}; }},
    DecisionRow{Properties::DHCPEnabled, "the link's manager holds a lease",
                [](const InterfaceView& view) {
                    return view.management != nullptr && hasLeaseOf(view, view.management->client)
                               ? Answer{true}
                               : Answer{};
                }},
    DecisionRow{Properties::DHCPEnabled, "the configuration of the link's manager",
                [](const InterfaceView& view) -> Answer {
                    if (view.management == nullptr || !view.management->dhcp4) {
                        return std::nullopt;
                    }
                    return *view.management->dhcp4 || view.management->dhcp6.value_or(false);
                }},
    DecisionRow{Properties::DHCPEnabled, "a client runs on the link",
                [](const InterfaceView& view) {
                    return view.dhcp4Process || view.dhcp6Process ? Answer{true} : Answer{};
                }},
    DecisionRow{Properties::DHCPEnabled,
                "an IPv4 address with an end: somebody renews it, and only DHCP does",
                [](const InterfaceView& view) {
                    return firstIPv4(view,
                                     [](const Address& address) {
                                         return address.validLifetime != Address::infinite;
                                     })
                               ? Answer{true}
                               : Answer{};
                }},
    DecisionRow{Properties::DHCPEnabled, "nothing speaks for DHCP",
                [](const InterfaceView& /*view*/) -> Answer { return false; }},

    DecisionRow{Properties::AddressSource, "the master owns the addresses of its ports",
                [](const InterfaceView& view) {
                    return view.enslaved ? Answer{source(AddressSource::Unknown)} : Answer{};
                }},
    DecisionRow{Properties::AddressSource, "a live lease names this very address",
                [](const InterfaceView& view) -> Answer {
                    const Lease* const lease = leaseOf(view);
                    if (lease == nullptr) {
                        return std::nullopt;
                    }
                    return source(lease->bootp ? AddressSource::BOOTP : AddressSource::DHCP);
                }},
    DecisionRow{Properties::AddressSource, "the link's manager was told this very address",
                [](const InterfaceView& view) -> Answer {
                    if (view.management == nullptr || view.address == nullptr) {
                        return std::nullopt;
                    }
                    const auto& told = view.management->staticAddresses;
                    return std::find(told.begin(), told.end(), view.address->text) != told.end()
                               ? Answer{source(AddressSource::Static)}
                               : Answer{};
                }},
    DecisionRow{Properties::AddressSource, "169.254/16 with link scope (RFC 3927)",
                [](const InterfaceView& view) {
                    return view.address != nullptr && isLinkLocal(*view.address)
                               ? Answer{source(AddressSource::LinkLocal)}
                               : Answer{};
                }},
    DecisionRow{Properties::AddressSource,
                "an IPv4 address with an end: somebody renews it, and only DHCP does",
                [](const InterfaceView& view) {
                    return view.address != nullptr &&
                                   view.address->validLifetime != Address::infinite
                               ? Answer{source(AddressSource::DHCP)}
                               : Answer{};
                }},
    DecisionRow{Properties::AddressSource, "permanent, and no DHCPv4 client that could have set it",
                [](const InterfaceView& view) {
                    return view.address != nullptr &&
                                   (view.address->flags & IFA_F_PERMANENT) != 0 &&
                                   !view.dhcp4Process && !managerWantsDhcp4(view)
                               ? Answer{source(AddressSource::Static)}
                               : Answer{};
                }},
    DecisionRow{Properties::AddressSource, "an address that nobody speaks for",
                [](const InterfaceView& view) {
                    return view.address != nullptr ? Answer{source(AddressSource::Unknown)}
                                                   : Answer{};
                }},
    DecisionRow{Properties::AddressSource, "no address yet: DHCP is what is meant to give one",
                [](const InterfaceView& view) {
                    return view.dhcp4Process || managerWantsDhcp4(view)
                               ? Answer{source(AddressSource::DHCP)}
                               : Answer{};
                }},
    DecisionRow{Properties::AddressSource, "no address yet: the manager was told one",
                [](const InterfaceView& view) {
                    return view.management != nullptr && !view.management->staticAddresses.empty()
                               ? Answer{source(AddressSource::Static)}
                               : Answer{};
                }},
    DecisionRow{Properties::AddressSource, "no address yet: the manager will choose one",
                [](const InterfaceView& view) {
                    return view.management != nullptr && view.management->linkLocal4
                               ? Answer{source(AddressSource::LinkLocal)}
                               : Answer{};
                }},
    DecisionRow{
        Properties::AddressSource, "no address, and nobody means to give one",
        [](const InterfaceView& /*view*/) -> Answer { return source(AddressSource::Unknown); }},

    DecisionRow{Properties::DHCPServerAddresses, "the master owns the addresses of its ports",
                [](const InterfaceView& view) {
                    return view.enslaved ? Answer{std::vector<std::string>{}} : Answer{};
                }},
    DecisionRow{Properties::DHCPServerAddresses, "the server identifiers of the live leases",
                [](const InterfaceView& view) -> Answer { return servers(view); }},
};

bool isLive(const Lease& lease, const InterfaceView& view, std::int64_t now) {
    return !lease.released && (!lease.expires || *lease.expires > now) &&
           std::any_of(view.addresses.begin(), view.addresses.end(), [&](const Address& address) {
               return address.family == lease.family && address.text == lease.address;
           });
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
    if (process.interfaces.empty()) {
        return (link.flags & IFF_BROADCAST) != 0;
    }
    return std::find(process.interfaces.begin(), process.interfaces.end(), link.name) !=
           process.interfaces.end();
}

}  // namespace

std::span<const DecisionRow> precedence() {
    return rows;
}

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
                              .enslaved = isEnslaved(link)});
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
}

void Machine::collectLeases(std::int64_t now) {
    for (const Lease& lease : facts_.leases) {
        InterfaceView* const view =
            lease.ifindex != 0 ? find(lease.ifindex) : find(lease.interfaceName);
        const bool namesBoth = lease.ifindex != 0 && !lease.interfaceName.empty();
        if (view == nullptr || (namesBoth && view->link->name != lease.interfaceName)) {
            continue;
        }
        if (lease.family == AF_INET && isLive(lease, *view, now)) {
            view->leases.push_back(&lease);
        }
    }
    for (InterfaceView& view : views_) {
        std::stable_partition(view.leases.begin(), view.leases.end(),
                              [](const Lease* lease) { return lease->clientAlive; });
    }
}

void Machine::collectClients() {
    for (const Management& management : facts_.managements) {
        if (InterfaceView* const view = find(management.ifindex)) {
            view->management = &management;
        }
    }
    for (const ClientProcess& process : facts_.processes) {
        for (InterfaceView& view : views_) {
            if (concerns(process, *view.link)) {
                (process.ipv6 ? view.dhcp6Process : view.dhcp4Process) = true;
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

InterfaceView* Machine::find(std::string_view name) {
    const auto found = std::lower_bound(byName_.begin(), byName_.end(), name,
                                        [&](std::size_t position, std::string_view wanted) {
                                            return views_[position].link->name < wanted;
                                        });
    return found != byName_.end() && views_[*found].link->name == name ? &views_[*found] : nullptr;
}

std::vector<Decision> Machine::decide(InterfaceView view) {
    std::vector<Decision> decisions;
    decisions.reserve(NodeLexicon::properties.size());
    for (const DecisionRow& row : rows) {
        if (!decisions.empty() && decisions.back().property == row.property) {
            continue;
        }
        auto value = row.answer(view);
        if (!value) {
            continue;
        }
        if (row.property == Properties::IPv4Address) {
            // The rows below speak about this very address.
            const auto address = std::find_if(
                view.addresses.begin(), view.addresses.end(), [&](const Address& candidate) {
                    return candidate.family == AF_INET && *value == PropertyValue{candidate.text};
                });
            view.address = address != view.addresses.end() ? &*address : nullptr;
        }
        decisions.push_back({row.property, *std::move(value), row.reason});
    }
    return decisions;
}

std::shared_ptr<const Snapshot> decide(MachineFacts facts, std::int64_t now) {
    const Machine machine{std::move(facts), now};
    SnapshotBuilder builder;
    const auto computer = builder.add(Snapshot::none, "ComputerSystem", "Computer");
    builder.property(Properties::Name, machine.hostName());
    builder.property(Properties::NameMaxLength, hostNameMaxLength);
    const auto network = builder.add(computer, "Network", "Network");
    for (const InterfaceView& view : machine.interfaces()) {
        builder.add(network, "NetworkInterface", std::string{describe(*view.link)});
        for (Decision& decision : Machine::decide(view)) {
            // A link can be renamed, but not by a client of this tree: the kernel forgets
            // the new name at the next start, and leases and settings are found by name.
            const bool readOnly = decision.property == Properties::Name;
            builder.property(decision.property, std::move(decision.value), readOnly);
        }
    }
    if (machine.serviceProcessor()) {
        addServiceProcessor(*machine.serviceProcessor(), builder);
    }
    return builder.build();
}

}  // namespace ZR::Live
