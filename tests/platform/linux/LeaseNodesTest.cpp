#include "LeaseNodes.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <linux/if.h>
#include <linux/if_addr.h>
#include <linux/if_arp.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using NodeLexicon::ClientState;
using NodeLexicon::NodeType;
using NodeLexicon::Properties;
using testing::ElementsAre;
using testing::IsEmpty;

PropertyValue time(std::int64_t value) {
    return static_cast<std::uint64_t>(value);
}
PropertyValue state(ClientState value) {
    return number(static_cast<unsigned int>(value));
}

/// The interface eth0, of index 2, with 192.0.2.7 and 2001:db8::7 for ten minutes.
class LeaseNodesTest : public testing::Test {
  protected:
    LeaseNodesTest() {
        facts_.links.push_back({.ifindex = 2,
                                .name = "eth0"_name,
                                .flags = std::uint32_t{IFF_UP} | IFF_BROADCAST,
                                .arphrdType = ARPHRD_ETHER,
                                .kind = "",
                                .slaveKind = "",
                                .hasParentDevice = true,
                                .carrier = {}});
        facts_.addresses = {{.ifindex = 2, .ip = "192.0.2.7"_ip, .validLifetime = 600},
                            {.ifindex = 2, .ip = "2001:db8::7"_ip, .validLifetime = 600}};
    }

    Lease& lease(const std::string& address = "192.0.2.7") {
        facts_.clients.leases.push_back({.client = Client::Dhclient,
                                         .interfaceName = "eth0"_name,
                                         .address = ipAddress(address),
                                         .server = {},
                                         .clientAlive = true,
                                         .expires = now + 600});
        return facts_.clients.leases.back();
    }
    ClientProcess& process(Client client = Client::Dhclient, bool ipv6 = false) {
        facts_.clients.processes.push_back({.client = client,
                                            .interfaces = {"eth0"_name},
                                            .leaseFile = "",
                                            .ipv6 = ipv6,
                                            .pid = 17});
        return facts_.clients.processes.back();
    }
    LinkConfiguration& management(bool dhcp4, bool dhcp6 = false) {
        facts_.clients.managers = {
            {.client = Client::Networkd, .where = ManagerProcess::Where::Here, .pid = 7}};
        facts_.clients.managements.push_back({.client = Client::Networkd,
                                              .ifindex = 2,
                                              .dhcp4 = dhcp4,
                                              .dhcp6 = dhcp6,
                                              .staticAddresses = {},
                                              .origin = "links/2"});
        return facts_.clients.managements.back();
    }

    /// The properties of each lease node of eth0.
    std::vector<std::vector<SnapshotProperty>> nodes() {
        tree_ = decide(facts_, now, Explain::Yes);
        std::vector<std::vector<SnapshotProperty>> found;
        for (auto node = tree_->first(NodeType::DHCPLease); node != Snapshot::none;
             node = tree_->node(node).nextOfType) {
            EXPECT_EQ(tree_->node(node).parent, interfaceNode(*tree_, "eth0"));
            EXPECT_EQ(tree_->node(node).type, "DHCPLease");
            EXPECT_EQ(tree_->node(node).description, "DHCP lease");
            const auto properties = tree_->properties(node);
            found.emplace_back(properties.begin(), properties.end());
        }
        return found;
    }
    /// A property of one of them; unreadable when it is not there.
    PropertyValue value(Properties property, std::size_t place = 0) {
        const auto all = nodes();
        for (const SnapshotProperty& each : all.at(place)) {
            if (each.id == property) {
                return each.value;
            }
        }
        return {};
    }

    MachineFacts facts_;
    std::shared_ptr<const Snapshot> tree_;
};

TEST_F(LeaseNodesTest, ALeaseTellsAllThatItsFileSays) {
    lease() = {.client = Client::Dhclient,
               .interfaceName = "eth0"_name,
               .address = "192.0.2.7"_ip,
               .server = "192.0.2.1"_ip,
               .clientAlive = true,
               .expires = now + 600,
               .obtained = now - 600,
               .renews = now,
               .rebinds = now + 450,
               .options = {1, 3, 51, 54},
               .clientIdentifier = "1:52:54:0:ab:cd:ef",
               .pid = 17,
               .origin = "/var/lib/dhcp/dhclient.leases"};
    process();
    const auto property = [](Properties id, PropertyValue value) {
        return SnapshotProperty{id, false, std::move(value)};
    };
    EXPECT_THAT(nodes(), ElementsAre(ElementsAre(
                             property(Properties::Family, "IPv4"),
                             property(Properties::ClientState, state(ClientState::Bound)),
                             property(Properties::Address, "192.0.2.7"),
                             property(Properties::ServerAddress, "192.0.2.1"),
                             property(Properties::LeaseObtained, time(now - 600)),
                             property(Properties::RenewalTime, time(now)),
                             property(Properties::RebindingTime, time(now + 450)),
                             property(Properties::LeaseExpires, time(now + 600)),
                             property(Properties::OptionsReceived, NumberList{{1, 3, 51, 54}}),
                             property(Properties::ClientIdentifier, "1:52:54:0:ab:cd:ef"),
                             property(Properties::Client, "dhclient"),
                             property(Properties::Process, number(17)),
                             property(Properties::Source, "/var/lib/dhcp/dhclient.leases"),
                             property(Properties::ClientRuns, true))));
    const auto node = tree_->first(NodeType::DHCPLease);
    EXPECT_EQ(tree_->origin(node, Properties::Address),
              "dhclient, process 17 /var/lib/dhcp/dhclient.leases: a live lease");
}

