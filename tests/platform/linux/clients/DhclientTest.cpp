#include "clients/Dhclient.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

std::optional<ClientProcess> parse(std::vector<std::string_view> arguments) {
    return parseDhclientArguments(arguments);
}

ClientProcess process(std::vector<InterfaceName> interfaces, std::string leaseFile = "",
                      bool ipv6 = false) {
    return {.client = Client::Dhclient,
            .interfaces = std::move(interfaces),
            .leaseFile = std::move(leaseFile),
            .ipv6 = ipv6};
}

std::string lease(const std::string& interfaceName, const std::string& address,
                  const std::string& server) {
    return "lease { interface \"" + interfaceName + "\"; fixed-address " + address +
           "; option dhcp-server-identifier " + server + "; expire never; }\n";
}

TEST(DhclientArguments, WithoutAnInterfaceItRunsOnAll) {
    EXPECT_EQ(parse({"dhclient"}), process({}));
    EXPECT_EQ(parse({"/sbin/dhclient", "-v", "-1"}), process({}));
}

TEST(DhclientArguments, AsIfupdownStartsIt) {
    EXPECT_EQ(parse({"/sbin/dhclient", "-4", "-v", "-i", "-pf", "/run/dhclient.eth1.pid", "-lf",
                     "/var/lib/dhcp/dhclient.eth1.leases", "-I", "-df",
                     "/var/lib/dhcp/dhclient6.eth1.leases", "eth1"}),
              process({"eth1"_name}, "/var/lib/dhcp/dhclient.eth1.leases"));
}

TEST(DhclientArguments, AsNetworkManagerStartsIt) {
    EXPECT_EQ(parse({"/sbin/dhclient", "-d", "-q", "-sf", "/usr/libexec/nm-dhcp-helper", "-pf",
                     "/run/NetworkManager/dhclient-eth1.pid", "-lf",
                     "/var/lib/NetworkManager/dhclient-1-eth1.lease", "-cf",
                     "/var/lib/NetworkManager/dhclient-eth1.conf", "eth1"}),
              process({"eth1"_name}, "/var/lib/NetworkManager/dhclient-1-eth1.lease"));
}

TEST(DhclientArguments, ValuesOfOptionsAreNotInterfaces) {
    EXPECT_EQ(
        parse({"dhclient", "-6", "-e", "A=b", "-s", "192.0.2.1", "-g", "192.0.2.2", "-p", "1068",
               "-D", "LL", "--dad-wait-time", "3", "-H", "host", "-w", "eth1", "eth2"}),
        process({"eth1"_name, "eth2"_name}, "", true));
}

TEST(DhclientArguments, AClientThatGivesItsLeaseBackIsNone) {
    EXPECT_EQ(parse({"dhclient", "-r", "eth1"}), std::nullopt);
    EXPECT_EQ(parse({"dhclient", "-x"}), std::nullopt);
}

TEST(DhclientArguments, AProcessWithoutArgumentsIsNone) {
    EXPECT_EQ(parse({}), std::nullopt);
}

TEST(DhclientArguments, AValueThatIsMissingIsEmpty) {
    EXPECT_EQ(parse({"dhclient", "-lf"}), process({}));
}

class DhclientTest : public testing::Test {
  protected:
    ClientFacts read(std::vector<ClientProcess> processes = {}) const {
        ClientFacts facts;
        facts.processes = std::move(processes);
        readDhclient({.files = root_.path()}, facts);
        return facts;
    }
    static std::vector<std::optional<IpAddress>> servers(const ClientFacts& facts) {
        std::vector<std::optional<IpAddress>> servers;
        for (const Lease& lease : facts.leases) {
            servers.push_back(lease.server);
        }
        return servers;
    }

    TemporaryDirectory root_;
};

TEST_F(DhclientTest, OnAMachineWithoutItThereIsNothing) {
    EXPECT_EQ(read(), ClientFacts{});
}

