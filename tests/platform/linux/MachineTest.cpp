#include "Machine.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <linux/if.h>
#include <linux/if_arp.h>
#include <sys/socket.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pointee;

/// Links eth2 and eth3, of these indexes, with 192.0.2.2 and 192.0.2.3.
class MachineTest : public testing::Test {
  protected:
    MachineTest() {
        for (const std::uint32_t ifindex : {2U, 3U}) {
            const std::string number = std::to_string(ifindex);
            facts_.links.push_back({.ifindex = ifindex,
                                    .name = interfaceName("eth" + number),
                                    .flags = std::uint32_t{IFF_UP} | IFF_BROADCAST,
                                    .arphrdType = ARPHRD_ETHER,
                                    .kind = "",
                                    .slaveKind = "",
                                    .carrier = {}});
            facts_.addresses.push_back(
                {.ifindex = ifindex, .ip = ipAddress("192.0.2." + number), .validLifetime = 600});
        }
    }
    static Lease lease(const std::string& interface, const std::string& address) {
        return {.client = Client::Dhcpcd,
                .interfaceName = InterfaceName::from(interface),
                .address = ipAddress(address),
                .server = "192.0.2.1"_ip,
                .expires = now + 600};
    }
    Machine& machine() {
        machine_ = std::make_unique<Machine>(facts_, now);
        return *machine_;
    }
    const InterfaceView& first() { return machine().interfaces()[0]; }

    MachineFacts facts_;
    std::unique_ptr<Machine> machine_;
};

TEST_F(MachineTest, LeasesOfBothProtocolsStandApart) {
    facts_.addresses.push_back({.ifindex = 2, .ip = "2001:db8::2"_ip, .validLifetime = 600});
    facts_.clients.leases = {lease("eth2", "192.0.2.2"), lease("eth2", "2001:db8::2")};
    const InterfaceView& view = first();
    EXPECT_THAT(view.leases, ElementsAre(Pointee(facts_.clients.leases[0])));
    EXPECT_THAT(view.leases6, ElementsAre(Pointee(facts_.clients.leases[1])));
}

TEST_F(MachineTest, ALeaseThatHasEndedIsKeptWhileItsAddressIsThere) {
    facts_.clients.leases = {lease("eth2", "192.0.2.2")};
    facts_.clients.leases[0].expires = now;
    facts_.addresses[0].validLifetime = Address::infinite;
    EXPECT_THAT(first().ended, IsEmpty()) << "such a client sets addresses with an end";
    facts_.clients.leases[0].outlivesEnd = true;
    EXPECT_THAT(first().ended, ElementsAre(Pointee(facts_.clients.leases[0])));
    EXPECT_THAT(first().leases, IsEmpty());
    facts_.addresses.clear();
    EXPECT_THAT(first().ended, IsEmpty());
}

TEST_F(MachineTest, ItChangesByItselfWhenTheFirstLeaseEndsOrIsReboundNext) {
    EXPECT_EQ(machine().changesAt(), Lease::never);
    facts_.clients.leases = {lease("eth2", "192.0.2.2"), lease("eth3", "192.0.2.3")};
    EXPECT_EQ(machine().changesAt(), now + 600);
    facts_.clients.leases[1].rebinds = now + 525;
    EXPECT_EQ(machine().changesAt(), now + 600) << "no client runs that would ask others";
    facts_.clients.leases[1].clientAlive = true;
    EXPECT_EQ(machine().changesAt(), now + 525);
    facts_.clients.leases[1].rebinds = now;
    EXPECT_EQ(machine().changesAt(), now + 600);
    facts_.clients.leases[0].expires = now + 599;
    EXPECT_EQ(machine().changesAt(), now + 599);
    facts_.addresses.clear();
    EXPECT_EQ(machine().changesAt(), Lease::never) << "no lease is live";
}

TEST_F(MachineTest, ALeaseOfUnknownEndHasThatOfItsAddress) {
    facts_.clients.leases = {lease("eth2", "192.0.2.2")};
    facts_.clients.leases[0].expires.reset();
    EXPECT_EQ(first().leases.at(0)->expires, now + 600);
}

