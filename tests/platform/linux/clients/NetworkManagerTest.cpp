#include "clients/NetworkManager.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr const char* uuid = "11111111-2222-4333-8444-555555555555";

NetworkManagerDevice device(std::int64_t expires) {
    return {.managed = true,
            .profile = uuid,
            .dhcp4 = true,
            .dhcp6 = true,
            .address4 = "198.51.100.109"_ip,
            .server4 = "198.51.100.1"_ip,
            .expires4 = expires};
}

TEST(NetworkManagerDevice, CapturedByVersion142) {
    EXPECT_EQ(parseNetworkManagerDevice(
                  sample("networkmanager-internal/run-NetworkManager-devices-2.txt")),
              device(1'795'216'616));
}

TEST(NetworkManagerDevice, CapturedByVersion152) {
    NetworkManagerDevice expected = device(1'795'217'223);
    expected.address4 = "198.51.100.112"_ip;
    EXPECT_EQ(parseNetworkManagerDevice(
                  sample("networkmanager-1.52-internal/run-NetworkManager-devices-2.txt")),
              expected);
}

TEST(NetworkManagerDevice, CapturedWithDhclientBehindIt) {
    EXPECT_EQ(parseNetworkManagerDevice(
                  sample("networkmanager-dhclient/run-NetworkManager-devices-2.txt")),
              device(1'795'216'696));
}

TEST(NetworkManagerDevice, CapturedInfiniteLeaseHasNoExpiry) {
    EXPECT_EQ(parseNetworkManagerDevice(
                  sample("networkmanager-internal/run-NetworkManager-devices-2.infinite.txt")),
              device(Lease::never));
}

TEST(NetworkManagerDevice, WithoutASectionThereIsNoLease) {
    EXPECT_EQ(
        parseNetworkManagerDevice("[device]\nmanaged=true\n"),
        (NetworkManagerDevice{.managed = true, .profile = "", .address4 = {}, .server4 = {}}));
    EXPECT_EQ(parseNetworkManagerDevice(""),
              (NetworkManagerDevice{.profile = "", .address4 = {}, .server4 = {}}));
    EXPECT_FALSE(parseNetworkManagerDevice("[device]\nmanaged=unknown\n").managed);
}

TEST(NetworkManagerDevice, ATimeThatCannotBeReadIsOver) {
    EXPECT_EQ(parseNetworkManagerDevice("[dhcp4]\ndhcp4.expiry=soon\n").expires4, 0);
}

TEST(NetworkManagerProfile, Captured) {
    EXPECT_EQ(parseNetworkManagerProfile(sample("networkmanager-internal/eth1.nmconnection")),
              (NetworkManagerProfile{.uuid = uuid,
                                     .interfaceName = "eth1"_name,
                                     .method4 = "auto",
                                     .method6 = "auto",
                                     .addresses4 = {}}));
}

TEST(NetworkManagerProfile, CapturedFromNetplan) {
    EXPECT_EQ(parseNetworkManagerProfile(sample("netplan/netplan-eth2.nmconnection")),
              (NetworkManagerProfile{.uuid = "",
                                     .interfaceName = "eth2"_name,
                                     .method4 = "auto",
                                     .method6 = "ignore",
                                     .addresses4 = {}}));
}

TEST(NetworkManagerProfile, AddressesStandInSeveralKeys) {
    EXPECT_THAT(
        parseNetworkManagerProfile("[ipv4]\naddress1=192.0.2.1/24,192.0.2.254\n"
                                   "address2=192.0.2.2/24\naddresses=192.0.2.3;192.0.2.4/8\n"
                                   "address-data=192.0.2.9\naddress3=x\n"
                                   "[ipv6]\naddress1=2001:db8::1/64\n")
            .addresses4,
        ElementsAre("192.0.2.1"_ip, "192.0.2.2"_ip, "192.0.2.3"_ip, "192.0.2.4"_ip));
}

TEST(InternalLease, TheInterfaceStandsBehindTheProfile) {
    const std::string prefix = std::string{"internal-"} + uuid;
    EXPECT_EQ(internalLeaseInterface(prefix + "-eth1.lease"), "eth1"_name);
    EXPECT_EQ(internalLeaseInterface(prefix + "-a-b.lease"), "a-b"_name);
    for (const std::string& name :
         {prefix + ".lease", prefix + "-.lease", prefix + "-eth1.txt", prefix + "xeth1.lease",
          std::string{"internal-eth1.lease"}, std::string{"dhclient-eth1.lease"}}) {
        EXPECT_EQ(internalLeaseInterface(name), std::nullopt) << name;
    }
}

class NetworkManagerTest : public testing::Test {
  protected:
    static constexpr const char* state = "/run/NetworkManager/devices/2";
    static constexpr const char* profile = "/etc/NetworkManager/system-connections/e.nmconnection";

    [[nodiscard]] ClientFacts read(ClientFacts facts = running(Client::NetworkManager)) const {
        return readWith(readNetworkManager, root_, std::move(facts));
    }
    void writeProfile(const std::string& ipv4, const std::string& meta = "") const {
        root_.write(profile, std::string{"[connection]\nuuid="} + uuid + "\n[ipv4]\n" + ipv4 +
                                 "\n[.nmmeta]\n" + meta);
    }
    void writeDevice(const std::string& rest = "") const {
        root_.write(state,
                    std::string{"[device]\nmanaged=true\nconnection-uuid="} + uuid + "\n" + rest);
    }

    TemporaryDirectory root_;
};

TEST_F(NetworkManagerTest, OnAMachineWithoutItThereIsNothing) {
    EXPECT_EQ(read({}), ClientFacts{});
}

TEST_F(NetworkManagerTest, CapturedStateWhileItRuns) {
    root_.write(state, sample("networkmanager-internal/run-NetworkManager-devices-2.txt"));
    root_.write(profile, sample("networkmanager-internal/eth1.nmconnection"));
    const ClientFacts facts = read();
    EXPECT_THAT(facts.leases, ElementsAre(Lease{.client = Client::NetworkManager,
                                                .interfaceName = {},
                                                .ifindex = 2,
                                                .address = "198.51.100.109"_ip,
                                                .server = "198.51.100.1"_ip,
                                                .clientAlive = true,
                                                .expires = 1'795'216'616,
                                                .origin = root_.path(state)}));
    LinkConfiguration expected{.client = Client::NetworkManager,
                               .ifindex = 2,
                               .dhcp4 = true,
                               .dhcp6 = true,
                               .staticAddresses = {},
                               .origin = root_.path(profile)};
    EXPECT_THAT(facts.managements, ElementsAre(expected));
    expected.ifindex = 0;
    expected.interfaceName = "eth1"_name;
    expected.dhcp6 = std::nullopt;  // of "auto" the routers decide
    EXPECT_THAT(facts.configurations, ElementsAre(expected));
}

TEST_F(NetworkManagerTest, WhatItLeftBehindManagesNothing) {
    root_.write(state, sample("networkmanager-internal/run-NetworkManager-devices-2.txt"));
    const ClientFacts facts = read({});
    EXPECT_THAT(facts.managements, IsEmpty());
    ASSERT_EQ(facts.leases.size(), 1U);
    EXPECT_FALSE(facts.leases[0].clientAlive);
}

TEST_F(NetworkManagerTest, WhereItRunsForOtherLinksItsIndexesAreTheirs) {
    root_.write(state, sample("networkmanager-internal/run-NetworkManager-devices-2.txt"));
    const ClientFacts facts =
        read(running(Client::NetworkManager, ManagerProcess::Where::Elsewhere));
    EXPECT_THAT(facts.managements, IsEmpty());
    EXPECT_THAT(facts.leases, IsEmpty());
}

TEST_F(NetworkManagerTest, WithoutItsProfileALeaseTellsOfDhcpAndNoLeaseOfNothing) {
    root_.write(state, sample("networkmanager-internal/run-NetworkManager-devices-2.txt"));
    EXPECT_EQ(read().managements.at(0).dhcp4, true);
    writeDevice();
    EXPECT_EQ(read().managements.at(0).dhcp4, std::nullopt);
}

TEST_F(NetworkManagerTest, TheMethodOfTheActiveProfileTells) {
    const auto management = [&](const std::string& method) {
        writeDevice();
        writeProfile("method=" + method + "\naddress1=192.0.2.1/24");
        LinkConfiguration found = read().managements.at(0);
        EXPECT_THAT(found.staticAddresses, ElementsAre("192.0.2.1"_ip)) << method;
        return found;
    };
    EXPECT_EQ(management("auto").dhcp4, true);
    EXPECT_EQ(management("manual").dhcp4, false);
    EXPECT_EQ(management("disabled").dhcp4, false);
    EXPECT_EQ(management("something-new").dhcp4, std::nullopt);
    EXPECT_TRUE(management("link-local").linkLocal4);
    EXPECT_TRUE(management("shared").other4);
    EXPECT_FALSE(management("manual").other4);
}

TEST_F(NetworkManagerTest, ADeviceThatOthersSetUpIsNotManaged) {
    writeDevice();
    writeProfile("method=manual", "external=true\n");
    EXPECT_THAT(read().managements, IsEmpty());
    root_.write(state, "[device]\nmanaged=false\n");
    writeProfile("method=manual");
    EXPECT_THAT(read().managements, IsEmpty());
}

TEST_F(NetworkManagerTest, AnAddressAloneInALeaseFileProvesNothing) {
    root_.write(std::string{"/var/lib/NetworkManager/internal-"} + uuid + "-eth1.lease",
                sample("networkmanager-internal/internal-"
                       "11111111-2222-4333-8444-555555555555-eth1.lease"));
    EXPECT_THAT(read().leases, IsEmpty());
}

TEST_F(NetworkManagerTest, AWholeLeaseFileOfOlderVersionsIsALease) {
    const std::string file =
        std::string{"/var/lib/NetworkManager/internal-"} + uuid + "-eth1.lease";
    root_.write(file, "ADDRESS=192.0.2.7\nSERVER_ADDRESS=192.0.2.1\nLIFETIME=600\n");
    root_.age(file, 1'000'000);
    EXPECT_THAT(read().leases, ElementsAre(Lease{.client = Client::NetworkManager,
                                                 .interfaceName = "eth1"_name,
                                                 .address = "192.0.2.7"_ip,
                                                 .server = "192.0.2.1"_ip,
                                                 .expires = 1'000'600,
                                                 .origin = root_.path(file)}));
}

TEST_F(NetworkManagerTest, FilesThatAreNotDevicesAreNotLookedAt) {
    root_.write("/run/NetworkManager/devices/2.tmp", "[device]\nmanaged=true\n");
    root_.write("/run/NetworkManager/devices/.3", "[device]\nmanaged=true\n");
    EXPECT_THAT(read().managements, IsEmpty());
}

}  // namespace
}  // namespace ZR::Live
