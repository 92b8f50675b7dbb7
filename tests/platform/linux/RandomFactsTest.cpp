// What holds of every tree, whatever the facts: two thousand machines of random facts.

#include <gtest/gtest.h>
#include <linux/if.h>
#include <linux/if_addr.h>
#include <linux/if_arp.h>
#include <linux/rtnetlink.h>

#include <array>
#include <cstddef>
#include <memory>
#include <random>

#include "Decide.h"
#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

constexpr int machines = 2'000;

/// Random facts about few links, addresses and clients, so that many of them meet.
class RandomFacts {
  public:
    explicit RandomFacts(unsigned seed) : random_(seed) {}

    MachineFacts machine() {
        MachineFacts facts;
        facts.hostName = "host";
        for (std::uint32_t ifindex = 1; ifindex <= 1 + below(3); ++ifindex) {
            facts.links.push_back(link(ifindex));
        }
        repeat(facts.addresses, [this] { return address(); });
        repeat(facts.clients.leases, [this] { return lease(); });
        repeat(facts.clients.managements, [this] { return configuration(); });
        repeat(facts.clients.configurations, [this] { return configuration(); });
        repeat(facts.clients.processes, [this] { return process(); });
        if (below(4) == 0) {
            repeat(facts.clients.hiddenClients, [this] { return process(); });
            facts.clients.processesHidden = below(3) == 0;
        }
        repeat(facts.clients.sockets.bound,
               [this] { return PortSocket{.address = maybe(ip4()), .peer = maybe(ip4())}; });
        repeat(facts.clients.sockets.packetLinks, [this] { return 1 + below(3); });
        if (below(3) == 0) {
            constexpr std::array managers{Client::Networkd, Client::NetworkManager,
                                          Client::Connman};
            repeat(facts.clients.unheardManagers, [&] { return oneOf(managers); });
        }
        if (below(8) == 0) {
            facts.clients.boot = {.bootp = flip(), .server = maybe(ip4()), .origin = "pnp"};
        }
        return facts;
    }

  private:
    std::uint32_t below(std::uint32_t end) {
        return std::uniform_int_distribution<std::uint32_t>{0, end - 1}(random_);
    }
    bool flip() { return below(2) == 0; }

    template <typename Value>
    std::optional<Value> maybe(const Value& value) {
        return flip() ? std::optional{value} : std::nullopt;
    }
    template <typename Value, std::size_t size>
    Value oneOf(const std::array<Value, size>& values) {
        return values.at(below(size));
    }
    template <typename Value, typename Make>
    void repeat(std::vector<Value>& values, Make make) {
        for (std::uint32_t count = below(4); count > 0; --count) {
            values.push_back(make());
        }
    }

    InterfaceName name() { return interfaceName("eth" + std::to_string(1 + below(4))); }
    IpAddress ip4() { return ipAddress("192.0.2." + std::to_string(1 + below(3))); }
    IpAddress ip() { return below(3) == 0 ? "2001:db8::1"_ip : ip4(); }
    Client client() {
        return oneOf(std::array{Client::Networkd, Client::NetworkManager, Client::Wicked,
                                Client::Connman, Client::Dhclient, Client::Dhcpcd, Client::Udhcpc,
                                Client::Ipconfig});
    }
    std::int64_t time() {
        return oneOf(std::array{now - 1000, now - 1, now, now + 1, now + 590, now + 600,
                                now + 1'000'000, Lease::never, std::int64_t{-1}});
    }