TEST_F(MachineTest, AClientHasItsLinkWhateverKindItIs) {
    facts_.links[0].kind = "tun";
    EXPECT_EQ(machine().interfaces().size(), 1U);
    facts_.clients.processes = {
        {.client = Client::Dhclient, .interfaces = {"eth2"_name}, .leaseFile = ""}};
    EXPECT_EQ(machine().interfaces().size(), 2U);
    facts_.clients.processes[0].heardLinks = {3};
    EXPECT_EQ(machine().interfaces().size(), 1U) << "another link has the name by now";
    facts_.clients.processes[0].heardLinks = {2};
    EXPECT_EQ(machine().interfaces().size(), 2U);
    facts_.clients.processes.clear();
    facts_.clients.managements = {{.client = Client::Networkd,
                                   .ifindex = 2,
                                   .dhcp4 = false,
                                   .dhcp6 = {},
                                   .staticAddresses = {}}};
    EXPECT_EQ(machine().interfaces().size(), 1U);
    facts_.clients.managements[0].dhcp6 = true;
    EXPECT_EQ(machine().interfaces().size(), 2U);
    facts_.links[0].flags = IFF_LOOPBACK;
    EXPECT_EQ(machine().interfaces().size(), 1U);
}

TEST_F(MachineTest, ACableThatLeadsOutOfAContainerIsAnInterface) {
    for (Link& link : facts_.links) {
        link.kind = "veth";
        link.farNamespace = static_cast<std::int32_t>(link.ifindex);
    }
    facts_.addresses.clear();
    EXPECT_EQ(machine().interfaces().size(), 1U) << "the other leads elsewhere";
    EXPECT_EQ(first().link->ifindex, 2U);
    facts_.addresses = {{.ifindex = 3, .ip = "fe80::1"_ip}};
    EXPECT_EQ(machine().interfaces().size(), 1U);
    EXPECT_EQ(first().link->ifindex, 3U);
    facts_.links[0].farNamespace = 3;
    EXPECT_EQ(machine().interfaces().size(), 2U);
}

/// The management of a link without a cable, by connman.
LinkConfiguration withoutCable(const std::string& hardwareAddress) {
    return {.client = Client::Connman,
            .hardwareAddress = hardwareAddress,
            .dhcp4 = true,
            .dhcp6 = {},
            .staticAddresses = {}};
}

TEST_F(MachineTest, ALinkWithoutACableIsKnownByItsHardwareAddress) {
    facts_.links[0].hardwareAddress = facts_.links[1].hardwareAddress = "5293d4ee0eca";
    facts_.links[0].kind = "bridge";
    facts_.clients.managements = {withoutCable("5293d4ee0eca")};
    const auto count = [this] { return machine().interfaces()[1].managements.size(); };
    EXPECT_EQ(count(), 1U) << "the bridge has the address of its port";
    EXPECT_EQ(first().managements.size(), 0U);
    facts_.clients.managements[0].names.left = {"eth*"};
    EXPECT_EQ(count(), 0U) << "it was told to leave it alone";
    facts_.clients.managements[0].names = {};
    facts_.links[1].flags |= IFF_LOWER_UP;
    EXPECT_EQ(count(), 0U) << "with a cable, the bus has to tell of it";
    facts_.links[1].flags &= ~std::uint32_t{IFF_LOWER_UP};
    facts_.links[1].hardwareAddress = "5293d4ee0ecb";
    EXPECT_EQ(count(), 0U);
}

TEST_F(MachineTest, ACableThatIsOutIsAnInterfaceThatItsManagerTakes) {
    for (Link& link : facts_.links) {
        link.kind = "veth";
        link.hardwareAddress = "5293d4ee0ec" + std::to_string(link.ifindex);
    }
    facts_.addresses.clear();
    facts_.clients.managements = {withoutCable("5293d4ee0ec3")};
    ASSERT_EQ(machine().interfaces().size(), 1U);
    EXPECT_EQ(first().link->ifindex, 3U);
}

