#include "clients/Networkd.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include "LinuxSupport.h"
#include "kit/Diagnostics.h"

namespace ZR::Live {
namespace {

using testing::Contains;
using testing::IsEmpty;

TEST(NetworkdLink, CapturedStateFile) {
    EXPECT_EQ(parseNetworkdLink(sample("networkd/run-systemd-netif-links-2.txt")),
              (NetworkdLink{.adminState = "configured",
                            .networkFile = "/etc/systemd/network/10-eth1.network"}));
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
                                   .interfaceName = {},
                                   .ifindex = 2,
                                   .address = "198.51.100.110"_ip,
                                   .server = "198.51.100.1"_ip,
                                   .clientAlive = true,
                                   .expires = std::nullopt,
                                   .origin = root_.path("/run/systemd/netif/leases/2")}}));
    EXPECT_THAT(ZR::Testing::textsOf(facts.diagnostics), IsEmpty());
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

TEST_F(NetworkdTest, FilesThatAreNotIndexesAreNotRead) {
    link("2x", "ADMIN_STATE=configured\n");
    link(".#2", "ADMIN_STATE=configured\n");
    root_.write("/run/systemd/netif/leases/-1", "ADDRESS=192.0.2.1\n");
    EXPECT_EQ(read(), ClientFacts{});
}

TEST_F(NetworkdTest, ALeaseWithoutAnAddressIsNone) {
    root_.write("/run/systemd/netif/leases/2", "SERVER_ADDRESS=192.0.2.1\n");
    EXPECT_THAT(read().leases, IsEmpty());
}

TEST_F(NetworkdTest, ANetworkFileThatIsNotAFileIsReported) {
    link("2", "ADMIN_STATE=configured\nNETWORK_FILE=/etc/systemd/network\n");
    std::filesystem::create_directories(root_.path("/etc/systemd/network"));
    EXPECT_EQ(read().diagnostics.size(), 1U);
}

}  // namespace
}  // namespace ZR::Live
