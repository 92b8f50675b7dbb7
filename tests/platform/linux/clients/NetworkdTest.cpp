#include "clients/Networkd.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include "LinuxSupport.h"
#include "Untrusted.h"
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
    ClientFacts read(ClientFacts facts = running(Client::Networkd)) const {
        facts = readWith(readNetworkd, root_, std::move(facts));
        facts.managers.clear();
        return facts;
    }
    void link(const std::string& index, const std::string& text) const {
        // It is written once the files of its configuration are applied.
        root_.write("/run/systemd/netif/links/" + index, text);
        root_.age("/run/systemd/netif/links/" + index, 2'000'000'000);
    }

    TemporaryDirectory root_;
};

TEST_F(NetworkdTest, OnAMachineWithoutItThereIsNothing) {
    EXPECT_EQ(read({}), ClientFacts{});
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
                                   .options = {1, 3, 54, 28, 51, 6, 42, 15, 12},
                                   .clientIdentifier = "fffea6fdf300020000ab1162026949ec04e8a7",
                                   .pid = 7,
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

TEST_F(NetworkdTest, WhatOneThatWasKilledLeftIsNoFactAboutNow) {
    link("2", sample("networkd/run-systemd-netif-links-2.txt"));
    root_.write("/run/systemd/netif/leases/2", sample("networkd/run-systemd-netif-leases-2.txt"));
    root_.write("/etc/systemd/network/10-eth1.network", sample("networkd/10-eth1.network"));
    const ClientFacts facts = read({});
    EXPECT_THAT(facts.managements, IsEmpty());
    ASSERT_EQ(facts.configurations.size(), 1U);
    EXPECT_EQ(facts.configurations[0].dhcp4, true);
    ASSERT_EQ(facts.leases.size(), 1U);
    EXPECT_FALSE(facts.leases[0].clientAlive);
}

TEST_F(NetworkdTest, AFileEditedSinceTheLinkWasConfiguredIsNotApplied) {
    const std::string state = "/run/systemd/netif/links/2";
    const std::string file = "/etc/systemd/network/a.network";
    link("2", "ADMIN_STATE=configured\nNETWORK_FILE=" + file + "\n");
    root_.write(file, "[Network]\nDHCP=yes\n");
    root_.age(state, 2'000);
    root_.age(file, 2'000);
    EXPECT_EQ(read().managements.at(0).dhcp4, true);
    root_.age(file, 3'000);
    EXPECT_EQ(read().managements.at(0).dhcp4, std::nullopt);
    root_.age(file, 1'000);
    root_.write(file + ".d/10.conf", "[Network]\nDHCP=no\n");
    root_.age(file + ".d/10.conf", 3'000);
    EXPECT_EQ(read().managements.at(0).dhcp4, std::nullopt);
}

TEST_F(NetworkdTest, DamagedFilesAreToldAndTheRestCounts) {
    link("2", "ADMIN_STATE=configured\nscrap\nNETWORK_FILE=\n");
    link("3", "OPER_STATE=routable\n");
    root_.write("/run/systemd/netif/leases/2",
                "# private\nADDRESS=198.51.100.110\nLIFETIME=soon\n\x01\x02\n");
    root_.write("/run/systemd/netif/leases/3", "");
    const ClientFacts facts = read();
    EXPECT_EQ(facts.managements.size(), 1U);
    EXPECT_EQ(facts.leases.size(), 1U);
    const auto told = [&](const std::string& file, const std::string& reason) {
        return "cannot use all of " + root_.path("/run/systemd/netif/" + file) + ": " + reason;
    };
    EXPECT_THAT(ZR::Testing::textsOf(facts.diagnostics),
                testing::ElementsAre(told("links/2", "line 2: not of the form KEY=value"),
                                     told("links/3", "no ADMIN_STATE"),
                                     told("leases/2", "line 3: LIFETIME is not a time"),
                                     told("leases/3", "no ADDRESS")));
    for (const Diagnostic& diagnostic : facts.diagnostics) {
        EXPECT_EQ(diagnostic.kind, Diagnostic::Kind::Damaged);
    }
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

TEST_F(NetworkdTest, AFileThatOthersCouldHaveWrittenIsNotBelieved) {
    root_.write("/run/systemd/netif/leases/2", sample("networkd/run-systemd-netif-leases-2.txt"));
    ZR::Testing::letOthersWrite(root_, "/run/systemd/netif/leases/2");
    ZR::Testing::expectNoLeaseButADiagnostic(read());
}

}  // namespace
}  // namespace ZR::Live
