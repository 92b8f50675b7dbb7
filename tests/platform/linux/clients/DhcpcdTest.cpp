#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>

#include "LinuxSupport.h"
#include "Untrusted.h"
#include "clients/Dhcpcd.h"
#include "clients/DhcpcdSettings.h"
#include "kit/Diagnostics.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

std::optional<ClientProcess> parsedDhcpcd(std::vector<std::string_view> arguments) {
    return parseDhcpcdArguments(arguments);
}
ClientProcess dhcpcdProcess(std::vector<InterfaceName> interfaces, bool ipv6 = false) {
    return {.client = Client::Dhcpcd,
            .interfaces = std::move(interfaces),
            .leaseFile = "",
            .ipv6 = ipv6};
}

TEST(DhcpcdArguments, ARunningOneSaysWhatItDoes) {
    EXPECT_EQ(parsedDhcpcd({"dhcpcd: eth1 [ip4] [ip6]"}), dhcpcdProcess({"eth1"_name}));
    EXPECT_EQ(parsedDhcpcd({"dhcpcd: eth1 [ip6]"}), dhcpcdProcess({"eth1"_name}, true));
    EXPECT_EQ(parsedDhcpcd({"dhcpcd: [manager] [ip4] [ip6]"}), dhcpcdProcess({}));
    EXPECT_EQ(parsedDhcpcd({"dhcpcd: [master] [ip4]"}), dhcpcdProcess({}));
}

TEST(DhcpcdArguments, ItsHelpersAreNotClients) {
    for (const char* title :
         {"dhcpcd: [privileged proxy] eth1 [ip4] [ip6]", "dhcpcd: [network proxy] 198.51.100.7",
          "dhcpcd: [control proxy] eth1 [ip4]", "dhcpcd: [BPF ARP] eth1 198.51.100.107",
          "dhcpcd: [BPF BOOTP] eth1", "dhcpcd: [launcher]", "dhcpcd: "}) {
        EXPECT_EQ(parsedDhcpcd({title}), std::nullopt) << title;
    }
}

TEST(DhcpcdArguments, BeforeItSaysSoItsArgumentsTell) {
    EXPECT_EQ(parsedDhcpcd({"dhcpcd"}), dhcpcdProcess({}));
    EXPECT_EQ(parsedDhcpcd({"/usr/sbin/dhcpcd", "-q", "-t", "30", "--config", "/c", "-Bd", "eth1"}),
              dhcpcdProcess({"eth1"_name}));
    EXPECT_EQ(parsedDhcpcd({"dhcpcd", "-6", "eth1", "eth2"}),
              dhcpcdProcess({"eth1"_name, "eth2"_name}, true));
    EXPECT_EQ(parsedDhcpcd({}), std::nullopt);
}

TEST(DhcpcdArguments, ACommandToAnotherOneIsNotAClient) {
    for (const char* command :
         {"-k", "-x", "-n", "-U", "-T", "--release", "--exit", "--dumplease", "--test"}) {
        EXPECT_EQ(parsedDhcpcd({"dhcpcd", command, "eth1"}), std::nullopt) << command;
    }
}

TEST(DhcpcdInterfaces, ANetworksNameMayStandBehindTheInterface) {
    EXPECT_THAT(dhcpcdInterfaces("eth1"), ElementsAre("eth1"_name));
    EXPECT_THAT(dhcpcdInterfaces("wlan0-My-Net"),
                ElementsAre("wlan0-My-Net"_name, "wlan0-My"_name, "wlan0"_name));
    EXPECT_THAT(dhcpcdInterfaces("wlan0-A network of a long name"), ElementsAre("wlan0"_name));
    EXPECT_THAT(dhcpcdInterfaces("-"), ElementsAre("-"_name));
    EXPECT_THAT(dhcpcdInterfaces(""), IsEmpty());
}

