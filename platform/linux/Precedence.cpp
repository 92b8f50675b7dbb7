#include "Precedence.h"

#include <linux/if_addr.h>
#include <linux/rtnetlink.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <utility>

#include "kernel/InterfaceRules.h"

namespace ZR::Live {
namespace {

using NodeLexicon::AddressSource;
using NodeLexicon::Properties;
using Found = std::optional<Finding>;

constexpr std::string_view socketFile = "/proc/net/udp";

FoundValue source(AddressSource value) {
    return std::uint64_t{static_cast<unsigned int>(value)};
}

Finding kernel(FoundValue value) {
    return {.value = std::move(value)};
}
Finding from(const Lease& lease, FoundValue value) {
    return {.value = std::move(value), .origin = {.client = lease.client, .file = lease.origin}};
}
Finding from(const LinkConfiguration& configuration, FoundValue value) {
    return {.value = std::move(value),
            .origin = {.client = configuration.client, .file = configuration.origin}};
}
Finding from(const ClientProcess& process, FoundValue value) {
    return {.value = std::move(value),
            .origin = {.client = process.client, .file = {}, .pid = process.pid}};
}
Finding fromSocket(FoundValue value) {
    return {.value = std::move(value), .origin = {.client = {}, .file = socketFile}};
}

bool isUsableIPv4(const Address& address) {
    return address.ip.isIPv4() && (address.flags & (IFA_F_TENTATIVE | IFA_F_DADFAILED)) == 0;
}

template <typename Condition>
Found firstIPv4(const InterfaceView& view, Condition condition) {
    for (const Address& address : view.addresses) {
        if (isUsableIPv4(address) && condition(address)) {
            return kernel(address.ip);
        }
    }
    return std::nullopt;
}

bool hasEnd(const Address& address) {
    return address.validLifetime != Address::infinite;
}

bool isPermanent(const Address& address) {
    return (address.flags & IFA_F_PERMANENT) != 0;
}

// 169.254/16 (RFC 3927)
constexpr std::array linkLocalNetwork{std::byte{169}, std::byte{254}};

bool isLinkLocal(const Address& address) {
    return address.scope == RT_SCOPE_LINK &&
           std::ranges::equal(address.ip.bytes().first(2), linkLocalNetwork);
}

const Lease* leaseOf(const InterfaceView& view) {
    for (const Lease* lease : view.leases) {
        if (view.address != nullptr && lease->address == view.address->ip) {
            return lease;
        }
    }
    return nullptr;
}

/// Whether a configuration has DHCP of either protocol; nullopt when it does not tell.
std::optional<bool> hasDhcp(const LinkConfiguration& configuration) {
    if (configuration.dhcp4.value_or(false) || configuration.dhcp6.value_or(false)) {
        return true;
    }
    return configuration.dhcp4;
}

const LinkConfiguration* naming(const std::vector<const LinkConfiguration*>& configurations,
                                const Address* address) {
    const auto found = std::find_if(
        configurations.begin(), configurations.end(), [&](const LinkConfiguration* each) {
            const auto& told = each->staticAddresses;
            return address != nullptr &&
                   std::find(told.begin(), told.end(), address->ip) != told.end();
        });
    return found == configurations.end() ? nullptr : *found;
}

/// Whether something that runs takes IPv4 addresses for the link by DHCP, or may do so unseen.
bool mayTakeAddresses(const InterfaceView& view) {
    return view.process(false) != nullptr || view.dhcpManagement(false) != nullptr ||
           view.openSocket != nullptr || view.socket != nullptr || view.hidden;
}

/// Whether a client asks for an address, so that those of the link are not its own. udhcpc
/// opens a socket for each request, and closes it when it has a lease.
bool isAsking(const InterfaceView& view, const ClientProcess& process) {
    return view.isHeardBy(process).value_or(false);
}

AddressSource sourceOf(const Lease& lease) {
    return lease.bootp ? AddressSource::BOOTP : AddressSource::DHCP;
}

/// Each server once, that of the interface's own address first. Where two clients
/// claim one address, only the first is heard: the one that runs.
Found servers(const InterfaceView& view) {
    std::vector<IpAddress> found;
    std::vector<IpAddress> heard;
    const Lease* first = nullptr;
    const auto hear = [&](const Lease& lease) {
        if (std::find(heard.begin(), heard.end(), lease.address) != heard.end()) {
            return;
        }
        heard.push_back(lease.address);
        if (lease.server && std::find(found.begin(), found.end(), *lease.server) == found.end()) {
            first = first == nullptr ? &lease : first;
            found.push_back(*lease.server);
        }
    };
    if (const Lease* own = leaseOf(view)) {
        hear(*own);
    }
    for (const auto* leases : {&view.leases, &view.leases6}) {
        for (const Lease* lease : *leases) {
            hear(*lease);
        }
    }
    return first == nullptr ? Found{} : from(*first, AddressList{std::move(found)});
}

constexpr std::array rows{
    DecisionRow{Properties::Name, "the kernel's name of the link",
                [](const InterfaceView& view) -> Found { return kernel(view.link->name); }},
    DecisionRow{Properties::NameMaxLength, "the kernel takes no longer names",
                [](const InterfaceView& /*view*/) -> Found {
                    return kernel(std::uint64_t{InterfaceName::maxLength});
                }},
    DecisionRow{Properties::InterfaceState, "administrative and operational state of the link",
                [](const InterfaceView& view) -> Found {
                    return kernel(std::uint64_t{isActive(*view.link) ? 1U : 0U});
                }},

    DecisionRow{Properties::IPv4Address, "the address that a DHCP server leased",
                [](const InterfaceView& view) -> Found {
                    if (view.leases.empty()) {
                        return std::nullopt;
                    }
                    const Lease& lease = *view.leases.front();
                    return from(lease, lease.address);
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
                    return firstIPv4(
                        view, [](const Address& address) { return address.scope < RT_SCOPE_LINK; });
                }},
    DecisionRow{Properties::IPv4Address, "an address of the link only",
                [](const InterfaceView& view) {
                    return firstIPv4(view, [](const Address& address) {
                        return address.scope == RT_SCOPE_LINK;
                    });
                }},

    DecisionRow{
        Properties::DHCPEnabled, "the master owns the addresses of its ports",
        [](const InterfaceView& view) { return view.enslaved ? Found{kernel(false)} : Found{}; }},
    DecisionRow{Properties::DHCPEnabled, "the link's manager uses DHCP",
                [](const InterfaceView& view) -> Found {
                    for (const bool ipv6 : {false, true}) {
                        if (const auto* const management = view.dhcpManagement(ipv6)) {
                            return from(*management, true);
                        }
                    }
                    return std::nullopt;
                }},
    DecisionRow{Properties::DHCPEnabled, "a client runs on the link",
                [](const InterfaceView& view) -> Found {
                    return view.processes.empty() ? Found{} : from(*view.processes.front(), true);
                }},
    DecisionRow{Properties::DHCPEnabled, "an address of the link is leased",
                [](const InterfaceView& view) -> Found {
                    for (const auto* leases : {&view.leases, &view.leases6}) {
                        if (!leases->empty()) {
                            return from(*leases->front(), true);
                        }
                    }
                    return std::nullopt;
                }},
    DecisionRow{Properties::DHCPEnabled, "a socket listens on the link's DHCP client port",
                [](const InterfaceView& view) {
                    return view.socket != nullptr || view.openSocket != nullptr
                               ? Found{fromSocket(true)}
                               : Found{};
                }},
    DecisionRow{Properties::DHCPEnabled,
                "an IPv4 address with an end, where this user may not see all clients",
                [](const InterfaceView& view) {
                    return view.hidden && firstIPv4(view, hasEnd) ? Found{kernel(true)} : Found{};
                }},
    DecisionRow{Properties::DHCPEnabled, "the link's manager does not use DHCP",
                [](const InterfaceView& view) -> Found {
                    for (const LinkConfiguration* management : view.managements) {
                        if (!view.hidden && !view.unheard6 && hasDhcp(*management)) {
                            return from(*management, false);
                        }
                    }
                    return std::nullopt;
                }},
    DecisionRow{Properties::DHCPEnabled, "no client has the link, and no address of it is leased",
                [](const InterfaceView& view) -> Found {
                    return view.hidden || view.unheard6 || firstIPv4(view, hasEnd) ? Found{}
                                                                                   : kernel(false);
                }},

    DecisionRow{Properties::AddressSource, "the master owns the addresses of its ports",
                [](const InterfaceView& view) {
                    return view.enslaved ? Found{kernel(source(AddressSource::Unknown))} : Found{};
                }},
    DecisionRow{Properties::AddressSource, "a live lease names this very address",
                [](const InterfaceView& view) -> Found {
                    const Lease* const lease = leaseOf(view);
                    return lease == nullptr ? Found{} : from(*lease, source(sourceOf(*lease)));
                }},
    DecisionRow{Properties::AddressSource, "the link's manager was told this very address",
                [](const InterfaceView& view) -> Found {
                    const auto* const told = naming(view.managements, view.address);
                    return told == nullptr ? Found{} : from(*told, source(AddressSource::Static));
                }},
    DecisionRow{Properties::AddressSource, "169.254/16 with link scope (RFC 3927)",
                [](const InterfaceView& view) {
                    return view.address != nullptr && isLinkLocal(*view.address)
                               ? Found{kernel(source(AddressSource::LinkLocal))}
                               : Found{};
                }},
    DecisionRow{Properties::AddressSource, "the link's manager uses the address for others",
                [](const InterfaceView& view) -> Found {
                    for (const LinkConfiguration* management : view.managements) {
                        if (view.address != nullptr && management->other4) {
                            return from(*management, source(AddressSource::Other));
                        }
                    }
                    return std::nullopt;
                }},
    DecisionRow{Properties::AddressSource, "a DHCP client listens at this very address",
                [](const InterfaceView& view) {
                    return view.address != nullptr && view.socket != nullptr &&
                                   view.socket->address == view.address->ip
                               ? Found{fromSocket(source(AddressSource::DHCP))}
                               : Found{};
                }},
    DecisionRow{Properties::AddressSource,
                "an IPv4 address with an end, where a DHCP client may have set it",
                [](const InterfaceView& view) {
                    return view.address != nullptr && hasEnd(*view.address) &&
                                   mayTakeAddresses(view)
                               ? Found{kernel(source(AddressSource::DHCP))}
                               : Found{};
                }},
    DecisionRow{Properties::AddressSource, "a lease that has ended names this very address",
                [](const InterfaceView& view) -> Found {
                    for (const Lease* lease : view.ended) {
                        if (view.address != nullptr && lease->address == view.address->ip) {
                            // A client that asks anew is not bound by what it had.
                            return from(*lease,
                                        source(mayTakeAddresses(view) ? AddressSource::Unknown
                                                                      : sourceOf(*lease)));
                        }
                    }
                    return std::nullopt;
                }},
    DecisionRow{Properties::AddressSource, "the configuration names this very address",
                [](const InterfaceView& view) -> Found {
                    const auto* const told = naming(view.configurations, view.address);
                    return told == nullptr ? Found{} : from(*told, source(AddressSource::Static));
                }},
    DecisionRow{Properties::AddressSource, "udhcpc runs, which sets addresses without an end",
                [](const InterfaceView& view) -> Found {
                    const ClientProcess* const process = view.process(false);
                    return view.address != nullptr && isPermanent(*view.address) &&
                                   process != nullptr && process->client == Client::Udhcpc &&
                                   !isAsking(view, *process)
                               ? Found{from(*process, source(AddressSource::DHCP))}
                               : Found{};
                }},
    DecisionRow{Properties::AddressSource, "permanent, and no DHCPv4 client that could have set it",
                [](const InterfaceView& view) {
                    return view.address != nullptr && isPermanent(*view.address) &&
                                   !mayTakeAddresses(view)
                               ? Found{kernel(source(AddressSource::Static))}
                               : Found{};
                }},
    DecisionRow{Properties::AddressSource, "an address that no program and no file tells of",
                [](const InterfaceView& view) {
                    return view.address != nullptr ? Found{kernel(source(AddressSource::Unknown))}
                                                   : Found{};
                }},
    DecisionRow{Properties::AddressSource, "a live DHCPv6 lease, and no IPv4 address",
                [](const InterfaceView& view) -> Found {
                    return view.leases6.empty()
                               ? Found{}
                               : from(*view.leases6.front(), source(AddressSource::DHCP));
                }},
    DecisionRow{Properties::AddressSource, "no address",
                [](const InterfaceView& view) -> Found {
                    return view.unheard6 ? Found{} : kernel(source(AddressSource::Unknown));
                }},

    DecisionRow{Properties::DHCPServerAddresses, "the master owns the addresses of its ports",
                [](const InterfaceView& view) {
                    return view.enslaved ? Found{kernel(AddressList{})} : Found{};
                }},
    DecisionRow{Properties::DHCPServerAddresses, "the servers of the live leases", servers},
    DecisionRow{Properties::DHCPServerAddresses, "the one that the link's DHCP client talks to",
                [](const InterfaceView& view) {
                    return view.socket != nullptr && view.socket->peer
                               ? Found{fromSocket(AddressList{{*view.socket->peer}})}
                               : Found{};
                }},
    DecisionRow{Properties::DHCPServerAddresses, "no client tells of a server",
                [](const InterfaceView& /*view*/) -> Found { return kernel(AddressList{}); }},
};

}  // namespace

std::span<const DecisionRow> precedence() {
    return rows;
}

}  // namespace ZR::Live