TEST_F(DhclientTest, FilesOfAllItsStartersAreRead) {
    int number = 0;
    for (const char* file :
         {"/var/lib/dhcp/dhclient.leases", "/var/lib/dhcp/dhclient.eth1.leases",
          "/var/lib/dhclient/dhclient-eth1.leases", "/var/lib/dhclient/dhclient-UUID-eth1.lease",
          "/var/lib/NetworkManager/dhclient-11111111-2222-4333-8444-555555555555-eth1.lease"}) {
        ++number;
        root_.write(file, lease("eth1", "192.0.2.7", "192.0.2." + std::to_string(number)));
        root_.age(file, number);
    }
    EXPECT_THAT(servers(read()), ElementsAre("192.0.2.5"_ip, "192.0.2.4"_ip, "192.0.2.3"_ip,
                                             "192.0.2.2"_ip, "192.0.2.1"_ip));
}

TEST_F(DhclientTest, WhatTheStartFromTheNetworkLeftIsRead) {
    root_.write("/run/initramfs/net.eth1.lease", lease("eth1", "192.0.2.7", "192.0.2.1"));
    root_.write("/run/initramfs/net.eth1.gw", lease("eth1", "192.0.2.7", "192.0.2.2"));
    root_.write("/run/initramfs/dhclient.lease", lease("eth1", "192.0.2.7", "192.0.2.3"));
    root_.write("/var/lib/dhcp/net.eth1.lease", lease("eth1", "192.0.2.7", "192.0.2.4"));
    const ClientFacts facts = read();
    EXPECT_THAT(servers(facts), ElementsAre("192.0.2.1"_ip));
    EXPECT_FALSE(facts.leases[0].clientAlive);
}

TEST_F(DhclientTest, OtherFilesBesideThemAreNotRead) {
    root_.write("/var/lib/NetworkManager/internal-1-eth1.lease",
                lease("eth1", "192.0.2.7", "192.0.2.1"));
    root_.write("/var/lib/dhcp/dhclient.leases.bak", lease("eth1", "192.0.2.7", "192.0.2.1"));
    root_.write("/var/lib/dhcp/.dhclient.leases", lease("eth1", "192.0.2.7", "192.0.2.1"));
    EXPECT_THAT(read().leases, IsEmpty());
}

TEST_F(DhclientTest, ALeaseBecomesAFullClaim) {
    root_.write("/var/lib/dhcp/dhclient.eth1.leases", sample("isc-dhclient/dhclient.eth1.leases"));
    EXPECT_EQ(read().leases,
              (std::vector<Lease>{{.client = Client::Dhclient,
                                   .interfaceName = "eth1"_name,
                                   .address = "198.51.100.106"_ip,
                                   .server = "198.51.100.1"_ip,
                                   .expires = 1795216781,
                                   .origin = root_.path("/var/lib/dhcp/dhclient.eth1.leases")}}));
}

TEST_F(DhclientTest, ADhcpv6LeaseBecomesAClaimWithoutAServerAddress) {
    root_.write("/var/lib/dhcp/dhclient6.eth1.leases",
                sample("isc-dhclient/dhclient6.eth1.leases.after-release"));
    EXPECT_EQ(read().leases,
              (std::vector<Lease>{{.client = Client::Dhclient,
                                   .interfaceName = "eth1"_name,
                                   .address = "2001:db8:99::16e"_ip,
                                   .server = {},
                                   .released = true,
                                   .expires = 1795217908,
                                   .origin = root_.path("/var/lib/dhcp/dhclient6.eth1.leases")}}));
}

TEST_F(DhclientTest, CapturedUnderNetworkManager) {
    const std::string profile = "11111111-2222-4333-8444-555555555555-eth1.lease";
    for (const char* name : {"dhclient-", "dhclient6-"}) {
        root_.write("/var/lib/NetworkManager/" + (name + profile),
                    sample("networkmanager-dhclient/" + (name + profile)));
        root_.age("/var/lib/NetworkManager/" + (name + profile), name[8] == '6' ? 1 : 2);
    }
    const ClientFacts facts =
        read({process({"eth1"_name}, "/var/lib/NetworkManager/dhclient-" + profile)});
    EXPECT_EQ(facts.leases,
              (std::vector<Lease>{
                  {.client = Client::Dhclient,
                   .interfaceName = "eth1"_name,
                   .address = "198.51.100.109"_ip,
                   .server = "198.51.100.1"_ip,
                   .clientAlive = true,
                   .expires = 1795216696,
                   .origin = root_.path("/var/lib/NetworkManager/dhclient-" + profile)},
                  {.client = Client::Dhclient,
                   .interfaceName = "eth1"_name,
                   .address = "2001:db8:99::1b0"_ip,
                   .server = {},
                   .expires = 1795216697,
                   .origin = root_.path("/var/lib/NetworkManager/dhclient6-" + profile)}}));
}