class DhcpcdTest : public testing::Test {
  protected:
    [[nodiscard]] ClientFacts read(std::vector<ClientProcess> processes = {}) const {
        ClientFacts facts;
        facts.processes = std::move(processes);
        return readWith(readDhcpcd, root_, std::move(facts));
    }
    void write(const std::string& file, const std::string& content) const {
        root_.write(file, content);
        root_.age(file, 1'795'216'000);
    }
    [[nodiscard]] Lease lease(const std::string& file) const {
        return {.client = Client::Dhcpcd,
                .interfaceName = "eth1"_name,
                .address = "198.51.100.121"_ip,
                .server = "198.51.100.1"_ip,
                .expires = 1'795'216'600,
                .obtained = 1'795'216'000,
                .renews = 1'795'216'300,
                .rebinds = 1'795'216'525,
                .options = {53, 54, 51, 58, 59, 1, 28, 12, 15, 42, 6, 3},
                .origin = root_.path(file)};
    }

    TemporaryDirectory root_;
};

TEST_F(DhcpcdTest, OnAMachineWithoutItThereIsNothing) {
    EXPECT_EQ(read(), ClientFacts{});
}

TEST_F(DhcpcdTest, ALeaseBeginsWhenItsFileWasWritten) {
    write("/var/lib/dhcpcd/eth1.lease", sample("dhcpcd-10/eth1.lease"));
    EXPECT_THAT(read().leases, ElementsAre(lease("/var/lib/dhcpcd/eth1.lease")));
}

TEST_F(DhcpcdTest, ALeaseOfIPv6NamesNoServer) {
    write("/var/lib/dhcpcd/eth1.lease6", sample("dhcpcd-10/eth1.lease6"));
    EXPECT_THAT(read().leases,
                ElementsAre(Lease{.client = Client::Dhcpcd,
                                  .interfaceName = "eth1"_name,
                                  .address = "2001:db8:99::100"_ip,
                                  .server = {},
                                  .expires = 1'795'216'600,
                                  .obtained = 1'795'216'000,
                                  .renews = 1'795'216'300,
                                  .rebinds = 1'795'216'525,
                                  .options = {1, 2, 3, 13, 23, 39},
                                  .clientIdentifier = "00:01:00:01:32:93:91:cc:52:54:00:00:00:10",
                                  .origin = root_.path("/var/lib/dhcpcd/eth1.lease6")}));
}

TEST_F(DhcpcdTest, AllItsPlacesAreRead) {
    for (const char* file : {"/var/lib/dhcpcd/eth1.lease", "/var/lib/dhcpcd5/dhcpcd-eth1.lease",
                             "/var/db/dhcpcd/eth1.lease"}) {
        write(file, sample("dhcpcd-10/eth1.lease"));
    }
    root_.write("/var/lib/dhcpcd/duid", "x");
    root_.write("/var/lib/dhcpcd/.lease", "x");
    EXPECT_THAT(read().leases, ElementsAre(lease("/var/lib/dhcpcd/eth1.lease"),
                                           lease("/var/lib/dhcpcd5/dhcpcd-eth1.lease"),
                                           lease("/var/db/dhcpcd/eth1.lease")));
    EXPECT_THAT(ZR::Testing::textsOf(read().diagnostics), IsEmpty());
}

TEST_F(DhcpcdTest, ARunningOneOfTheLinkOrOfAllKeepsTheLease) {
    write("/var/lib/dhcpcd/eth1.lease", sample("dhcpcd-10/eth1.lease"));
    const auto alive = [&](const ClientProcess& process) {
        return read({process}).leases.at(0).clientAlive;
    };
    EXPECT_TRUE(alive(dhcpcdProcess({"eth1"_name})));
    EXPECT_TRUE(alive(dhcpcdProcess({})));
    EXPECT_FALSE(alive(dhcpcdProcess({"eth2"_name})));
    ClientProcess other = dhcpcdProcess({});
    other.client = Client::Dhclient;
    EXPECT_FALSE(alive(other));
}

TEST_F(DhcpcdTest, AnInfiniteLeaseAndBootpHaveNoEnd) {
    std::string infinite = sample("dhcpcd-10/eth1.lease");
    infinite.replace(infinite.find("\x33\x04"), 6, "\x33\x04\xff\xff\xff\xff");
    write("/var/lib/dhcpcd/eth1.lease", infinite);
    EXPECT_EQ(read().leases.at(0).expires, Lease::never);
    EXPECT_FALSE(read().leases.at(0).bootp);

    std::string bootp = sample("dhcpcd-10/eth1.lease").substr(0, 240) + '\xff';
    write("/var/lib/dhcpcd/eth1.lease", bootp);
    EXPECT_EQ(read().leases.at(0).expires, Lease::never);
    EXPECT_TRUE(read().leases.at(0).bootp);
    EXPECT_EQ(read().leases.at(0).server, std::nullopt);
}

TEST_F(DhcpcdTest, AReplyWithoutALeaseTimeIsNotALease) {
    const std::string inform =
        sample("dhcpcd-10/eth1.lease").substr(0, 240) + std::string{"\x35\x01\x05\xff"};
    write("/var/lib/dhcpcd/eth1.lease", inform);
    EXPECT_THAT(read().leases, IsEmpty());
    EXPECT_THAT(ZR::Testing::textsOf(read().diagnostics), IsEmpty());
}

TEST_F(DhcpcdTest, AnEmptyFileIsJustBeingWritten) {
    write("/var/lib/dhcpcd/eth1.lease", "");
    EXPECT_EQ(read(), ClientFacts{});
}

TEST_F(DhcpcdTest, AFileThatIsNotAPacketIsReported) {
    write("/var/lib/dhcpcd/eth1.lease", "text");
    write("/var/lib/dhcpcd/eth1.lease6", "text");
    EXPECT_THAT(read().leases, IsEmpty());
    EXPECT_THAT(ZR::Testing::textsOf(read().diagnostics),
                ElementsAre("cannot use " + root_.path("/var/lib/dhcpcd/eth1.lease") +
                                ": shorter than a DHCP message",
                            HasSubstr("not a reply of a server")));
    EXPECT_EQ(read().diagnostics.at(0).kind, Diagnostic::Kind::Damaged);
}

TEST_F(DhcpcdTest, AWirelessLeaseIsClaimedForEachPossibleInterface) {
    write("/var/lib/dhcpcd/wlan0-Net.lease", sample("dhcpcd-10/eth1.lease"));
    std::vector<std::optional<InterfaceName>> names;
    for (const Lease& found : read().leases) {
        names.push_back(found.interfaceName);
    }
    EXPECT_THAT(names, ElementsAre("wlan0-Net"_name, "wlan0"_name));
}

TEST_F(DhcpcdTest, AFileThatOthersCouldHaveWrittenIsNotBelieved) {
    write("/var/lib/dhcpcd/eth1.lease", sample("dhcpcd-10/eth1.lease"));
    ZR::Testing::letOthersWrite(root_, "/var/lib/dhcpcd/eth1.lease");
    ZR::Testing::expectNoLeaseButADiagnostic(read());
}

/// A machine on which dhcpcd runs, as its processes and its file say.
class RunningDhcpcdTest : public DhcpcdTest {
  protected:
    static constexpr const char* leaseFile = "/var/lib/dhcpcd/eth1.lease";
    static constexpr const char* ofLease = "198.51.100.121";

