#include "clients/Dhclient.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sched.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <csignal>

#include "LinuxSupport.h"
#include "clients/ProcessFiles.h"
#include "formats/Trust.h"
#include "kit/Namespaces.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

std::optional<ClientProcess> parsedDhclient(std::vector<std::string_view> arguments) {
    return parseDhclientArguments(arguments);
}

ClientProcess dhclientProcess(std::vector<InterfaceName> interfaces, std::string leaseFile = "",
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
    EXPECT_EQ(parsedDhclient({"dhclient"}), dhclientProcess({}));
    EXPECT_EQ(parsedDhclient({"/sbin/dhclient", "-v", "-1"}), dhclientProcess({}));
}

TEST(DhclientArguments, AsIfupdownStartsIt) {
    EXPECT_EQ(parsedDhclient({"/sbin/dhclient", "-4", "-v", "-i", "-pf", "/run/dhclient.eth1.pid",
                              "-lf", "/var/lib/dhcp/dhclient.eth1.leases", "-I", "-df",
                              "/var/lib/dhcp/dhclient6.eth1.leases", "eth1"}),
              dhclientProcess({"eth1"_name}, "/var/lib/dhcp/dhclient.eth1.leases"));
}

TEST(DhclientArguments, AsNetworkManagerStartsIt) {
    EXPECT_EQ(parsedDhclient({"/sbin/dhclient", "-d", "-q", "-sf", "/usr/libexec/nm-dhcp-helper",
                              "-pf", "/run/NetworkManager/dhclient-eth1.pid", "-lf",
                              "/var/lib/NetworkManager/dhclient-1-eth1.lease", "-cf",
                              "/var/lib/NetworkManager/dhclient-eth1.conf", "eth1"}),
              dhclientProcess({"eth1"_name}, "/var/lib/NetworkManager/dhclient-1-eth1.lease"));
}

TEST(DhclientArguments, ValuesOfOptionsAreNotInterfaces) {
    EXPECT_EQ(parsedDhclient({"dhclient", "-6", "-e", "A=b", "-s", "192.0.2.1", "-g", "192.0.2.2",
                              "-p", "1068", "-D", "LL", "--dad-wait-time", "3", "-H", "host", "-w",
                              "eth1", "eth2"}),
              dhclientProcess({"eth1"_name, "eth2"_name}, "", true));
}

TEST(DhclientArguments, AClientThatGivesItsLeaseBackIsNone) {
    EXPECT_EQ(parsedDhclient({"dhclient", "-r", "eth1"}), std::nullopt);
    EXPECT_EQ(parsedDhclient({"dhclient", "-x"}), std::nullopt);
}

TEST(DhclientArguments, AProcessWithoutArgumentsIsNone) {
    EXPECT_EQ(parsedDhclient({}), std::nullopt);
}

TEST(DhclientArguments, AValueThatIsMissingIsEmpty) {
    EXPECT_EQ(parsedDhclient({"dhclient", "-lf"}), dhclientProcess({}));
}