TEST_F(DhclientTest, CapturedUnderIfupdown) {
    root_.write("/var/lib/dhcp/dhclient.eth1.leases", sample("ifupdown/dhclient.eth1.leases"));
    EXPECT_EQ(read().leases,
              (std::vector<Lease>{{.client = Client::Dhclient,
                                   .interfaceName = "eth1"_name,
                                   .address = "198.51.100.106"_ip,
                                   .server = "198.51.100.1"_ip,
                                   .expires = 1795216956,
                                   .origin = root_.path("/var/lib/dhcp/dhclient.eth1.leases")}}));
}

TEST_F(DhclientTest, AClaimWithoutAnEndIsNone) {
    root_.write("/var/lib/dhcp/dhclient.leases",
                "lease { interface \"eth1\"; fixed-address 192.0.2.7; }");
    EXPECT_THAT(read().leases, IsEmpty());
}

TEST_F(DhclientTest, TheFileOfARunningClientIsReadWhereverItLies) {
    root_.write("/srv/leases/own.db", lease("eth1", "192.0.2.7", "192.0.2.1"));
    const ClientFacts facts = read({process({"eth1"_name}, "/srv/leases/own.db")});
    ASSERT_EQ(facts.leases.size(), 1U);
    EXPECT_TRUE(facts.leases[0].clientAlive);
    EXPECT_EQ(facts.places, (std::vector<WatchedPlace>{
                                {.directory = root_.path("/srv/leases"), .namePrefix = "own.db"}}));
}

TEST_F(DhclientTest, AFileIsReadOnceHoweverManyNamesItHas) {
    root_.write("/var/lib/dhcp/dhclient.eth1.leases", lease("eth1", "192.0.2.7", "192.0.2.1"));
    ASSERT_EQ(::symlink("dhcp", root_.path("/var/lib/alias").c_str()), 0);
    const ClientFacts facts = read({process({"eth1"_name}, "/var/lib/alias/dhclient.eth1.leases")});
    ASSERT_EQ(facts.leases.size(), 1U);
    EXPECT_TRUE(facts.leases[0].clientAlive);
}

TEST_F(DhclientTest, OnlyTheClientThatKeepsTheFileIsBehindItsLeases) {
    root_.write("/var/lib/dhcp/dhclient.leases",
                lease("eth1", "192.0.2.7", "192.0.2.1") + lease("eth2", "192.0.2.8", "192.0.2.2"));
    const auto alive = [&](std::vector<ClientProcess> processes) {
        std::vector<bool> states;
        for (const Lease& found : read(std::move(processes)).leases) {
            states.push_back(found.clientAlive);
        }
        return states;
    };
    EXPECT_THAT(alive({}), ElementsAre(false, false));
    EXPECT_THAT(alive({process({})}), ElementsAre(true, true));
    EXPECT_THAT(alive({process({"eth2"_name})}), ElementsAre(false, true));
    EXPECT_THAT(alive({process({}, "/elsewhere")}), ElementsAre(false, false));
    EXPECT_THAT(alive({process({}, "", true)}), ElementsAre(false, false));
}

TEST_F(DhclientTest, ALeaseFileNamedRelativelyIsNotGuessed) {
    const ClientFacts facts = read({process({"eth1"_name}, "own.db")});
    EXPECT_THAT(facts.leases, IsEmpty());
    EXPECT_THAT(facts.places, IsEmpty());
}

TEST_F(DhclientTest, AnythingButAFileIsReportedAndHangsNoReader) {
    std::filesystem::create_directories(root_.path("/var/lib/dhcp"));
    ASSERT_EQ(::mkfifo(root_.path("/var/lib/dhcp/dhclient.leases").c_str(), 0600), 0);
    const ClientFacts facts = read();
    EXPECT_THAT(facts.leases, IsEmpty());
    EXPECT_EQ(facts.diagnostics.size(), 1U);
}

}  // namespace
}  // namespace ZR::Live