    /// A main process 7 with a proxy 8 and its helpers from 9 on.
    void run(const std::string& main, const std::vector<std::string>& helpers = {}) const {
        add(7, 1, "dhcpcd: " + main, "8 ");
        std::string children;
        int pid = 9;
        for (const std::string& helper : helpers) {
            children += std::to_string(pid) + ' ';
            add(pid++, 8, "dhcpcd: " + helper, "");
        }
        add(8, 7, "dhcpcd: [privileged proxy]", children);
    }
    void configure(const std::string& text) const { root_.write("/etc/dhcpcd.conf", text); }
    void lease() const { write(leaseFile, sample("dhcpcd-10/eth1.lease")); }

    /// The facts when that main process, and no other, was found to run.
    [[nodiscard]] ClientFacts seen(ClientProcess found) const {
        found.pid = 7;
        return read({std::move(found)});
    }
    [[nodiscard]] ClientFacts named() const { return seen(dhcpcdProcess({"eth1"_name})); }
    [[nodiscard]] ClientFacts ofAll() const { return seen(dhcpcdProcess({})); }

    /// "4", "6" or both: under which protocols a link of the facts is.
    static std::string protocols(const ClientFacts& facts) {
        std::string found;
        for (const ClientProcess& process : facts.processes) {
            EXPECT_THAT(process.interfaces, ElementsAre("eth1"_name));
            EXPECT_EQ(process.pid, 7);
            found += process.ipv6 ? '6' : '4';
        }
        return found;
    }
    /// The address that it was told, with "inform" where it asks for the rest.
    static std::string told(const ClientFacts& facts) {
        if (facts.managements.size() != 1) {
            return std::to_string(facts.managements.size()) + " managements";
        }
        const LinkConfiguration& found = facts.managements.front();
        EXPECT_EQ(found.client, Client::Dhcpcd);
        EXPECT_EQ(found.interfaceName, "eth1"_name);
        EXPECT_EQ(found.staticAddresses.size(), 1U);
        return found.staticAddresses.front().text() + (found.dhcp4 == true ? " inform" : "");
    }

