#include "clients/Dhcpcd.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>

#include "LinuxSupport.h"
#include "kit/Diagnostics.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

std::optional<ClientProcess> parse(std::vector<std::string_view> arguments) {
    return parseDhcpcdArguments(arguments);
}
ClientProcess process(std::vector<InterfaceName> interfaces, bool ipv6 = false) {
    return {.client = Client::Dhcpcd,
            .interfaces = std::move(interfaces),
            .leaseFile = "",
            .ipv6 = ipv6};
}

TEST(DhcpcdArguments, ARunningOneSaysWhatItDoes) {
    EXPECT_EQ(parse({"dhcpcd: eth1 [ip4] [ip6]"}), process({"eth1"_name}));
    EXPECT_EQ(parse({"dhcpcd: eth1 [ip6]"}), process({"eth1"_name}, true));
    EXPECT_EQ(parse({"dhcpcd: [manager] [ip4] [ip6]"}), process({}));
    EXPECT_EQ(parse({"dhcpcd: [master] [ip4]"}), process({}));
}

TEST(DhcpcdArguments, ItsHelpersAreNotClients) {
    for (const char* title :
         {"dhcpcd: [privileged proxy] eth1 [ip4] [ip6]", "dhcpcd: [network proxy] 198.51.100.7",
          "dhcpcd: [control proxy]", "dhcpcd: [BPF ARP] eth1 198.51.100.107", "dhcpcd: "}) {
        EXPECT_EQ(parse({title}), std::nullopt) << title;
    }
}

TEST(DhcpcdArguments, BeforeItSaysSoItsArgumentsTell) {
    EXPECT_EQ(parse({"dhcpcd"}), process({}));
    EXPECT_EQ(parse({"/usr/sbin/dhcpcd", "-q", "-t", "30", "--config", "/c", "-Bd", "eth1"}),
              process({"eth1"_name}));
    EXPECT_EQ(parse({"dhcpcd", "-6", "eth1", "eth2"}), process({"eth1"_name, "eth2"_name}, true));
    EXPECT_EQ(parse({}), std::nullopt);
}

TEST(DhcpcdArguments, ACommandToAnotherOneIsNotAClient) {
    for (const char* command : {"-k", "-x", "-n", "-U", "--release", "--exit", "--dumplease"}) {
        EXPECT_EQ(parse({"dhcpcd", command, "eth1"}), std::nullopt) << command;
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
    EXPECT_TRUE(alive(process({"eth1"_name})));
    EXPECT_TRUE(alive(process({})));
    EXPECT_FALSE(alive(process({"eth2"_name})));
    ClientProcess other = process({});
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
}

TEST_F(DhcpcdTest, AWirelessLeaseIsClaimedForEachPossibleInterface) {
    write("/var/lib/dhcpcd/wlan0-Net.lease", sample("dhcpcd-10/eth1.lease"));
    std::vector<std::optional<InterfaceName>> names;
    for (const Lease& found : read().leases) {
        names.push_back(found.interfaceName);
    }
    EXPECT_THAT(names, ElementsAre("wlan0-Net"_name, "wlan0"_name));
}

}  // namespace
}  // namespace ZR::Live