TEST_F(LeaseNodesTest, WhatIsNotKnownIsLeftOut) {
    lease();
    EXPECT_THAT(nodes(),
                ElementsAre(ElementsAre(
                    SnapshotProperty{Properties::Family, false, "IPv4"},
                    SnapshotProperty{Properties::ClientState, false, state(ClientState::Bound)},
                    SnapshotProperty{Properties::Address, false, "192.0.2.7"},
                    SnapshotProperty{Properties::LeaseExpires, false, time(now + 600)},
                    SnapshotProperty{Properties::Client, false, "dhclient"},
                    SnapshotProperty{Properties::ClientRuns, false, true})));
}

TEST_F(LeaseNodesTest, OfAClientThatIsNotSeenItIsNotKnownWhetherItRuns) {
    lease().clientAlive = false;
    EXPECT_EQ(value(Properties::ClientRuns), PropertyValue{false});
    facts_.clients.processesHidden = true;
    EXPECT_EQ(value(Properties::ClientRuns), PropertyValue{});
    facts_.clients.leases[0].clientAlive = true;
    EXPECT_EQ(value(Properties::ClientRuns), PropertyValue{true});
}

TEST_F(LeaseNodesTest, ALeaseThatIsRebindingSaysSo) {
    lease().rebinds = now;
    EXPECT_EQ(value(Properties::ClientState), state(ClientState::Rebinding));
    facts_.clients.leases[0].rebinds = now + 1;
    facts_.clients.leases[0].renews = now - 1;
    EXPECT_EQ(value(Properties::ClientState), state(ClientState::Bound)) << "while it renews, too";
    facts_.clients.leases[0].rebinds = now;
    facts_.clients.leases[0].clientAlive = false;
    EXPECT_EQ(value(Properties::ClientState), state(ClientState::Bound)) << "nothing asks";
}

TEST_F(LeaseNodesTest, ALeaseWithoutAnEndExpiresNever) {
    facts_.addresses[0].validLifetime = Address::infinite;
    lease().expires = Lease::never;
    EXPECT_EQ(value(Properties::LeaseExpires), PropertyValue{NodeLexicon::never});
    facts_.clients.leases[0].expires = now + UINT32_MAX;
    EXPECT_EQ(value(Properties::LeaseExpires), PropertyValue{NodeLexicon::never});
    facts_.clients.leases[0].expires = std::nullopt;
    EXPECT_EQ(value(Properties::LeaseExpires), PropertyValue{}) << "its client does not tell";
}

TEST_F(LeaseNodesTest, TimesThatAreNotInOrderAreLeftOut) {
    Lease& disordered = lease();
    disordered.obtained = now + 1;
    disordered.renews = now + 500;
    disordered.rebinds = now + 400;
    EXPECT_EQ(value(Properties::LeaseObtained), PropertyValue{}) << "ahead";
    EXPECT_EQ(value(Properties::RenewalTime), PropertyValue{}) << "behind the other";
    EXPECT_EQ(value(Properties::RebindingTime), time(now + 400));
    disordered.rebinds = now + 601;
    EXPECT_EQ(value(Properties::RebindingTime), PropertyValue{}) << "behind the end";
    EXPECT_EQ(value(Properties::RenewalTime), time(now + 500));
    disordered.obtained = now - 1;
    disordered.renews = now - 2;
    disordered.rebinds = now - 3;
    EXPECT_EQ(value(Properties::RenewalTime), PropertyValue{}) << "before the beginning";
    EXPECT_EQ(value(Properties::RebindingTime), PropertyValue{});
}

TEST_F(LeaseNodesTest, EachFamilyAndEachAddressHasItsOwn) {
    facts_.addresses.push_back({.ifindex = 2, .ip = "192.0.2.8"_ip, .validLifetime = 600});
    lease("2001:db8::7");
    lease("192.0.2.7");
    lease("192.0.2.8").client = Client::Udhcpc;
    ASSERT_EQ(nodes().size(), 3U);
    EXPECT_EQ(value(Properties::Address, 0), PropertyValue{"192.0.2.7"});
    EXPECT_EQ(value(Properties::Address, 1), PropertyValue{"192.0.2.8"});
    EXPECT_EQ(value(Properties::Address, 2), PropertyValue{"2001:db8::7"});
    EXPECT_EQ(value(Properties::Family, 2), PropertyValue{"IPv6"});
}

TEST_F(LeaseNodesTest, OfTwoClaimsOnOneAddressTheRunningClientsCounts) {
    lease().clientAlive = false;
    lease().client = Client::NetworkManager;
    ASSERT_EQ(nodes().size(), 1U);
    EXPECT_EQ(value(Properties::Client), PropertyValue{"NetworkManager"});
}

