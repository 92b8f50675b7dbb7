#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>

#include <string>

#include "LinuxSupport.h"
#include "Untrusted.h"
#include "clients/ManagerBuses.h"
#include "clients/NetworkManager.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr const char* uuid = "11111111-2222-4333-8444-555555555555";

NetworkManagerDevice deviceOf(const std::string& file) {
    NetworkManagerDevice device = parseNetworkManagerDevice(sample(file));
    EXPECT_TRUE(device.managed) << file;
    EXPECT_EQ(device.profile, uuid) << file;
    return device;
}
/// What two of three captured leases have in common.
Lease lease(std::int64_t expires) {
    return {.client = Client::NetworkManager,
            .interfaceName = {},
            .address = "198.51.100.109"_ip,
            .server = "198.51.100.1"_ip,
            .expires = expires,
            .obtained = expires - 600,
            .options = {1, 3, 6, 12, 15, 28, 42, 51, 54},
            .clientIdentifier = "01:52:54:00:00:00:04"};
}
Lease lease6() {
    return {.client = Client::NetworkManager,
            .interfaceName = {},
            .address = "2001:db8:99::107"_ip,
            .server = {},
            .expires = {},
            .options = {1, 3, 23, 39},
            .clientIdentifier = "00:04:ab:79:95:e2:7b:c5:ed:03:f1:18:2c:18:58:df:32:05"};
}