  private:
    void add(int pid, int parent, const std::string& title, const std::string& children) const {
        const std::string place = "/proc/" + std::to_string(pid);
        root_.write(place + "/cmdline", title + std::string(20, '\0'));
        root_.write(place + "/status",
                    "Name:\tdhcpcd\nPPid:\t" + std::to_string(parent) + "\nUid:\t0\n");
        root_.write(place + "/task/" + std::to_string(pid) + "/children", children);
    }
};

TEST_F(RunningDhcpcdTest, OneOfALinkHasItUnderDhcpFromItsStart) {
    run("eth1 [ip4]");
    EXPECT_EQ(protocols(named()), "4");
    run("eth1 [ip4] [ip6]");
    EXPECT_EQ(protocols(named()), "4");
    run("eth1 [ip6]");
    EXPECT_EQ(protocols(seen(dhcpcdProcess({"eth1"_name}, true))), "6");
}

TEST_F(RunningDhcpcdTest, BesideDhcpV4OnlyALeaseShowsThatDhcpV6IsUsed) {
    write("/var/lib/dhcpcd/eth1.lease6", sample("dhcpcd-10/eth1.lease6"));
    run("eth1 [ip4] [ip6]");
    EXPECT_EQ(protocols(named()), "46");
    EXPECT_TRUE(named().leases.at(0).clientAlive);
    EXPECT_EQ(named().leases.at(0).pid, 7);
    run("eth1 [ip4]");
    EXPECT_EQ(protocols(named()), "4");
    EXPECT_FALSE(named().leases.at(0).clientAlive);
    run("eth1 [ip4] [ip6]");
    configure("nodhcp6\n");
    EXPECT_EQ(protocols(named()), "4");
}

TEST_F(RunningDhcpcdTest, OneOfAllLinksHasThoseWhereItAsksOrHasLeases) {
    run("[manager] [ip4] [ip6]");
    EXPECT_EQ(protocols(ofAll()), "");
    run("[manager] [ip4] [ip6]", {"[network proxy]", "[BPF BOOTP] eth1"});
    EXPECT_EQ(protocols(ofAll()), "4");
    run("[manager] [ip4] [ip6]");
    lease();  // the cable may be out
    EXPECT_EQ(protocols(ofAll()), "4");
    EXPECT_TRUE(ofAll().leases.at(0).clientAlive);
}

TEST_F(RunningDhcpcdTest, WhatIsLeftOfItWhenItAsksNowhereIsAManager) {
    run("[manager] [ip4] [ip6]");
    EXPECT_THAT(ofAll().managers,
                ElementsAre(ManagerProcess{
                    .client = Client::Dhcpcd, .where = ManagerProcess::Where::Here, .pid = 7}));
}

TEST_F(RunningDhcpcdTest, AnAddressThatNoServerGaveItWasTold) {
    // As with -S on its command line, of which nothing is left.
    run("eth1 [ip4]", {"[BPF ARP] eth1 198.51.100.9"});
    EXPECT_EQ(protocols(named()), "");
    EXPECT_EQ(told(named()), "198.51.100.9");
    lease();  // of former days
    EXPECT_EQ(protocols(named()), "");
    EXPECT_FALSE(named().leases.at(0).clientAlive);
    run("[manager] [ip4]", {"[BPF ARP] eth1 198.51.100.9"});
    EXPECT_EQ(protocols(ofAll()), "");
    EXPECT_EQ(told(ofAll()), "198.51.100.9");
}

TEST_F(RunningDhcpcdTest, TheAddressOfALeaseWasNotTold) {
    lease();
    run("eth1 [ip4]", {std::string{"[BPF ARP] eth1 "} + ofLease});
    EXPECT_EQ(protocols(named()), "4");
    EXPECT_THAT(named().managements, IsEmpty());
    configure("interface eth1\nstatic ip_address=198.51.100.9/24\n");  // and not read again
    EXPECT_EQ(protocols(named()), "4");
}

TEST_F(RunningDhcpcdTest, WhileItAsksAnAddressOfTheLinkAloneTellsNothing) {
    run("eth1 [ip4]", {"[BPF ARP] eth1 169.254.3.7"});
    EXPECT_EQ(protocols(named()), "4");
    run("eth1 [ip4]", {"[BPF ARP] eth1 198.51.100.9", "[BPF BOOTP] eth1"});
    EXPECT_EQ(protocols(named()), "4");
}

TEST_F(RunningDhcpcdTest, OneThatInformsHasAnAddressThatItWasTold) {
    run("eth1 [ip4]", {"[BPF ARP] eth1 198.51.100.9", "[network proxy] 198.51.100.9"});
    EXPECT_EQ(protocols(named()), "4");
    EXPECT_EQ(told(named()), "198.51.100.9 inform");
    configure("inform 198.51.100.9/24\n");
    run("[manager] [ip4]", {"[BPF ARP] eth1 198.51.100.9"});
    EXPECT_EQ(protocols(ofAll()), "4");
    EXPECT_EQ(told(ofAll()), "198.51.100.9 inform");
}

TEST_F(RunningDhcpcdTest, ItsFileKeepsLinksOutOfDhcp) {
    lease();  // of former days
    run("[manager] [ip4] [ip6]");
    for (const char* text :
         {"denyinterfaces wlan0 eth*\n", "allowinterfaces wlan*\n", "nodhcp\n", "noipv4\n",
          "ipv6only\n", "interface eth1\nstatic ip_address=198.51.100.9/24\n"}) {
        configure(text);
        EXPECT_EQ(protocols(ofAll()), "") << text;
    }
    for (const char* text : {"denyinterfaces eth2\n", "allowinterfaces eth1,eth2\n",
                             "interface eth2\nstatic ip_address=198.51.100.9/24\n", ""}) {
        configure(text);
        EXPECT_EQ(protocols(ofAll()), "4") << text;
    }
    EXPECT_THAT(ofAll().places, testing::Contains(WatchedPlace{root_.path("/etc"), "dhcpcd.conf"}));
}

TEST_F(RunningDhcpcdTest, AFileWrittenSinceItsStartIsNotTakenForApplied) {
    run("eth1 [ip4]");
    configure("interface eth1\nstatic ip_address=198.51.100.9/24\n");
    root_.write("/run/dhcpcd/eth1-4.pid", "7\n");
    root_.age("/run/dhcpcd/eth1-4.pid", 2'000);
    root_.age("/etc/dhcpcd.conf", 1'000);
    EXPECT_EQ(protocols(named()), "");
    root_.age("/etc/dhcpcd.conf", 3'000);
    EXPECT_EQ(protocols(named()), "4");
}

TEST_F(RunningDhcpcdTest, BeforeItHasATitleItsCommandLineTells) {
    const auto started = [&](const std::string& line) {
        root_.write("/proc/7/cmdline", line);
        return protocols(named());
    };
    using namespace std::string_literals;
    EXPECT_EQ(started("dhcpcd\0eth1\0"s), "4");
    EXPECT_EQ(started("dhcpcd\0-S\0ip_address=198.51.100.9/24\0eth1\0"s), "");
    EXPECT_EQ(started("dhcpcd\0--nodhcp\0eth1\0"s), "");
    EXPECT_EQ(started("dhcpcd\0-Z\0eth1\0eth1\0"s), "");
    EXPECT_EQ(started("dhcpcd\0-f\0/etc/other.conf\0eth1\0"s), "4");
    root_.write("/etc/other.conf", "nodhcp\n");
    EXPECT_EQ(started("dhcpcd\0-f\0/etc/other.conf\0eth1\0"s), "");
}

TEST_F(RunningDhcpcdTest, WithoutItsHelpersOneOfAllLinksStaysOne) {
    root_.write("/proc/7/cmdline", "dhcpcd: [manager] [ip4]");
    EXPECT_THAT(ofAll().processes, testing::SizeIs(1));
    EXPECT_THAT(ofAll().processes.at(0).interfaces, IsEmpty());
}

DhcpcdSettings of(std::string_view text) {
    DhcpcdSettings settings;
    applyDhcpcdConf(text, "eth1"_name, settings);
    return settings;
}

TEST(DhcpcdConf, WithoutASettingBothProtocolsAreUsed) {
    EXPECT_EQ(of(""), DhcpcdSettings{});
    EXPECT_EQ(of("# nodhcp\n; nodhcp\nhostname\n\n   \noption domain_name_servers\n"),
              DhcpcdSettings{});
    EXPECT_TRUE(of("").asks4());
    EXPECT_TRUE(of("").asks6());
}

TEST(DhcpcdConf, SettingsOfAllLinksStandBeforeThoseOfOne) {
    EXPECT_FALSE(of("nodhcp\ninterface eth2\n").asks4());
    EXPECT_TRUE(of("nodhcp\ninterface eth1\ndhcp\n").asks4());
    EXPECT_TRUE(of("interface eth2\nnodhcp\n").asks4());
    EXPECT_FALSE(of("interface eth2\nhostname\ninterface eth1\n  nodhcp  \n").asks4());
    // It knows no patterns here.
    EXPECT_TRUE(of("interface eth*\nnodhcp\n").asks4());
}

TEST(DhcpcdConf, WhatHoldsForANetworkOrAProfileIsLeftOut) {
    EXPECT_TRUE(of("ssid office\nstatic ip_address=192.0.2.7/24\n").asks4());
    EXPECT_TRUE(of("profile rescue\nstatic ip_address=192.0.2.7/24\n").asks4());
}

TEST(DhcpcdConf, AnAddressThatItIsToldEndsTheAsking) {
    const DhcpcdSettings found = of("static ip_address=192.0.2.7/24\n");
    EXPECT_FALSE(found.asks4());
    EXPECT_TRUE(found.asks6());
    EXPECT_EQ(found.address, "192.0.2.7"_ip);
    EXPECT_TRUE(of("static routers=192.0.2.1\n").asks4());
}

TEST(DhcpcdConf, WithAnAddressToInformOfItAsksForTheRest) {
    const DhcpcdSettings found = of("inform 192.0.2.7/24\n");
    EXPECT_TRUE(found.asks4());
    EXPECT_TRUE(found.inform);
    EXPECT_EQ(found.address, "192.0.2.7"_ip);
    EXPECT_EQ(of("inform\n").address, std::nullopt);
    EXPECT_FALSE(of("inform\nstatic ip_address=192.0.2.7/24\n").asks4());
}

TEST(DhcpcdConf, ProtocolsCanBeLeftOut) {
    EXPECT_FALSE(of("noipv4\n").asks4());
    EXPECT_FALSE(of("noipv6\n").asks6());
    EXPECT_FALSE(of("ipv4only\n").asks6());
    EXPECT_FALSE(of("ipv6only\n").asks4());
    EXPECT_TRUE(of("ipv6only\n").asks6());
    EXPECT_FALSE(of("nodhcp6\n").asks6());
    EXPECT_TRUE(of("nodhcp6\n").asks4());
}

TEST(DhcpcdConf, LinksAreNamedByPatterns) {
    const auto admits = [](std::string_view text) { return of(text).admits("eth1"_name); };
    EXPECT_TRUE(admits(""));
    EXPECT_FALSE(admits("denyinterfaces wlan0\tet?1\n"));
    EXPECT_FALSE(admits("allowinterfaces wlan*\n"));
    EXPECT_TRUE(admits("allowinterfaces wlan*\nallowinterfaces eth1\n"));
    EXPECT_FALSE(admits("allowinterfaces eth1\ndenyinterfaces eth[0-9]\n"));
}

}  // namespace
}  // namespace ZR::Live
