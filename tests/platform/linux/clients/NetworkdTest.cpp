#include "clients/Networkd.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;

NetworkFile networkFile(std::string_view text) {
    NetworkFile settings;
    applyNetworkFile(text, settings);
    return settings;
}

TEST(NetworkdLink, CapturedStateFile) {
    EXPECT_EQ(parseNetworkdLink(sample("networkd/run-systemd-netif-links-2.txt")),
              (NetworkdLink{.adminState = "configured",
                            .networkFile = "/etc/systemd/network/10-eth1.network",
                            .leaseFile = "/run/systemd/netif/leases/2"}));
}

TEST(NetworkdLink, OnlyLinksThatItConfiguresAreItsOwn) {
    const auto managed = [](const std::string& state) {
        return parseNetworkdLink("ADMIN_STATE=" + state).managed();
    };
    for (const char* state : {"pending", "initialized", "configuring", "configured", "failed"}) {
        EXPECT_TRUE(managed(state)) << state;
    }
    for (const char* state : {"unmanaged", "linger", ""}) {
        EXPECT_FALSE(managed(state)) << state;
    }
    EXPECT_FALSE(parseNetworkdLink("").managed());
}

TEST(NetworkdLease, CapturedByVersion252) {
    EXPECT_EQ(parseNetworkdLease(sample("networkd/run-systemd-netif-leases-2.txt")),
              (NetworkdLease{.address = "198.51.100.110",
                             .server = "198.51.100.1",
                             .renewal = 300,
                             .rebinding = 525,
                             .lifetime = 600}));
}

TEST(NetworkdLease, CapturedInfiniteByVersion252) {
    EXPECT_EQ(parseNetworkdLease(sample("networkd/run-systemd-netif-leases-3.infinite.txt")),
              (NetworkdLease{.address = "198.51.100.110",
                             .server = "198.51.100.1",
                             .renewal = {},
                             .rebinding = {},
                             .lifetime = infiniteTime}));
}

TEST(NetworkdLease, CapturedByVersion257) {
    EXPECT_EQ(parseNetworkdLease(sample("networkd-257/run-systemd-netif-leases-2.txt")),
              (NetworkdLease{.address = "198.51.100.111",
                             .server = "198.51.100.1",
                             .renewal = 300,
                             .rebinding = 525,
                             .lifetime = 600}));
}

TEST(NetworkdLease, CapturedInfiniteByVersion257) {
    EXPECT_EQ(parseNetworkdLease(sample("networkd-257/run-systemd-netif-leases-2.infinite.txt")),
              (NetworkdLease{.address = "198.51.100.111",
                             .server = "198.51.100.1",
                             .renewal = {},
                             .rebinding = {},
                             .lifetime = infiniteTime}));
}

TEST(NetworkdLease, WhatIsNoAddressOrTimeIsLeftOut) {
    EXPECT_EQ(parseNetworkdLease("ADDRESS=host\nSERVER_ADDRESS=1.2.3\nT1=soon\nLIFETIME=\n\0x=\n"),
              NetworkdLease{});
}

TEST(NetworkdTimeSpan, AllSpellings) {
    EXPECT_EQ(parseTimeSpan("600"), 600U);
    EXPECT_EQ(parseTimeSpan("10min"), 600U);
    EXPECT_EQ(parseTimeSpan("8min 45s"), 525U);
    EXPECT_EQ(parseTimeSpan(" 1h  30min "), 5400U);
    EXPECT_EQ(parseTimeSpan("1y 2month 3w 4d 5h 6min 7s"),
              31557600U + 2 * 2629800U + 3 * 604800U + 4 * 86400U + 5 * 3600U + 6 * 60U + 7);
    EXPECT_EQ(parseTimeSpan("1s 999ms 999us"), 1U);
    EXPECT_EQ(parseTimeSpan("2 min"), 120U);
    EXPECT_EQ(parseTimeSpan("0"), 0U);
}

TEST(NetworkdTimeSpan, BothFormsOfInfinity) {
    EXPECT_EQ(parseTimeSpan("infinity"), infiniteTime);
    EXPECT_EQ(parseTimeSpan("4294967295"), infiniteTime);
}

TEST(NetworkdTimeSpan, WhatIsNoTimeSpanIsNone) {
    for (const char* text :
         {"", " ", "min", "1fortnight", "-1", "1.5h", "1 2x", "99999999999999999",
          "99999999999999999999999", "infinity 1s", "18446744073709551615us 1us"}) {
        EXPECT_EQ(parseTimeSpan(text), std::nullopt) << text;
    }
}