TEST(NetworkManagerDevice, CapturedByVersion142) {
    const auto device = deviceOf("networkmanager-internal/run-NetworkManager-devices-2.txt");
    EXPECT_EQ(networkManagerLease4(device.options4), lease(1'795'216'616));
    EXPECT_EQ(networkManagerLease6(device.options6), lease6());
}

TEST(NetworkManagerDevice, CapturedByVersion152) {
    const auto device = deviceOf("networkmanager-1.52-internal/run-NetworkManager-devices-2.txt");
    const auto found = networkManagerLease4(device.options4);
    ASSERT_TRUE(found);
    EXPECT_EQ(found->address, "198.51.100.112"_ip);
    EXPECT_EQ(found->expires, 1'795'217'223);
    EXPECT_EQ(found->obtained, 1'795'216'623);
    EXPECT_TRUE(networkManagerLease6(device.options6));
}

TEST(NetworkManagerDevice, CapturedWithDhclientBehindIt) {
    const auto device = deviceOf("networkmanager-dhclient/run-NetworkManager-devices-2.txt");
    Lease expected = lease(1'795'216'696);
    expected.renews = 1'795'216'396;
    expected.rebinds = 1'795'216'621;
    expected.options = {1, 3, 6, 12, 15, 28, 42, 51, 53, 54, 58, 59};
    expected.clientIdentifier = "";
    EXPECT_EQ(networkManagerLease4(device.options4), expected);
    expected = lease6();
    expected.address = "2001:db8:99::1b0"_ip;
    expected.expires = 1'795'216'697;
    expected.obtained = 1'795'216'097;
    expected.renews = 1'795'216'397;
    expected.rebinds = 1'795'216'622;
    expected.options = {1, 2, 3, 13, 23, 39};
    EXPECT_EQ(networkManagerLease6(device.options6), expected);
}

TEST(NetworkManagerDevice, CapturedInfiniteLeaseHasNoExpiry) {
    const auto device =
        deviceOf("networkmanager-internal/run-NetworkManager-devices-2.infinite.txt");
    Lease expected = lease(Lease::never);
    expected.obtained = std::nullopt;
    EXPECT_EQ(networkManagerLease4(device.options4), expected);
}

TEST(NetworkManagerDevice, WithoutASectionThereIsNoLease) {
    EXPECT_EQ(parseNetworkManagerDevice("[device]\nmanaged=true\n"),
              (NetworkManagerDevice{.managed = true, .profile = ""}));
    EXPECT_EQ(parseNetworkManagerDevice(""), (NetworkManagerDevice{.profile = ""}));
    EXPECT_FALSE(parseNetworkManagerDevice("[device]\nmanaged=unknown\n").managed);
    EXPECT_EQ(networkManagerLease4({}), std::nullopt);
    EXPECT_EQ(networkManagerLease6({{"fqdn_fqdn", "vm"}}), std::nullopt);
}

TEST(NetworkManagerDevice, ATimeThatCannotBeReadIsOver) {
    EXPECT_EQ(networkManagerLease4({{"ip_address", "192.0.2.7"}, {"expiry", "soon"}})->expires, 0);
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
    root_.age(profile, 1'000);
    const ClientFacts facts = read();
    std::vector<Lease> expectedLeases{lease(1'795'216'616), lease6()};
    for (Lease& each : expectedLeases) {
        each.ifindex = 2;
        each.clientAlive = true;
        each.pid = 7;
        each.origin = root_.path(state);
    }
    EXPECT_EQ(facts.leases, expectedLeases);
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
    ASSERT_EQ(facts.leases.size(), 2U);
    EXPECT_FALSE(facts.leases[0].clientAlive);
    EXPECT_FALSE(facts.leases[1].clientAlive);
}

TEST_F(NetworkManagerTest, AProfileEditedSinceItWasAppliedSaysNothing) {
    writeProfile("method=auto");
    writeDevice();
    root_.age(profile, 2'000);
    root_.age(state, 2'000);
    EXPECT_EQ(read().managements.at(0).dhcp4, true);
    root_.age(profile, 3'000);
    EXPECT_EQ(read().managements.at(0).dhcp4, std::nullopt);
}

TEST_F(NetworkManagerTest, DhcpV6MayHaveGivenOtherThingsThanAnAddress) {
    writeDevice("[dhcp6]\ndhcp6.dhcp6_name_servers=2001:db8::53\n");
    EXPECT_EQ(read().managements.at(0).dhcp6, std::nullopt);
    EXPECT_THAT(read().leases, IsEmpty());
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
        writeProfile("method=" + method + "\naddress1=192.0.2.1/24");
        writeDevice();
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

TEST_F(NetworkManagerTest, AFileThatOthersCouldHaveWrittenIsNotBelieved) {
    root_.write(state, sample("networkmanager-internal/run-NetworkManager-devices-2.txt"));
    ZR::Testing::letOthersWrite(root_, "/run/NetworkManager/devices/2");
    ZR::Testing::expectNoLeaseButADiagnostic(read());
}

ClientFacts say(const std::string& json, ClientFacts facts = running(Client::NetworkManager)) {
    EXPECT_EQ(addNetworkManagerDescription(json, facts), "");
    return facts;
}
ClientFacts captured(const std::string& state) {
    return say(sample("networkmanager-bus/" + state + ".json"));
}

LinkConfiguration management(std::optional<bool> dhcp4, std::optional<bool> dhcp6) {
    return {.client = Client::NetworkManager,
            .interfaceName = "eth1"_name,
            .dhcp4 = dhcp4,
            .dhcp6 = dhcp6,
            .staticAddresses = {},
            .origin = "D-Bus org.freedesktop.NetworkManager"};
}

/// One device in a state, with a method of IPv4 that was applied to it.
std::string device(unsigned state, const std::string& method, const std::string& more = "") {
    return R"({"objects":{"/d":{"org.freedesktop.NetworkManager.Device":{"Interface":"eth1",)"
           R"("Managed":true,"State":)" +
           std::to_string(state) + more + R"(}}},"applied":{"/d":{"ipv4":{"method":")" + method +
           R"(","address-data":[{"address":"192.0.2.7","prefix":24}]}}}})";
}

TEST(NetworkManagerDescription, CapturedWithLeases) {
    const ClientFacts facts = captured("bound");
    EXPECT_THAT(facts.managements, ElementsAre(management(true, true)));
    const Lease lease4{.client = Client::NetworkManager,
                       .interfaceName = "eth1"_name,
                       .address = "198.51.100.110"_ip,
                       .server = "198.51.100.1"_ip,
                       .clientAlive = true,
                       .expires = 1'795'321'563,
                       .obtained = 1'795'320'963,
                       .options = {1, 3, 12, 28, 51, 54},
                       .clientIdentifier = "01:d2:e3:ee:9c:52:73",
                       .pid = 7,
                       .origin = "D-Bus org.freedesktop.NetworkManager"};
    const Lease lease6{.client = Client::NetworkManager,
                       .interfaceName = "eth1"_name,
                       .address = "2001:db8:99::151"_ip,
                       .server = {},
                       .clientAlive = true,
                       .expires = {},
                       .options = {1, 3, 39},
                       .clientIdentifier = "00:04:33:e8:7c:10:b6:ad:ca:84:2d:29:a2:c5:ad:73:f3:86",
                       .pid = 7,
                       .origin = "D-Bus org.freedesktop.NetworkManager"};
    EXPECT_THAT(facts.leases, ElementsAre(lease4, lease6));
}

TEST(NetworkManagerDescription, CapturedWhileItAsks) {
    const ClientFacts facts = captured("asking");
    EXPECT_THAT(facts.managements, ElementsAre(management(true, std::nullopt)));
    EXPECT_THAT(facts.leases, IsEmpty());
}

TEST(NetworkManagerDescription, CapturedWithoutAConnectionAndUnmanaged) {
    for (const char* state : {"down", "unmanaged"}) {
        EXPECT_THAT(captured(state).managements, IsEmpty()) << state;
        EXPECT_THAT(captured(state).leases, IsEmpty()) << state;
    }
}

TEST(NetworkManagerDescription, WhatWasAppliedTells) {
    const LinkConfiguration manual = say(device(100, "manual")).managements.at(0);
    EXPECT_EQ(manual.dhcp4, false);
    EXPECT_THAT(manual.staticAddresses, ElementsAre("192.0.2.7"_ip));
    EXPECT_EQ(say(device(70, "auto")).managements.at(0).dhcp4, true);
    EXPECT_TRUE(say(device(100, "shared")).managements.at(0).other4);
    EXPECT_EQ(say(device(100, "")).managements.at(0).dhcp4, std::nullopt);
    // Where that may not be known, its client does.
    EXPECT_EQ(say(device(100, "", R"(,"Dhcp4Config":"/c")")).managements.at(0).dhcp4, true);
    EXPECT_EQ(say(device(100, "", R"(,"Dhcp4Config":"/")")).managements.at(0).dhcp4, std::nullopt);
}

TEST(NetworkManagerDescription, OnlyADeviceWithAConnectionIsManaged) {
    for (const unsigned state : {10U, 20U, 30U, 110U, 120U}) {
        EXPECT_THAT(say(device(state, "auto")).managements, IsEmpty()) << state;
    }
    for (const unsigned state : {40U, 70U, 100U}) {
        EXPECT_EQ(say(device(state, "auto")).managements.size(), 1U) << state;
    }
}

TEST(NetworkManagerDescription, ItStandsInPlaceOfItsFiles) {
    ClientFacts facts = running(Client::NetworkManager);
    facts.managements = {{.client = Client::NetworkManager,
                          .ifindex = 2,
                          .dhcp4 = true,
                          .dhcp6 = {},
                          .staticAddresses = {}}};
    facts.leases = {{.client = Client::NetworkManager,
                     .interfaceName = {},
                     .ifindex = 2,
                     .address = "192.0.2.7"_ip,
                     .server = {},
                     .expires = {}}};
    ClientFacts unused = facts;
    EXPECT_EQ(addNetworkManagerDescription("[]", unused), "not an object with objects");
    EXPECT_EQ(unused, facts);
    facts = say(R"({"objects":{}})", facts);
    EXPECT_THAT(facts.managements, IsEmpty());
    EXPECT_THAT(facts.leases, IsEmpty());
}

TEST(NetworkManagerDescription, AnyTextGivesFactsOrAReason) {
    ClientFacts facts;
    for (const char* text : {"", "7", "{", "{}", R"({"objects":[]})"}) {
        EXPECT_NE(addNetworkManagerDescription(text, facts), "") << text;
    }
    for (const char* text :
         {R"({"objects":{"/d":7,"/e":{"org.freedesktop.NetworkManager.Device":[]}}})",
          R"({"objects":{"/d":{"org.freedesktop.NetworkManager.Device":{"Interface":"a b",)"
          R"("Managed":true,"State":100}}}})",
          R"({"objects":{"/d":{"org.freedesktop.NetworkManager.Device":{"Interface":"eth1",)"
          R"("Managed":"true","State":"100"}}}})"}) {
        EXPECT_EQ(addNetworkManagerDescription(text, facts), "") << text;
    }
    EXPECT_EQ(facts, ClientFacts{});
}

}  // namespace
}  // namespace ZR::Live