    Link link(std::uint32_t ifindex) {
        const bool port = below(6) == 0;
        return {.ifindex = ifindex,
                .name = interfaceName("eth" + std::to_string(ifindex)),
                .flags = flip() ? std::uint32_t{IFF_UP} | IFF_BROADCAST : 0U,
                .arphrdType = ARPHRD_ETHER,
                .kind = oneOf(std::array<std::string, 4>{"", "veth", "bridge", "tun"}),
                .slaveKind = port ? "bridge" : "",
                .master = port ? 9U : 0U,
                .carrier = maybe(true),
                .farNamespace = maybe(static_cast<std::int32_t>(below(2)))};
    }
    Address address() {
        return {.ifindex = 1 + below(3),
                .ip = ip(),
                .flags = flip() ? std::uint32_t{IFA_F_PERMANENT} : 0U,
                .scope = flip() ? std::uint8_t{RT_SCOPE_UNIVERSE} : std::uint8_t{RT_SCOPE_LINK},
                .validLifetime = oneOf(std::array<std::uint32_t, 4>{0, 1, 600, Address::infinite})};
    }
    Lease lease() {
        Lease lease{.client = client(),
                    .interfaceName = maybe(name()),
                    .ifindex = below(3) == 0 ? 1 + below(3) : 0,
                    .address = ip(),
                    .server = maybe(ip()),
                    .bootp = below(6) == 0,
                    .released = below(6) == 0,
                    .clientAlive = flip(),
                    .expires = maybe(time())};
        lease.obtained = maybe(time());
        lease.renews = maybe(time());
        lease.rebinds = maybe(time());
        lease.outlivesEnd = below(6) == 0;
        return lease;
    }
    LinkConfiguration configuration() {
        return {.client = client(),
                .ifindex = flip() ? 1 + below(3) : 0,
                .interfaceName = maybe(name()),
                .dhcp4 = maybe(flip()),
                .dhcp6 = maybe(flip()),
                .staticAddresses = flip() ? std::vector{ip4()} : std::vector<IpAddress>{},
                .linkLocal4 = flip(),
                .bootp4 = flip(),
                .other4 = flip()};
    }
    ClientProcess process() {
        ClientProcess process{.client = client(),
                              .interfaces = {},
                              .leaseFile = "",
                              .ipv6 = below(3) == 0,
                              .pid = 17};
        repeat(process.interfaces, [this] { return name(); });
        if (flip()) {
            process.heardLinks.emplace();
            repeat(*process.heardLinks, [this] { return 1 + below(3); });
        }
        return process;
    }

    std::mt19937 random_;
};

PropertyValue propertyOf(const Snapshot& tree, Snapshot::Index node, Properties property) {
    const auto* const found = tree.find(node, property);
    return found == nullptr ? PropertyValue{} : found->value;
}

std::optional<std::uint64_t> timeOf(const Snapshot& tree, Snapshot::Index node,
                                    Properties property) {
    const PropertyValue value = propertyOf(tree, node, property);
    const auto* const time = std::get_if<std::uint64_t>(&value);
    return time == nullptr ? std::nullopt : std::optional{*time};
}

/// Calls the action with each node of a type, of so many machines.
template <typename Action>
void forEachNode(NodeType type, Action action) {
    for (int seed = 0; seed < machines; ++seed) {
        const auto tree = decide(RandomFacts{static_cast<unsigned>(seed)}.machine(), now);
        for (auto node = tree->first(type); node != Snapshot::none;
             node = tree->node(node).nextOfType) {
            action(*tree, node, seed);
        }
        if (testing::Test::HasFailure()) {
            return;  // one machine is enough to look at
        }
    }
}

TEST(RandomFacts, AnAccessPointNeverLacksItsEndpoint) {
    int servers = 0;
    forEachNode(NodeType::NetworkInterface, [&](const Snapshot& tree, Snapshot::Index node,
                                                int seed) {
        const PropertyValue value = propertyOf(tree, node, Properties::DHCPServerAddresses);
        if (!std::get<std::vector<std::string>>(value).empty()) {
            ++servers;
            EXPECT_EQ(propertyOf(tree, node, Properties::DHCPEnabled), PropertyValue{true}) << seed;
        }
    });
    EXPECT_GT(servers, 100);
}

TEST(RandomFacts, NothingIsObtainedByDhcpWithoutAnAddress) {
    int bound = 0;
    forEachNode(
        NodeType::NetworkInterface, [&](const Snapshot& tree, Snapshot::Index node, int seed) {
            if (propertyOf(tree, node, Properties::AddressSource) != number(1)) {
                return;
            }
            ++bound;
            bool leased6 = false;
            for (auto lease = tree.first(NodeType::DHCPLease); lease != Snapshot::none;
                 lease = tree.node(lease).nextOfType) {
                leased6 = leased6 ||
                          (tree.node(lease).parent == node &&
                           propertyOf(tree, lease, Properties::Family) == PropertyValue{"IPv6"});
            }
            EXPECT_TRUE(leased6 || tree.find(node, Properties::IPv4Address) != nullptr) << seed;
        });
    EXPECT_GT(bound, 100);
}