TEST_F(MachineTest, AManagerThatWasNotHeardMayHaveWhatItsFilesDoNotTell) {
    auto& clients = facts_.clients;
    clients.unheardManagers = {Client::NetworkManager};
    EXPECT_EQ(first().unheard, Client::NetworkManager) << "it may have taken it just now";
    EXPECT_TRUE(first().hidden);
    EXPECT_EQ(first().unheard6, std::nullopt);
    clients.unmanagedLinks = {2};
    EXPECT_EQ(first().unheard, std::nullopt);
    EXPECT_FALSE(first().hidden);
    EXPECT_EQ(machine().interfaces()[1].unheard, Client::NetworkManager);
    clients.unmanagedLinks.clear();
    clients.managements = {{.client = Client::NetworkManager,
                            .ifindex = 2,
                            .dhcp4 = {},
                            .dhcp6 = {},
                            .staticAddresses = {}}};
    EXPECT_EQ(first().unheard, Client::NetworkManager);
    for (const bool dhcp4 : {true, false}) {
        clients.managements[0].dhcp4 = dhcp4;
        EXPECT_EQ(first().unheard, std::nullopt) << "its file tells";
    }
    facts_.links[0].flags = IFF_UP | IFF_POINTOPOINT;
    clients.managements.clear();
    EXPECT_EQ(first().unheard, std::nullopt);
}

TEST_F(MachineTest, NetworkdWritesOfEachLinkThatItTakes) {
    auto& clients = facts_.clients;
    clients.unheardManagers = {Client::Networkd};
    EXPECT_EQ(first().unheard, std::nullopt);
    clients.managements = {{.client = Client::Networkd,
                            .ifindex = 2,
                            .dhcp4 = {},
                            .dhcp6 = {},
                            .staticAddresses = {}}};
    EXPECT_EQ(first().unheard, Client::Networkd);
}

TEST_F(MachineTest, AnIPv6AddressOfAManagerThatWasNotHeardMayBeLeased) {
    auto& clients = facts_.clients;
    clients.unheardManagers = {Client::Networkd};
    clients.managements = {{.client = Client::Networkd,
                            .ifindex = 2,
                            .dhcp4 = false,
                            .dhcp6 = {},
                            .staticAddresses = {}}};
    EXPECT_EQ(first().unheard6, std::nullopt);
    facts_.addresses.push_back({.ifindex = 2, .ip = "2001:db8::2"_ip, .validLifetime = 600});
    EXPECT_EQ(first().unheard6, Client::Networkd);
    EXPECT_EQ(first().unheard, std::nullopt);
    clients.leases = {lease("eth2", "2001:db8::2")};
    EXPECT_EQ(first().unheard6, std::nullopt) << "whose lease it is, is known";
    clients.leases.clear();
    facts_.addresses.back().validLifetime = Address::infinite;
    EXPECT_EQ(first().unheard6, std::nullopt);
}

TEST_F(MachineTest, ARenamedLinkIsKnownByItsAddressAndTheAddressesEnd) {
    facts_.clients.leases = {lease("before", "192.0.2.3")};
    EXPECT_EQ(machine().interfaces()[1].leases.size(), 1U);
    for (const std::int64_t offset : {-11, 11}) {
        facts_.clients.leases[0].expires = now + 600 + offset;
        EXPECT_EQ(machine().interfaces()[1].leases.size(), 0U) << offset;
    }
    facts_.clients.leases[0].expires = std::nullopt;
    EXPECT_EQ(machine().interfaces()[1].leases.size(), 0U);
}

TEST_F(MachineTest, ALinkThatTookTheNameOfARenamedOneDoesNotGetItsLease) {
    facts_.clients.leases = {lease("eth2", "192.0.2.3")};
    EXPECT_THAT(first().leases, IsEmpty());
    EXPECT_EQ(machine().interfaces()[1].leases.size(), 1U);
}

TEST_F(MachineTest, ARenamedLinkOfUdhcpcHasAnAddressWithoutAnEnd) {
    facts_.clients.leases = {lease("before", "192.0.2.3")};
    facts_.clients.leases[0].client = Client::Udhcpc;
    facts_.clients.leases[0].clientAlive = true;
    facts_.addresses[1].validLifetime = Address::infinite;
    EXPECT_EQ(machine().interfaces()[1].leases.size(), 1U);
    facts_.clients.leases[0].clientAlive = false;
    EXPECT_EQ(machine().interfaces()[1].leases.size(), 0U);
    facts_.clients.leases[0].clientAlive = true;
    facts_.clients.leases[0].client = Client::Dhclient;
    EXPECT_EQ(machine().interfaces()[1].leases.size(), 0U);
}