TEST_F(LeaseNodesTest, AClientWithoutALeaseAsks) {
    facts_.addresses.clear();
    process();
    EXPECT_THAT(nodes(),
                ElementsAre(ElementsAre(
                    SnapshotProperty{Properties::Family, false, "IPv4"},
                    SnapshotProperty{Properties::ClientState, false, state(ClientState::Unknown)},
                    SnapshotProperty{Properties::Client, false, "dhclient"},
                    SnapshotProperty{Properties::Process, false, number(17)})));
    EXPECT_EQ(tree_->origin(tree_->first(NodeType::DHCPLease), Properties::Client),
              "dhclient, process 17: a client runs on the link");
    process(Client::Dhcp6c, true);
    ASSERT_EQ(nodes().size(), 2U);
    EXPECT_EQ(value(Properties::Family, 1), PropertyValue{"IPv6"});
    EXPECT_EQ(value(Properties::Client, 1), PropertyValue{"dhcp6c"});
}

TEST_F(LeaseNodesTest, AClientThatHoldsALeaseDoesNotAskBesides) {
    process();
    lease();
    EXPECT_EQ(nodes().size(), 1U);
    process(Client::Udhcpc);
    ASSERT_EQ(nodes().size(), 2U) << "another client asks";
    EXPECT_EQ(value(Properties::Client, 1), PropertyValue{"udhcpc"});
    EXPECT_EQ(value(Properties::Address, 1), PropertyValue{}) << "which is not its own";
}

TEST_F(LeaseNodesTest, AManagerAsksForEachFamilyThatItWants) {
    facts_.addresses.clear();
    management(true, true);
    ASSERT_EQ(nodes().size(), 2U);
    for (const std::size_t place : {0U, 1U}) {
        EXPECT_EQ(value(Properties::Client, place), PropertyValue{"systemd-networkd"});
        EXPECT_EQ(value(Properties::Process, place), number(7));
        EXPECT_EQ(value(Properties::Source, place), PropertyValue{"links/2"});
        EXPECT_EQ(value(Properties::Address, place), PropertyValue{});
    }
    process();
    EXPECT_EQ(nodes().size(), 2U) << "which the manager started";
    facts_.addresses = {{.ifindex = 2, .ip = "192.0.2.7"_ip, .validLifetime = 600}};
    lease().client = Client::Networkd;
    EXPECT_EQ(nodes().size(), 2U);
    EXPECT_EQ(value(Properties::Address), PropertyValue{"192.0.2.7"});
    EXPECT_EQ(value(Properties::Process), number(7)) << "that of the manager";
}

TEST_F(LeaseNodesTest, AClientWithoutAKnownLeaseHasTheAddressThatDhcpGave) {
    process();
    ASSERT_EQ(nodes().size(), 1U);
    EXPECT_EQ(value(Properties::Address), PropertyValue{"192.0.2.7"});
    EXPECT_EQ(value(Properties::LeaseExpires), time(now + 600)) << "the kernel tells it";
    EXPECT_EQ(value(Properties::ClientState), state(ClientState::Unknown));
    facts_.addresses[0].validLifetime = Address::infinite;
    facts_.addresses[0].flags = IFA_F_PERMANENT;
    EXPECT_EQ(value(Properties::Address), PropertyValue{}) << "it may be set by hand";
    facts_.clients.processes[0].client = Client::Udhcpc;
    EXPECT_EQ(value(Properties::Address), PropertyValue{"192.0.2.7"});
    EXPECT_EQ(value(Properties::LeaseExpires), PropertyValue{});
}

TEST_F(LeaseNodesTest, ASocketThatAloneTellsOfAClientIsOneToo) {
    facts_.clients.sockets.bound = {{.address = "192.0.2.7"_ip, .peer = "192.0.2.1"_ip}};
    ASSERT_EQ(nodes().size(), 1U);
    EXPECT_EQ(value(Properties::Address), PropertyValue{"192.0.2.7"});
    EXPECT_EQ(value(Properties::Client), PropertyValue{}) << "whose it is, is not known";
    EXPECT_EQ(value(Properties::Source), PropertyValue{"/proc/net/udp"});
}

TEST_F(LeaseNodesTest, AnInterfaceWithoutDhcpHasNone) {
    facts_.addresses[0].validLifetime = Address::infinite;
    facts_.addresses[0].flags = IFA_F_PERMANENT;
    lease().clientAlive = false;
    management(false);
    EXPECT_THAT(nodes(), IsEmpty());
}

TEST_F(LeaseNodesTest, APortHasNone) {
    facts_.links[0].master = 9;
    facts_.links[0].slaveKind = "bridge";
    lease();
    process();
    EXPECT_THAT(nodes(), IsEmpty());
}

TEST_F(LeaseNodesTest, ALeaseThatHasEndedIsNone) {
    facts_.addresses[0].validLifetime = Address::infinite;
    lease().expires = now;
    facts_.clients.leases[0].client = Client::Ipconfig;
    facts_.clients.leases[0].outlivesEnd = true;
    EXPECT_THAT(nodes(), IsEmpty());
}

}  // namespace
}  // namespace ZR::Live