TEST(RandomFacts, ALeaseStandsBelowAnInterfaceThatHasDhcp) {
    int leases = 0;
    forEachNode(NodeType::DHCPLease, [&](const Snapshot& tree, Snapshot::Index node, int seed) {
        ++leases;
        const Snapshot::Index interface = tree.node(node).parent;
        EXPECT_EQ(tree.node(interface).type, "NetworkInterface") << seed;
        EXPECT_EQ(propertyOf(tree, interface, Properties::DHCPEnabled), PropertyValue{true})
            << seed;
        EXPECT_NE(tree.find(node, Properties::Family), nullptr) << seed;
        EXPECT_NE(tree.find(node, Properties::ClientState), nullptr) << seed;
    });
    EXPECT_GT(leases, 100);
}

TEST(RandomFacts, AnInterfaceWithDhcpHasALeaseOrAClientThatAsks) {
    forEachNode(
        NodeType::NetworkInterface, [](const Snapshot& tree, Snapshot::Index node, int seed) {
            bool any = false;
            for (auto lease = tree.first(NodeType::DHCPLease); lease != Snapshot::none;
                 lease = tree.node(lease).nextOfType) {
                any = any || tree.node(lease).parent == node;
            }
            EXPECT_EQ(any, propertyOf(tree, node, Properties::DHCPEnabled) == PropertyValue{true})
                << seed;
        });
}

TEST(RandomFacts, TheTimesOfALeaseAreInOrder) {
    constexpr std::array order{Properties::LeaseObtained, Properties::RenewalTime,
                               Properties::RebindingTime, Properties::LeaseExpires};
    int times = 0;
    forEachNode(NodeType::DHCPLease, [&](const Snapshot& tree, Snapshot::Index node, int seed) {
        std::uint64_t last = 0;
        for (const Properties property : order) {
            if (const auto time = timeOf(tree, node, property)) {
                ++times;
                EXPECT_GE(*time, last) << seed;
                EXPECT_LE(*time, NodeLexicon::never) << seed;
                last = *time;
            }
        }
        EXPECT_LE(timeOf(tree, node, Properties::LeaseObtained).value_or(0), now) << seed;
    });
    EXPECT_GT(times, 100);
}

TEST(RandomFacts, WhatIsTakenFromAnotherTimeIsWhatWouldBeDecided) {
    Decided before;
    int changed = 0;
    for (int seed = 0; seed < machines && !testing::Test::HasFailure(); ++seed) {
        // Of one machine, and of it with some of what another one has.
        MachineFacts facts = RandomFacts{static_cast<unsigned>(seed)}.machine();
        MachineFacts other = RandomFacts{static_cast<unsigned>(seed + machines)}.machine();
        if (seed % 2 == 0) {
            facts.clients = {};
            other.clients.leases.clear();
        }
        before = decide(std::make_unique<const Machine>(facts, now), before);
        EXPECT_EQ(*before.tree, *decide(facts, now)) << seed;
        switch (seed % 5) {
            case 0:
                facts.links = other.links;
                break;
            case 1:
                facts.addresses = other.addresses;
                break;
            case 2:
                facts.clients = other.clients;
                break;
            case 3:
                facts.links.back() = other.links.back();
                break;
            default:
                facts.clients.processesHidden = !facts.clients.processesHidden;
                break;
        }
        const auto old = before.tree;
        before = decide(std::make_unique<const Machine>(facts, now + 1), before);
        EXPECT_EQ(*before.tree, *decide(facts, now + 1)) << seed;
        changed += *before.tree == *old ? 0 : 1;
    }
    EXPECT_GT(changed, machines / 4);
}

TEST(RandomFacts, NothingChangesBeforeItIsSaidTo) {
    for (int seed = 0; seed < machines && !testing::Test::HasFailure(); ++seed) {
        MachineFacts facts = RandomFacts{static_cast<unsigned>(seed)}.machine();
        std::erase_if(facts.addresses, [](const Address& address) {
            return address.validLifetime <= 1;  // the kernel tells when it takes it away
        });
        const Machine machine{facts, now};
        ASSERT_GT(machine.changesAt(), now) << seed;
        if (machine.changesAt() > now + 2) {
            // A second later the kernel's lifetimes are shorter by that.
            MachineFacts later = facts;
            for (Address& address : later.addresses) {
                if (address.validLifetime != Address::infinite) {
                    --address.validLifetime;
                }
            }
            const auto first = decide(facts, now);
            const auto second = decide(later, now + 1);
            for (const auto property : {Properties::DHCPEnabled, Properties::AddressSource}) {
                for (const char* name : {"eth1", "eth2", "eth3"}) {
                    EXPECT_EQ(valueOf(*second, name, property), valueOf(*first, name, property))
                        << seed;
                }
            }
        }
    }
}

}  // namespace
}  // namespace ZR::Live