TEST_F(MachineTest, AClientThatNamesNoLinkMeansTheOneThatHasItsAddress) {
    facts_.clients.leases = {lease("", "192.0.2.3")};
    EXPECT_EQ(first().leases.size(), 0U);
    EXPECT_THAT(machine().interfaces()[1].leases, ElementsAre(Pointee(facts_.clients.leases[0])));
    facts_.addresses[0].ip = "192.0.2.3"_ip;
    EXPECT_EQ(machine().interfaces()[1].leases.size(), 0U) << "two links have it";
}

TEST_F(MachineTest, WhatTheKernelWasGivenIsTheOnlyAddressThatNothingElseTellsOf) {
    facts_.clients.boot = {.bootp = true, .server = "192.0.2.1"_ip, .origin = "pnp"};
    for (Address& address : facts_.addresses) {
        address.validLifetime = Address::infinite;
    }
    EXPECT_THAT(first().leases, IsEmpty()) << "there are two";
    facts_.addresses[1] = {.ifindex = 3, .ip = "2001:db8::3"_ip};
    EXPECT_THAT(first().leases, ElementsAre(Pointee(Lease{.client = Client::KernelBoot,
                                                          .interfaceName = {},
                                                          .ifindex = 2,
                                                          .address = "192.0.2.2"_ip,
                                                          .server = "192.0.2.1"_ip,
                                                          .bootp = true,
                                                          .expires = Lease::never,
                                                          .origin = "pnp"})));
    facts_.addresses[0].validLifetime = 600;
    EXPECT_THAT(first().leases, IsEmpty()) << "the kernel's has no end";
    facts_.addresses[0].validLifetime = Address::infinite;
    facts_.clients.configurations = {{.client = Client::Ifupdown,
                                      .interfaceName = "eth2"_name,
                                      .dhcp4 = false,
                                      .dhcp6 = {},
                                      .staticAddresses = {}}};
    EXPECT_THAT(first().leases, IsEmpty());
    facts_.clients.configurations.clear();
    facts_.clients.processes = {
        {.client = Client::Udhcpc, .interfaces = {"eth2"_name}, .leaseFile = ""}};
    EXPECT_THAT(first().leases, IsEmpty());
    facts_.clients.processes.clear();
    facts_.addresses.clear();
    EXPECT_THAT(first().leases, IsEmpty());
}

TEST_F(MachineTest, AClientThatNamesLinksByIndexIsTakenAtItsWord) {
    facts_.clients.leases = {lease("", "192.0.2.3")};
    facts_.clients.leases[0].ifindex = 9;
    EXPECT_EQ(machine().interfaces()[1].leases.size(), 0U);
}

TEST_F(MachineTest, EachConfigurationBelongsToItsLink) {
    const LinkConfiguration one{.client = Client::Ifupdown,
                                .interfaceName = "eth2"_name,
                                .dhcp4 = true,
                                .dhcp6 = {},
                                .staticAddresses = {}};
    LinkConfiguration other = one;
    other.client = Client::Ifcfg;
    facts_.clients.configurations = {one, other};
    EXPECT_THAT(first().configurations, ElementsAre(Pointee(one), Pointee(other)));
    EXPECT_THAT(machine().interfaces()[1].configurations, IsEmpty());
}

TEST_F(MachineTest, ASocketBelongsToTheLinkOfItsAddress) {
    facts_.clients.sockets.bound = {{.address = "192.0.2.3"_ip, .peer = "192.0.2.1"_ip},
                                    {.address = "192.0.2.99"_ip, .peer = {}}};
    EXPECT_EQ(first().socket, nullptr);
    EXPECT_THAT(machine().interfaces()[1].socket, Pointee(facts_.clients.sockets.bound[0]));
}

TEST_F(MachineTest, ASocketOfAllLinksTellsOfThoseThatAreHeardWhileNoClientIsSeen) {
    facts_.clients.sockets.bound = {{.address = {}, .peer = {}}};
    EXPECT_EQ(first().openSocket, nullptr);
    facts_.clients.sockets.packetLinks = {2, 77};
    EXPECT_NE(first().openSocket, nullptr);
    EXPECT_EQ(machine().interfaces()[1].openSocket, nullptr);
    facts_.clients.processes = {
        {.client = Client::Dhclient, .interfaces = {"eth3"_name}, .leaseFile = ""}};
    EXPECT_EQ(first().openSocket, nullptr);
    facts_.clients.processes[0].ipv6 = true;
    EXPECT_NE(first().openSocket, nullptr);
}

}  // namespace
}  // namespace ZR::Live