class DhclientTest : public testing::Test {
  protected:
    ClientFacts read(std::vector<ClientProcess> processes = {}) const {
        ClientFacts facts;
        facts.processes = std::move(processes);
        readDhclient({.files = root_.path(""), .proc = root_.path("/proc")}, facts);
        return facts;
    }
    /// The leases without what the parser's tests are about.
    static std::vector<Lease> claims(const ClientFacts& facts) {
        std::vector<Lease> claims = facts.leases;
        for (Lease& lease : claims) {
            lease.obtained.reset();
            lease.renews.reset();
            lease.rebinds.reset();
            lease.options.clear();
            lease.clientIdentifier.clear();
        }
        return claims;
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
    EXPECT_EQ(claims(read()),
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
    EXPECT_EQ(claims(read()),
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
        read({dhclientProcess({"eth1"_name}, "/var/lib/NetworkManager/dhclient-" + profile)});
    EXPECT_EQ(claims(facts),
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
    EXPECT_EQ(claims(read()),
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
    const ClientFacts facts = read();
    EXPECT_THAT(facts.leases, IsEmpty());
    EXPECT_THAT(facts.diagnostics,
                ElementsAre(Diagnostic{
                    root_.path("/var/lib/dhcp/dhclient.leases") + ", line 1: the lease has no end",
                    Diagnostic::Kind::Damaged}));
}

TEST_F(DhclientTest, TheGoodBlocksOfADamagedFileCount) {
    root_.write("/var/lib/dhcp/dhclient.leases",
                lease("eth1", "192.0.2.7", "192.0.2.1") + "lease { ? }\n" +
                    lease("eth2", "192.0.2.8", "192.0.2.2") + "lease {\n  interface \"eth1\";");
    const ClientFacts facts = read();
    EXPECT_THAT(servers(facts), ElementsAre("192.0.2.1"_ip, "192.0.2.2"_ip));
    const std::string path = root_.path("/var/lib/dhcp/dhclient.leases");
    EXPECT_THAT(facts.diagnostics,
                ElementsAre(Diagnostic{path + ", line 2: the lease has no address",
                                       Diagnostic::Kind::Damaged},
                            Diagnostic{path + ", line 4: the file ends within this block",
                                       Diagnostic::Kind::Damaged}));
}

TEST_F(DhclientTest, ALeaseTellsItsTimesItsOptionsAndItsClient) {
    root_.write("/var/lib/dhcp/dhclient6.eth1.leases",
                sample("isc-dhclient/dhclient6.eth1.leases"));
    ClientProcess client =
        dhclientProcess({"eth1"_name}, "/var/lib/dhcp/dhclient6.eth1.leases", true);
    client.pid = 17;
    const ClientFacts facts = read({client});
    ASSERT_EQ(facts.leases.size(), 1U);
    const Lease& lease = facts.leases[0];
    EXPECT_EQ(lease.obtained, 1795216181);
    EXPECT_EQ(lease.renews, 1795216481);
    EXPECT_EQ(lease.rebinds, 1795216706);
    EXPECT_EQ(lease.expires, 1795216781);
    EXPECT_THAT(lease.options, testing::Contains(23));
    EXPECT_TRUE(lease.clientIdentifier.starts_with("0:1:0:1:")) << lease.clientIdentifier;
    EXPECT_EQ(lease.pid, 17);
    EXPECT_EQ(read().leases.at(0).pid, 0);
}

TEST_F(DhclientTest, AFileThatOthersMayWriteIsNotBelieved) {
    const std::string file = "/var/lib/dhcp/dhclient.leases";
    root_.write(file, lease("eth1", "192.0.2.7", "192.0.2.1"));
    ASSERT_EQ(::chmod(root_.path("").c_str(), 0755), 0);
    ASSERT_EQ(::chmod(root_.path("/var/lib/dhcp").c_str(), 0777), 0);
    const ClientFacts facts = read({dhclientProcess({"eth1"_name}, file)});
    EXPECT_THAT(facts.leases, IsEmpty());
    const Diagnostic expected{
        root_.path(file) + " is not trusted: every user may change " + root_.path("/var/lib/dhcp"),
        Diagnostic::Kind::Untrusted};
    EXPECT_THAT(facts.diagnostics, testing::Each(expected));
    EXPECT_FALSE(facts.diagnostics.empty());
    ASSERT_EQ(::chmod(root_.path("/var/lib/dhcp").c_str(), 0755), 0);
    EXPECT_EQ(read().leases.size(), 1U);
}

TEST_F(DhclientTest, OnlyTheUserOfItsClientMayOwnAFile) {
    if (::geteuid() != 0) {
        GTEST_SKIP() << "giving files away needs root";
    }
    constexpr uid_t nobody = 65534;
    const std::string file = "/var/lib/dhcp/dhclient.leases";
    root_.write(file, lease("eth1", "192.0.2.7", "192.0.2.1"));
    ASSERT_EQ(::chmod(root_.path("").c_str(), 0755), 0);
    ASSERT_EQ(::chown(root_.path(file).c_str(), nobody, nobody), 0);
    EXPECT_THAT(read().leases, IsEmpty());
    ClientProcess client = dhclientProcess({"eth1"_name});
    EXPECT_THAT(read({client}).leases, IsEmpty());
    client.user = nobody;
    const ClientFacts facts = read({client});
    EXPECT_EQ(facts.leases.size(), 1U);
    EXPECT_THAT(facts.diagnostics, IsEmpty());
}

TEST_F(DhclientTest, WhatALinkLeadsToIsWatched) {
    root_.write("/srv/own.db", lease("eth1", "192.0.2.7", "192.0.2.1"));
    std::filesystem::create_directories(root_.path("/var/lib/dhcp"));
    ASSERT_EQ(::symlink("../../../srv/own.db", root_.path("/var/lib/dhcp/dhclient.leases").c_str()),
              0);
    const ClientFacts facts = read();
    EXPECT_EQ(facts.leases.size(), 1U);
    EXPECT_EQ(facts.leases.at(0).origin, root_.path("/var/lib/dhcp/dhclient.leases"));
    EXPECT_EQ(
        facts.places,
        (std::vector<WatchedPlace>{{.directory = root_.path("/srv"), .namePrefix = "own.db"}}));
}

TEST_F(DhclientTest, TheFileOfARunningClientIsReadWhereverItLies) {
    root_.write("/srv/leases/own.db", lease("eth1", "192.0.2.7", "192.0.2.1"));
    const ClientFacts facts = read({dhclientProcess({"eth1"_name}, "/srv/leases/own.db")});
    ASSERT_EQ(facts.leases.size(), 1U);
    EXPECT_TRUE(facts.leases[0].clientAlive);
    EXPECT_EQ(facts.places, (std::vector<WatchedPlace>{
                                {.directory = root_.path("/srv/leases"), .namePrefix = "own.db"}}));
}

TEST_F(DhclientTest, AFileIsReadOnceHoweverManyNamesItHas) {
    root_.write("/var/lib/dhcp/dhclient.eth1.leases", lease("eth1", "192.0.2.7", "192.0.2.1"));
    ASSERT_EQ(::symlink("dhcp", root_.path("/var/lib/alias").c_str()), 0);
    const ClientFacts facts =
        read({dhclientProcess({"eth1"_name}, "/var/lib/alias/dhclient.eth1.leases")});
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
    EXPECT_THAT(alive({dhclientProcess({})}), ElementsAre(true, true));
    EXPECT_THAT(alive({dhclientProcess({"eth2"_name})}), ElementsAre(false, true));
    EXPECT_THAT(alive({dhclientProcess({}, "/elsewhere")}), ElementsAre(false, false));
    EXPECT_THAT(alive({dhclientProcess({}, "", true)}), ElementsAre(false, false));
}

/// A relative file name, of a process of which this process file system tells.
class RelativeDhclientTest : public DhclientTest {
  protected:
    RelativeDhclientTest() {
        root_.write("/srv/own.db", lease("eth1", "192.0.2.7", "192.0.2.1"));
        std::filesystem::create_directories(root_.path("/proc/17"));
    }
    void link(const std::string& name, const std::string& target) const {
        std::filesystem::create_symlink(target, root_.path("/proc/17/" + name));
    }
    ClientFacts readOf(const std::string& leaseFile) const {
        ClientFacts facts;
        facts.processes = {dhclientProcess({"eth1"_name}, leaseFile)};
        facts.processes[0].pid = 17;
        readDhclient({.files = "", .proc = root_.path("/proc")}, facts);
        // What the machine itself has is not of this test.
        std::erase_if(facts.leases, [](const Lease& lease) { return lease.pid == 0; });
        return facts;
    }
};

TEST_F(RelativeDhclientTest, BeginsInTheWorkingDirectory) {
    link("cwd", root_.path("/srv"));
    for (const char* name : {"own.db", "./own.db", "../srv/own.db"}) {
        const ClientFacts facts = readOf(name);
        ASSERT_EQ(facts.leases.size(), 1U) << name;
        EXPECT_TRUE(facts.leases[0].clientAlive);
        EXPECT_EQ(facts.leases[0].origin, root_.path("/srv/") + name);
    }
    EXPECT_THAT(
        readOf("own.db").places,
        testing::Contains(WatchedPlace{.directory = root_.path("/srv"), .namePrefix = "own.db"}));
}

TEST_F(RelativeDhclientTest, OfAProcessThatHasEndedNothingIsKnown) {
    std::filesystem::remove_all(root_.path("/proc/17"));
    const ClientFacts facts = readOf("own.db");
    EXPECT_THAT(facts.leases, IsEmpty());
    EXPECT_THAT(facts.places, IsEmpty());
}

TEST_F(RelativeDhclientTest, ADirectoryThatIsGoneIsToldAndNotGuessed) {
    link("cwd", root_.path("/srv (deleted)"));
    const ClientFacts facts = readOf("own.db");
    EXPECT_THAT(facts.leases, IsEmpty());
    EXPECT_THAT(
        facts.diagnostics,
        testing::Contains(Diagnostic{
            "cannot tell where process 17 (dhclient) keeps own.db: No such file or directory",
            Diagnostic::Kind::Unreadable}));
}

TEST_F(RelativeDhclientTest, BeginsBelowTheRootOfTheProcess) {
    // As of a process that changed its root to another one and works in its /srv.
    root_.write("/jail/srv/own.db", lease("eth1", "192.0.2.7", "192.0.2.2"));
    root_.write("/jail/etc/whole.db", lease("eth1", "192.0.2.7", "192.0.2.3"));
    link("root", root_.path("/jail"));
    link("cwd", root_.path("/jail/srv"));
    EXPECT_THAT(servers(readOf("own.db")), ElementsAre("192.0.2.2"_ip));
    EXPECT_THAT(servers(readOf("/etc/whole.db")), ElementsAre("192.0.2.3"_ip));
}

TEST(DhclientProcessFiles, OfARealKernel) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        run("mkdir -p /run/jail/srv /run/srv && echo here > /run/srv/own.db && "
            "echo jailed > /run/jail/srv/own.db && ln -s /srv/own.db /run/jail/srv/link.db");
        const auto contentFor = [](const char* root, const char* directory, const char* path,
                                   int kinds) {
            std::array<int, 2> ready{};
            EXPECT_EQ(::pipe(ready.data()), 0);
            const pid_t child = ::fork();
            if (child == 0) {
                const bool done = ::unshare(kinds) == 0 && ::chroot(root) == 0 &&
                                  ::chdir(directory) == 0 && ::write(ready[1], "y", 1) == 1;
                if (done) {
                    ::pause();  // until it is killed
                }
                ::_exit(1);
            }
            ::close(ready[1]);
            char done = 'n';
            EXPECT_EQ(::read(ready[0], &done, 1), 1);
            ::close(ready[0]);
            ClientProcess client = dhclientProcess({}, path);
            client.pid = child;
            std::vector<Diagnostic> diagnostics;
            const auto file = fileOfProcess({}, client, path, diagnostics);
            std::string content = "not known";
            if (file) {
                const auto found = findFile(file->path, {}, diagnostics, file->root);
                content = found ? File::read(found->path).value_or("unreadable") : "not found";
                if (found && !found->doubt.empty()) {
                    content = found->doubt;
                }
            }
            ::kill(child, SIGKILL);
            ::waitpid(child, nullptr, 0);
            return content;
        };
        EXPECT_EQ(contentFor("/", "/run/srv", "own.db", 0), "here\n");
        EXPECT_EQ(contentFor("/run/jail", "/srv", "own.db", 0), "jailed\n");
        EXPECT_EQ(contentFor("/run/jail", "/srv", "/srv/own.db", 0), "jailed\n");
        EXPECT_EQ(contentFor("/run/jail", "/srv", "/srv/link.db", 0), "jailed\n");
        EXPECT_EQ(contentFor("/", "/run/srv", "own.db", CLONE_NEWNS), "here\n");
        EXPECT_EQ(contentFor("/", "/run/srv", "/run/srv/own.db", CLONE_NEWNS), "here\n");
        EXPECT_EQ(contentFor("/", "/run/srv", "none.db", 0), "not found");
    }));
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