TEST(NetworkFile, CapturedFiles) {
    EXPECT_EQ(networkFile(sample("networkd/10-eth1.network")), (NetworkFile{.dhcp4 = true,
                                                                            .dhcp6 = true,
                                                                            .linkLocal4 = true,
                                                                            .addresses = {},
                                                                            .matchName = "eth1"}));
    EXPECT_EQ(networkFile(sample("networkd-257/10-eth1.network")),
              (NetworkFile{.dhcp4 = true,
                           .dhcp6 = true,
                           .linkLocal4 = false,
                           .addresses = {},
                           .matchName = "eth1"}));
}

TEST(NetworkFile, AllSpellingsOfDhcp) {
    const auto dhcp = [](const std::string& value) {
        const NetworkFile settings = networkFile("[Network]\nDHCP=" + value + "\n");
        return std::pair{settings.dhcp4, settings.dhcp6};
    };
    for (const char* value : {"yes", "true", "1", "on", "Yes", "both"}) {
        EXPECT_EQ(dhcp(value), std::pair(true, true)) << value;
    }
    for (const char* value : {"no", "false", "0", "off", "none"}) {
        EXPECT_EQ(dhcp(value), std::pair(false, false)) << value;
    }
    EXPECT_EQ(dhcp("ipv4"), std::pair(true, false));
    EXPECT_EQ(dhcp("v4"), std::pair(true, false));
    EXPECT_EQ(dhcp("ipv6"), std::pair(false, true));
    EXPECT_EQ(dhcp("v6"), std::pair(false, true));
}

TEST(NetworkFile, AnUnknownValueChangesNothing) {
    EXPECT_TRUE(networkFile("[Network]\nDHCP=yes\nDHCP=maybe\n").dhcp4);
    EXPECT_TRUE(networkFile("[Network]\nDHCP=yes\nDHCP=\n").dhcp4);
}

TEST(NetworkFile, OnlyItsOwnSectionCounts) {
    EXPECT_EQ(networkFile("DHCP=yes\n[Match]\nDHCP=yes\n[DHCPv4]\nDHCP=yes\nAddress=192.0.2.1\n"),
              NetworkFile{});
}

TEST(NetworkFile, CommentsAndBlanksDoNotCount) {
    EXPECT_EQ(networkFile("\r\n[Network]\r\n # DHCP=no\n; DHCP=no\n  DHCP = ipv4 \r\n"),
              (NetworkFile{.dhcp4 = true, .addresses = {}}));
}

TEST(NetworkFile, IPv4AddressesOfBothSections) {
    EXPECT_THAT(networkFile("[Network]\nAddress=192.0.2.1/24\nAddress=2001:db8::1/64\n"
                            "[Address]\nAddress=192.0.2.2/24\n")
                    .addresses,
                ElementsAre("192.0.2.1", "192.0.2.2"));
}

TEST(NetworkFile, AnEmptyAddressForgetsThoseBefore) {
    EXPECT_THAT(
        networkFile("[Network]\nAddress=192.0.2.1/24\nAddress=\nAddress=192.0.2.3\n").addresses,
        ElementsAre("192.0.2.3"));
}

class NetworkdTest : public testing::Test {
  protected:
    ClientFacts read() const {
        ClientFacts facts;
        readNetworkd({.files = root_.path()}, facts);
        return facts;
    }
    void link(const std::string& index, const std::string& text) const {
        root_.write("/run/systemd/netif/links/" + index, text);
    }

    TemporaryDirectory root_;
};

TEST_F(NetworkdTest, OnAMachineWithoutItThereIsNothing) {
    EXPECT_EQ(read(), ClientFacts{});
}

TEST_F(NetworkdTest, AsItWasCaptured) {
    link("2", sample("networkd/run-systemd-netif-links-2.txt"));
    root_.write("/run/systemd/netif/leases/2", sample("networkd/run-systemd-netif-leases-2.txt"));
    root_.write("/etc/systemd/network/10-eth1.network", sample("networkd/10-eth1.network"));
    const ClientFacts facts = read();
    EXPECT_EQ(facts.managements,
              (std::vector<LinkConfiguration>{
                  {.client = Client::Networkd,
                   .ifindex = 2,
                   .dhcp4 = true,
                   .dhcp6 = true,
                   .staticAddresses = {},
                   .linkLocal4 = true,
                   .origin = root_.path("/etc/systemd/network/10-eth1.network")}}));
    EXPECT_EQ(facts.leases,
              (std::vector<Lease>{{.client = Client::Networkd,
                                   .interfaceName = "",
                                   .ifindex = 2,
                                   .family = AF_INET,
                                   .address = "198.51.100.110",
                                   .server = "198.51.100.1",
                                   .clientAlive = true,
                                   .expires = std::nullopt,
                                   .origin = root_.path("/run/systemd/netif/leases/2")}}));
    EXPECT_THAT(facts.complaints, IsEmpty());
}

TEST_F(NetworkdTest, WhereItRunsForOtherLinksItsIndexesAreTheirs) {
    link("2", sample("networkd/run-systemd-netif-links-2.txt"));
    root_.write("/run/systemd/netif/leases/2", sample("networkd/run-systemd-netif-leases-2.txt"));
    const ClientFacts facts =
        readWith(readNetworkd, root_, running(Client::Networkd, ManagerProcess::Where::Elsewhere));
    EXPECT_THAT(facts.managements, IsEmpty());
    EXPECT_THAT(facts.leases, IsEmpty());
    EXPECT_EQ(readWith(readNetworkd, root_, running(Client::Networkd)).leases.size(), 1U);
}

TEST_F(NetworkdTest, AnInfiniteLeaseNeverEnds) {
    root_.write("/run/systemd/netif/leases/3",
                sample("networkd/run-systemd-netif-leases-3.infinite.txt"));
    const ClientFacts facts = read();
    ASSERT_EQ(facts.leases.size(), 1U);
    EXPECT_EQ(facts.leases[0].expires, Lease::never);
    EXPECT_FALSE(facts.leases[0].clientAlive);
}

TEST_F(NetworkdTest, LinksThatItLeavesAloneAreNotManaged) {
    link("2", "ADMIN_STATE=unmanaged\nNETWORK_FILE=/etc/systemd/network/a.network\n");
    root_.write("/etc/systemd/network/a.network", "[Network]\nDHCP=yes\n");
    EXPECT_THAT(read().managements, IsEmpty());
}

TEST_F(NetworkdTest, WithoutItsFileNothingIsKnownOfDhcp) {
    link("2", "ADMIN_STATE=configured\nNETWORK_FILE=/etc/systemd/network/gone.network\n");
    link("3", "ADMIN_STATE=pending\n");
    const ClientFacts facts = read();
    ASSERT_EQ(facts.managements.size(), 2U);
    EXPECT_EQ(facts.managements[0].dhcp4, std::nullopt);
    EXPECT_EQ(facts.managements[1].dhcp4, std::nullopt);
}

TEST_F(NetworkdTest, DropInsApplyInTheOrderOfTheirNames) {
    link("2", "ADMIN_STATE=configured\nNETWORK_FILE=/usr/lib/systemd/network/a.network\n");
    root_.write("/usr/lib/systemd/network/a.network", "[Network]\nDHCP=no\n");
    root_.write("/etc/systemd/network/a.network.d/10.conf", "[Network]\nDHCP=ipv6\n");
    root_.write("/run/systemd/network/a.network.d/20.conf", "[Network]\nDHCP=ipv4\n");
    root_.write("/run/systemd/network/a.network.d/30.txt", "[Network]\nDHCP=no\n");
    const ClientFacts facts = read();
    ASSERT_EQ(facts.managements.size(), 1U);
    EXPECT_EQ(facts.managements[0].dhcp4, true);
    EXPECT_EQ(facts.managements[0].dhcp6, false);
    EXPECT_THAT(facts.places,
                Contains(WatchedPlace{.directory = root_.path("/etc/systemd/network/a.network.d"),
                                      .namePrefix = ""}));
}

TEST_F(NetworkdTest, ADropInOfTheAdministratorHidesItsNamesake) {
    link("2", "ADMIN_STATE=configured\nNETWORK_FILE=/usr/lib/systemd/network/a.network\n");
    root_.write("/usr/lib/systemd/network/a.network", "[Network]\nDHCP=yes\n");
    root_.write("/etc/systemd/network/a.network.d/10.conf", "");
    root_.write("/usr/lib/systemd/network/a.network.d/10.conf", "[Network]\nDHCP=no\n");
    EXPECT_EQ(read().managements.at(0).dhcp4, true);
}

TEST_F(NetworkdTest, FilesThatAreNoIndexesAreNotRead) {
    link("2x", "ADMIN_STATE=configured\n");
    link(".#2", "ADMIN_STATE=configured\n");
    root_.write("/run/systemd/netif/leases/-1", "ADDRESS=192.0.2.1\n");
    EXPECT_EQ(read(), ClientFacts{});
}

TEST_F(NetworkdTest, ALeaseWithoutAnAddressIsNone) {
    root_.write("/run/systemd/netif/leases/2", "SERVER_ADDRESS=192.0.2.1\n");
    EXPECT_THAT(read().leases, IsEmpty());
}

TEST_F(NetworkdTest, ANetworkFileThatIsNoFileIsReported) {
    link("2", "ADMIN_STATE=configured\nNETWORK_FILE=/etc/systemd/network\n");
    std::filesystem::create_directories(root_.path("/etc/systemd/network"));
    EXPECT_EQ(read().complaints.size(), 1U);
}

}  // namespace
}  // namespace ZR::Live
