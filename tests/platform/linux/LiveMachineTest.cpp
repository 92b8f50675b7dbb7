// Files laid out in a directory, and prepared responses in place of the kernel's: the
// whole way from bytes to nodes, for states that no test machine can be put into.
// KernelTest.cpp and DhcpLifeTest.cpp go the same way with a real kernel and clients.

#include "LiveMachine.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <linux/if_addr.h>

#include <array>
#include <memory>

#include "LinuxSupport.h"
#include "ScriptedTransport.h"
#include "StateReaders.h"
#include "kit/Diagnostics.h"
#include "kit/HostNameFake.h"
#include "zrcommon/BuiltSources.h"
#include "zrcommon/SystemName.h"
#include "zrlinux/LiveSource.h"

namespace ZR::Live {
namespace {

using NodeLexicon::Properties;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

using Servers = std::vector<std::string>;

class LiveMachineTest : public testing::Test {
  protected:
    static std::vector<Step> links(int count) {
        std::vector<Message> messages;
        for (int i = 1; i <= count; ++i) {
            Message message = linkMessage(i + 1, "eth" + std::to_string(i), 0x11043);
            message.number(IFLA_OPERSTATE, std::uint8_t{6});
            messages.push_back(message);
        }
        messages.emplace_back(NLMSG_DONE, std::uint16_t{NLM_F_MULTI}, std::int32_t{0});
        return {Step{messages}};
    }
    static std::vector<Step> address(unsigned ifindex, std::array<std::uint8_t, 4> bytes) {
        return {Step{
            {addressMessage(ifindex, bytes), Message{NLMSG_DONE, NLM_F_MULTI, std::int32_t{0}}}}};
    }
    static std::vector<Step> refused(int error) {
        nlmsgerr response{};
        response.error = -error;
        return {Step{{Message{NLMSG_ERROR, 0, response}}}};
    }

    /// An address with an end.
    static std::vector<Step> lasting(unsigned ifindex, std::array<std::uint8_t, 4> bytes,
                                     std::uint32_t seconds) {
        Message message = addressMessage(ifindex, bytes, 0);
        message.number(
            IFA_CACHEINFO,
            ifa_cacheinfo{.ifa_prefered = seconds, .ifa_valid = seconds, .cstamp = 0, .tstamp = 0});
        return {Step{{message, Message{NLMSG_DONE, NLM_F_MULTI, std::int32_t{0}}}}};
    }
    /// So many readings of one link with the same addresses.
    static std::deque<std::vector<Step>> readings(int count, const std::vector<Step>& addresses) {
        std::deque<std::vector<Step>> responses;
        for (int i = 0; i < count; ++i) {
            responses.push_back(links(1));
            responses.push_back(addresses);
        }
        return responses;
    }

    void startClient() {
        root_.write("/proc/17/comm", "udhcpc\n");
        root_.write("/proc/17/cmdline", std::string{"udhcpc\0-i\0eth1\0", 15});
        root_.write("/proc/17/status",
                    "Name:\tudhcpc\nState:\tS (sleeping)\nUid:\t0\t0\t0\t0\n"
                    "CapEff:\t000001ffffffffff\n");
        for (const char* process : {"17", "thread-self"}) {
            const std::string directory = root_.path("/proc/") + process + "/ns";
            std::filesystem::create_directories(directory);
            for (const char* space : {"net", "user"}) {
                if (!std::filesystem::exists(
                        std::filesystem::symlink_status(directory + '/' + space))) {
                    std::filesystem::create_symlink(std::string{space} + ":[1]",
                                                    directory + '/' + space);
                }
            }
        }
        root_.write("/proc/loadavg", "0.10 0.20 0.30 1/100 17\n");
    }

    LiveMachine& open(std::deque<std::vector<Step>> responses, Watch watch = Watch::Yes) {
        Surroundings surroundings;
        surroundings.watch = watch;
        std::filesystem::create_directories(root_.path("/proc/thread-self/ns"));
        surroundings.roots = {.files = root_.path(), .proc = root_.path("/proc")};
        surroundings.transport = std::make_unique<ScriptedTransport>(std::move(responses));
        surroundings.realProcesses = false;
        surroundings.uptime = [this] { return uptime_; };
        surroundings.buses.networkd = [this](auto /*deadline*/) {
            ++asked_;
            return networkd_;
        };
        surroundings.now = [this] { return now_; };
        surroundings.report = [this](std::string_view text) { diagnostics_.emplace_back(text); };
        machine_ = std::make_unique<LiveMachine>(std::move(surroundings));
        return *machine_;
    }

    /// Makes networkd one of the machine's processes.
    void runNetworkd() const {
        root_.write("/proc/7/comm", "systemd-network\n");
        root_.write("/proc/7/status",
                    "Name:\tsystemd-network\nState:\tS (sleeping)\nPPid:\t1\n"
                    "Uid:\t0\t0\t0\t0\nCapEff:\t000001ffffffffff\n");
    }

    TemporaryDirectory root_;
    std::int64_t now_ = 1'795'216'200;
    std::chrono::steady_clock::time_point uptime_{std::chrono::hours{1000}};
    BusResponse networkd_;
    int asked_ = 0;
    std::vector<std::string> diagnostics_;
    std::unique_ptr<LiveMachine> machine_;
};

TEST_F(LiveMachineTest, CapturedNetworkdLeaseOnItsLink) {
    runNetworkd();
    root_.write("/run/systemd/netif/links/2", sample("networkd/run-systemd-netif-links-2.txt"));
    root_.write("/run/systemd/netif/leases/2", sample("networkd/run-systemd-netif-leases-2.txt"));
    root_.write("/etc/systemd/network/10-eth1.network", sample("networkd/10-eth1.network"));
    const auto tree = open({links(1), address(2, {198, 51, 100, 110})}).read();
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::DHCPEnabled), PropertyValue{true});
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::AddressSource), number(1));
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::DHCPServerAddresses),
              PropertyValue{Servers{"198.51.100.1"}});
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::IPv4Address), PropertyValue{"198.51.100.110"});
    EXPECT_THAT(diagnostics_, IsEmpty());
}

TEST_F(LiveMachineTest, NetworkdItselfTellsOfTheServerOfADhcpv6Lease) {
    runNetworkd();
    root_.write("/run/systemd/netif/links/2", sample("networkd/run-systemd-netif-links-2.txt"));
    networkd_.json = sample("networkd/networkctl-status-eth1.json");
    // The kernel of this test sets addresses without an end.
    for (std::size_t at = 0;
         (at = networkd_.json.find("ValidLifetimeUsec", at)) != std::string::npos;) {
        networkd_.json.replace(at, 1, "X");
    }
    ifaddrmsg info{};
    info.ifa_family = 10;
    info.ifa_prefixlen = 128;
    info.ifa_index = 2;
    Message longer{RTM_NEWADDR, NLM_F_MULTI, info};
    constexpr std::array<std::uint8_t, 16> bytes{0x20, 0x01, 0x0d, 0xb8, 0, 0x99, 0, 0,
                                                 0,    0,    0,    0,    0, 0,    1, 0xb2};
    longer.attribute(IFA_ADDRESS, std::as_bytes(std::span{bytes}));
    const std::vector<Step> both{Step{{addressMessage(2, {198, 51, 100, 110}), longer,
                                       Message{NLMSG_DONE, NLM_F_MULTI, std::int32_t{0}}}}};
    EXPECT_EQ(valueOf(*open({links(1), both}).read(), "eth1", Properties::DHCPServerAddresses),
              (PropertyValue{Servers{"198.51.100.1", "fe80::e0cb:10ff:feee:2799"}}));
}

TEST_F(LiveMachineTest, NetworkdIsAskedOnlyWhereItHasLinks) {
    static_cast<void>(open({links(1), address(2, {192, 0, 2, 1})}).read());
    EXPECT_EQ(asked_, 0);
}

TEST_F(LiveMachineTest, ANetworkdThatDoesNotRespondIsLeftAloneForAWhile) {
    runNetworkd();
    root_.write("/run/systemd/netif/links/2", sample("networkd/run-systemd-netif-links-2.txt"));
    root_.write("/run/systemd/netif/leases/2", sample("networkd/run-systemd-netif-leases-2.txt"));
    networkd_.reason = "too busy";
    std::deque<std::vector<Step>> responses;
    for (int i = 0; i < 4; ++i) {
        responses.push_back(links(1));
        responses.push_back(address(2, {198, 51, 100, 110}));
    }
    LiveMachine& machine = open(std::move(responses));
    EXPECT_EQ(valueOf(*machine.read(), "eth1", Properties::DHCPServerAddresses),
              PropertyValue{Servers{"198.51.100.1"}})
        << "its files tell it, too";
    EXPECT_THAT(diagnostics_, ElementsAre("too busy"));
    static_cast<void>(machine.read());
    EXPECT_EQ(asked_, 1);
    uptime_ += std::chrono::seconds{1};
    EXPECT_TRUE(machine.changed()) << "it is asked again";
    networkd_ = {.json = "{", .reason = ""};
    static_cast<void>(machine.read());
    EXPECT_EQ(asked_, 2);
    EXPECT_EQ(diagnostics_.back(), "cannot use what systemd-networkd says: not a JSON object");
}

TEST_F(LiveMachineTest, CapturedDhclientLeaseLivesUntilItsEnd) {
    root_.write("/var/lib/dhcp/dhclient.eth1.leases", sample("isc-dhclient/dhclient.eth1.leases"));
    const auto address = [](std::uint32_t seconds) {
        return lasting(2, {198, 51, 100, 106}, seconds);
    };
    LiveMachine& machine = open({links(1), address(581), links(1), address(1)});
    EXPECT_EQ(valueOf(*machine.read(), "eth1", Properties::DHCPServerAddresses),
              PropertyValue{Servers{"198.51.100.1"}});
    now_ = 1'795'216'781;
    EXPECT_EQ(valueOf(*machine.read(), "eth1", Properties::DHCPServerAddresses),
              PropertyValue{Servers{}});
}

TEST_F(LiveMachineTest, CapturedReleaseLeavesTheOtherInterfaceItsServer) {
    root_.write("/var/lib/dhcp/dhclient.leases",
                sample("isc-dhclient/dhclient.leases.two-interfaces-then-release-eth1"));
    std::vector<Step> both = lasting(3, {198, 51, 100, 122}, 584);
    both[0].messages.insert(both[0].messages.begin(),
                            lasting(2, {198, 51, 100, 106}, 500)[0].messages[0]);
    now_ = 1'795'216'234;
    const auto tree = open({links(2), both}).read();
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::DHCPServerAddresses), PropertyValue{Servers{}});
    EXPECT_EQ(valueOf(*tree, "eth2", Properties::DHCPServerAddresses),
              PropertyValue{Servers{"198.51.100.1"}});
}

TEST_F(LiveMachineTest, CapturedDhcpcdLeaseLivesUntilItsEnd) {
    root_.write("/var/lib/dhcpcd/eth1.lease", sample("dhcpcd-10/eth1.lease"));
    root_.age("/var/lib/dhcpcd/eth1.lease", now_);
    const auto leasedFor = [](std::uint32_t seconds) {
        return lasting(2, {198, 51, 100, 121}, seconds);
    };
    LiveMachine& machine = open({links(1), leasedFor(600), links(1), leasedFor(0)});
    EXPECT_EQ(valueOf(*machine.read(), "eth1", Properties::DHCPServerAddresses),
              PropertyValue{Servers{"198.51.100.1"}});
    now_ += 600;
    EXPECT_EQ(valueOf(*machine.read(), "eth1", Properties::DHCPServerAddresses),
              PropertyValue{Servers{}});
}

TEST_F(LiveMachineTest, CapturedNetworkManagerStateOnItsLink) {
    root_.write("/run/NetworkManager/devices/2",
                sample("networkmanager-internal/run-NetworkManager-devices-2.txt"));
    now_ = 1'795'216'300;
    const auto tree = open({links(1), lasting(2, {198, 51, 100, 109}, 316)}).read();
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::DHCPServerAddresses),
              PropertyValue{Servers{"198.51.100.1"}});
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::AddressSource), number(1));
}

TEST_F(LiveMachineTest, CapturedBootpAtTheStartOfTheSystem) {
    root_.write("/run/net-eth1.conf", sample("klibc-ipconfig/run-net-eth1.conf.bootp"));
    const auto tree = open({links(1), address(2, {203, 0, 113, 140})}).read();
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::AddressSource), number(2));
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::DHCPServerAddresses),
              PropertyValue{Servers{"203.0.113.1"}});
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::DHCPEnabled), PropertyValue{true})
        << "it obtained the address";
}

TEST_F(LiveMachineTest, WhatCannotBeReadIsARemark) {
    std::filesystem::create_directories(root_.path("/run/net-eth1.conf"));
    LiveMachine& machine =
        open({links(1), address(2, {192, 0, 2, 1}), links(1), address(2, {192, 0, 2, 1})});
    const auto tree = machine.read();
    ASSERT_EQ(tree->diagnostics().size(), 1U);
    EXPECT_THAT(tree->diagnostics()[0].text,
                HasSubstr("cannot read " + root_.path("/run/net-eth1.conf")));
    std::filesystem::remove_all(root_.path("/run/net-eth1.conf"));
    EXPECT_TRUE(machine.changed());
    EXPECT_THAT(ZR::Testing::textsOf(machine.read()->diagnostics()), IsEmpty());
}

TEST_F(LiveMachineTest, WhatCouldNotBeReadIsTriedAgain) {
    std::filesystem::create_directories(root_.path("/run/net-eth1.conf"));
    LiveMachine& machine = open({links(1), address(2, {192, 0, 2, 1}), links(1),
                                 address(2, {192, 0, 2, 1}), links(1), address(2, {192, 0, 2, 1})});
    ASSERT_EQ(machine.read()->diagnostics().size(), 1U);
    EXPECT_TRUE(machine.changed()) << "it may be over already";
    ASSERT_EQ(machine.read()->diagnostics().size(), 1U);
    EXPECT_FALSE(machine.changed()) << "it lasts";
    uptime_ += std::chrono::seconds{1};
    EXPECT_TRUE(machine.changed()) << "it may be over without a sign";
    ASSERT_EQ(machine.read()->diagnostics().size(), 1U);
    EXPECT_FALSE(machine.changed());
    EXPECT_EQ(diagnostics_.size(), 1U);
}

TEST_F(LiveMachineTest, WhatSeveralReadersCannotReadIsToldOnce) {
    // Leases of two clients lie there; a link to itself is nothing that can be read.
    const std::string place = root_.path("/var/lib/NetworkManager");
    std::filesystem::create_directories(root_.path("/var/lib"));
    std::filesystem::create_symlink(place, place);
    const auto tree = open({links(1), address(2, {192, 0, 2, 1})}).read();
    EXPECT_THAT(ZR::Testing::textsOf(tree->diagnostics()),
                testing::UnorderedElementsAre(HasSubstr("cannot read " + place),
                                              HasSubstr("cannot watch " + place)));
}

TEST_F(LiveMachineTest, TheComputerHasTheHostsName) {
    const auto tree = open({links(1), address(2, {192, 0, 2, 1})}).read();
    const auto* const name = tree->find(0, Properties::Name);
    ASSERT_NE(name, nullptr);
    EXPECT_EQ(name->value, PropertyValue{getSystemName()});
}

TEST_F(LiveMachineTest, AMachineThatDoesNotTellItsNameShowsItsInterfaces) {
    LiveMachine& machine =
        open({links(1), address(2, {192, 0, 2, 1}), links(1), address(2, {192, 0, 2, 1})});
    {
        const Testing::HostNameFails failing;
        const auto tree = machine.read();
        EXPECT_THAT(interfaceNames(*tree), ElementsAre("eth1"));
        EXPECT_EQ(tree->node(0).description, "Computer");
        EXPECT_EQ(tree->find(0, Properties::Name)->value, PropertyValue{});
        EXPECT_THAT(ZR::Testing::textsOf(tree->diagnostics()),
                    ElementsAre("the system does not tell its name: Bad address"));
        EXPECT_THAT(diagnostics_, ElementsAre("the system does not tell its name: Bad address"));
    }
    EXPECT_TRUE(machine.changed()) << "to be read again";
    EXPECT_EQ(machine.read()->find(0, Properties::Name)->value, PropertyValue{getSystemName()});
    EXPECT_FALSE(machine.changed());
}

TEST_F(LiveMachineTest, UnreadableLinksGiveNoInterfacesAndOneLine) {
    LiveMachine& machine = open({links(1), address(2, {192, 0, 2, 1}), refused(EPERM),
                                 refused(EPERM), links(1), address(2, {192, 0, 2, 1})});
    EXPECT_THAT(interfaceNames(*machine.read()), ElementsAre("eth1"));
    EXPECT_THAT(interfaceNames(*machine.read()), IsEmpty());
    EXPECT_THAT(diagnostics_, ElementsAre("network links: refused: Operation not permitted"));
    EXPECT_TRUE(machine.changed()) << "to be read again";
    EXPECT_THAT(interfaceNames(*machine.read()), IsEmpty());
    EXPECT_EQ(diagnostics_.size(), 1U) << "a lasting trouble is told once";
    EXPECT_THAT(interfaceNames(*machine.read()), ElementsAre("eth1"));
    EXPECT_FALSE(machine.changed());
}

TEST_F(LiveMachineTest, ATroubleThatReturnsIsToldAgain) {
    LiveMachine& machine =
        open({refused(EPERM), links(1), address(2, {192, 0, 2, 1}), refused(EPERM)});
    for (int i = 0; i < 3; ++i) {
        static_cast<void>(machine.read());
    }
    EXPECT_EQ(diagnostics_.size(), 2U);
}

TEST_F(LiveMachineTest, AKernelThatDoesNotRespondHoldsNoCallerUp) {
    LiveMachine& machine = open({links(1), address(2, {192, 0, 2, 1})});
    EXPECT_THAT(interfaceNames(*machine.read()), ElementsAre("eth1"));
    const auto tree = machine.read();
    EXPECT_THAT(interfaceNames(*tree), IsEmpty()) << "what was once read is not shown again";
    EXPECT_THAT(diagnostics_, ElementsAre(HasSubstr("network links: no response: ")));
    EXPECT_THAT(ZR::Testing::textsOf(tree->diagnostics()), testing::ElementsAreArray(diagnostics_));
    EXPECT_TRUE(machine.changed()) << "to be read again";
}

TEST_F(LiveMachineTest, InterruptedReadingsAreShownAndReadAgain) {
    const std::vector<Step> interrupted{
        Step{{linkMessage(2, "eth1", 0x11043, NLM_F_MULTI | NLM_F_DUMP_INTR),
              Message{NLMSG_DONE, NLM_F_MULTI, std::int32_t{0}}}}};
    LiveMachine& machine =
        open({interrupted, interrupted, interrupted, address(2, {192, 0, 2, 1})});
    EXPECT_THAT(interfaceNames(*machine.read()), ElementsAre("eth1"));
    EXPECT_TRUE(machine.changed());
}

// --- what nothing tells of

TEST_F(LiveMachineTest, TheEndOfALeaseIsAChange) {
    root_.write("/var/lib/dhcp/dhclient.eth1.leases", sample("isc-dhclient/dhclient.eth1.leases"));
    LiveMachine& machine = open(readings(3, lasting(2, {198, 51, 100, 106}, 581)));
    EXPECT_EQ(valueOf(*machine.read(), "eth1", Properties::DHCPServerAddresses),
              PropertyValue{Servers{"198.51.100.1"}});
    EXPECT_FALSE(machine.changed());
    now_ = 1'795'216'780;
    EXPECT_FALSE(machine.changed());
    now_ = 1'795'216'781;
    EXPECT_TRUE(machine.changed());
    EXPECT_TRUE(machine.changed()) << "until it is read";
    static_cast<void>(machine.read());
    EXPECT_FALSE(machine.changed());
}

TEST_F(LiveMachineTest, AClockThatWasSetBackIsAChange) {
    LiveMachine& machine = open(readings(2, address(2, {192, 0, 2, 1})));
    static_cast<void>(machine.read());
    EXPECT_FALSE(machine.changed());
    --now_;
    EXPECT_TRUE(machine.changed());
    static_cast<void>(machine.read());
    EXPECT_FALSE(machine.changed());
}

TEST_F(LiveMachineTest, AClientThatStartsShowsWithinASecond) {
    root_.write("/proc/loadavg", "0.10 0.20 0.30 1/100 16\n");
    LiveMachine& machine = open(readings(2, address(2, {192, 0, 2, 1})));
    static_cast<void>(machine.read());
    startClient();
    EXPECT_FALSE(machine.changed()) << "it is looked once a second";
    ++now_;
    EXPECT_TRUE(machine.changed());
    EXPECT_EQ(valueOf(*machine.read(), "eth1", Properties::DHCPEnabled), PropertyValue{true});
    ++now_;
    EXPECT_FALSE(machine.changed());
}

TEST_F(LiveMachineTest, AClientThatBecomesOneAfterItStartedShows) {
    root_.write("/proc/loadavg", "0.10 0.20 0.30 1/100 16\n");
    LiveMachine& machine = open(readings(2, address(2, {192, 0, 2, 1})));
    static_cast<void>(machine.read());
    root_.write("/proc/17/comm", "sh\n");
    root_.write("/proc/loadavg", "0.10 0.20 0.30 1/100 17\n");
    ++now_;
    EXPECT_FALSE(machine.changed());
    startClient();
    ++now_;
    EXPECT_TRUE(machine.changed());
}

TEST_F(LiveMachineTest, WhileNoProcessStartsNoneIsLookedAt) {
    root_.write("/proc/loadavg", "0.10 0.20 0.30 1/100 17\n");
    LiveMachine& machine = open(readings(2, address(2, {192, 0, 2, 1})));
    static_cast<void>(machine.read());
    ++now_;
    EXPECT_FALSE(machine.changed());
    startClient();
    ++now_;
    EXPECT_FALSE(machine.changed()) << "it was there without a new number";
    root_.write("/proc/loadavg", "0.20 0.20 0.30 1/100 18\n");
    ++now_;
    EXPECT_TRUE(machine.changed());
}

TEST_F(LiveMachineTest, ProcessesThatAreNotClientsAreNotAChange) {
    root_.write("/proc/loadavg", "0.10 0.20 0.30 1/100 16\n");
    LiveMachine& machine = open(readings(1, address(2, {192, 0, 2, 1})));
    static_cast<void>(machine.read());
    for (int process = 17; process < 20; ++process) {
        root_.write("/proc/" + std::to_string(process) + "/comm", "sh\n");
        root_.write("/proc/loadavg", "0.10 0.20 0.30 1/100 " + std::to_string(process) + "\n");
        ++now_;
        EXPECT_FALSE(machine.changed()) << process;
    }
}

TEST_F(LiveMachineTest, ASocketThatComesOrGoesShowsWithinASecond) {
    const std::string udp = "/proc/thread-self/net/udp";
    const std::string line = "1: " + asTheKernelPrints({192, 0, 2, 1}) + ":0044 " +
                             asTheKernelPrints({192, 0, 2, 99}) +
                             ":0043 01 00000000:00000000 00:00000000 00000000 0\n";
    LiveMachine& machine = open(readings(3, address(2, {192, 0, 2, 1})));
    root_.write(udp, line);
    EXPECT_EQ(valueOf(*machine.read(), "eth1", Properties::DHCPServerAddresses),
              PropertyValue{Servers{"192.0.2.99"}});
    EXPECT_FALSE(machine.changed());
    root_.write(udp, "");
    EXPECT_FALSE(machine.changed());
    ++now_;
    EXPECT_TRUE(machine.changed());
    EXPECT_EQ(valueOf(*machine.read(), "eth1", Properties::DHCPServerAddresses),
              PropertyValue{Servers{}});
    EXPECT_FALSE(machine.changed());
    // A client that asks for its first address has no socket of the other kind yet.
    root_.write("/proc/thread-self/net/packet",
                "sk RefCnt Type Proto Iface R Rmem User Inode\n0 3 3 0003 2 1 0 0 1\n");
    ++now_;
    EXPECT_TRUE(machine.changed());
}

TEST_F(LiveMachineTest, WhatIsOnlyToldIsNotTriedAgain) {
    root_.write("/etc/network/interfaces", "iface eth1 inet dhcp\n");
    LiveMachine& machine = open(readings(1, address(2, {192, 0, 2, 1})));
    EXPECT_THAT(ZR::Testing::textsOf(machine.read()->diagnostics()),
                ElementsAre(HasSubstr("asks for DHCP, and no client runs")));
    uptime_ += std::chrono::hours{1};
    EXPECT_FALSE(machine.changed());
    EXPECT_THAT(diagnostics_, IsEmpty()) << "nothing was wrong with the reading";
}

TEST_F(LiveMachineTest, WhatTheKernelAskedForAtItsStart) {
    root_.write("/proc/thread-self/net/pnp", "#PROTO: BOOTP\nbootserver 192.0.2.99\n");
    Message permanent = addressMessage(2, {192, 0, 2, 1});
    permanent.number(IFA_FLAGS, std::uint32_t{IFA_F_PERMANENT});
    const auto tree =
        open({links(1), {Step{{permanent, Message{NLMSG_DONE, NLM_F_MULTI, std::int32_t{0}}}}}})
            .read();
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::AddressSource), number(2));
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::DHCPServerAddresses),
              PropertyValue{Servers{"192.0.2.99"}});
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::DHCPEnabled), PropertyValue{true});
}

TEST_F(LiveMachineTest, AnAddressThatConnmanGotByDhcp) {
    root_.write("/proc/17/comm", "connmand\n");
    root_.write("/proc/17/status", "State:\tS\nUid:\t0\t0\t0\t0\n");
    root_.write("/var/lib/connman/ethernet_5254_cable/settings",
                "[ethernet_5254_cable]\nIPv4.method=dhcp\nIPv4.DHCP.LastAddress=192.0.2.1\n");
    LiveMachine& machine =
        open({links(1), address(2, {192, 0, 2, 1}), links(1), address(2, {192, 0, 2, 1})});
    const auto tree = machine.read();
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::AddressSource), number(1));
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::DHCPEnabled), PropertyValue{true});
    EXPECT_EQ(valueOf(*tree, "eth1", Properties::DHCPServerAddresses), PropertyValue{Servers{}});
    EXPECT_FALSE(machine.changed());
    root_.append("/var/lib/connman/ethernet_5254_cable/settings", "IPv4.method=manual\n");
    EXPECT_TRUE(machine.changed());
}

TEST_F(LiveMachineTest, BeforeItIsReadItCountsAsChanged) {
    EXPECT_TRUE(open({}).changed());
}

TEST_F(LiveMachineTest, UnwatchedItIsWhatItWasAtFirst) {
    LiveMachine& machine = open({links(1), address(2, {192, 0, 2, 1})}, Watch::No);
    EXPECT_TRUE(machine.changed());
    static_cast<void>(machine.read());
    startClient();
    now_ += 3600;
    uptime_ += std::chrono::hours(1);
    EXPECT_FALSE(machine.changed());
    EXPECT_THAT(diagnostics_, IsEmpty());
}

TEST_F(LiveMachineTest, EveryPlaceThatItReadsIsWatched) {
    runNetworkd();
    root_.write("/proc/17/comm", "dhclient\n");
    root_.write("/proc/17/status", "State:\tS\nUid:\t0\t0\t0\t0\n");
    root_.write("/proc/17/cmdline", std::string{"dhclient\0-lf\0/srv/own.leases\0eth1\0", 34});
    for (const char* process : {"17", "thread-self"}) {
        std::filesystem::create_directories(root_.path("/proc/") + process + "/ns");
        std::filesystem::create_symlink("net:[1]", root_.path("/proc/") + process + "/ns/net");
    }
    root_.write("/etc/network/interfaces", "source interfaces.d/*\n");
    root_.write("/run/systemd/netif/links/2",
                "ADMIN_STATE=configured\nNETWORK_FILE=/etc/systemd/network/a.network\n");
    std::deque<std::vector<Step>> responses;
    for (int i = 0; i < 100; ++i) {
        responses.push_back(links(1));
        responses.push_back(address(2, {192, 0, 2, 1}));
    }
    LiveMachine& machine = open(std::move(responses));
    static_cast<void>(machine.read());
    EXPECT_FALSE(machine.changed());
    std::vector<std::string> files{"/srv/own.leases", "/etc/systemd/network/a.network",
                                   "/run/systemd/network/a.network.d/a.conf",
                                   "/etc/network/interfaces.d/a"};
    for (const StateReader& reader : stateReaders()) {
        for (const StatePlace& place : reader.places) {
            files.push_back(std::string{place.directory} + '/' + std::string{place.namePrefix} +
                            "x");
        }
    }
    for (const std::string& file : files) {
        root_.write(file, "x");
        EXPECT_TRUE(machine.changed()) << file;
        static_cast<void>(machine.read());
        EXPECT_FALSE(machine.changed()) << file;
        root_.append(file, "y");
        EXPECT_TRUE(machine.changed()) << file;
        static_cast<void>(machine.read());
        EXPECT_FALSE(machine.changed()) << file;
    }
}

TEST_F(LiveMachineTest, WirelessDevicesAreDescribedAsSuch) {
    Message device = linkMessage(2, "wlan0", 0x11043);
    device.text(56, "0000:00:03.0");
    Message other = linkMessage(3, "eth0", 0x11043);
    other.text(56, "0000:00:04.0");
    std::filesystem::create_directories(root_.path("/sys/class/net/wlan0/phy80211"));
    const auto tree =
        open({{Step{{device, other, Message{NLMSG_DONE, NLM_F_MULTI, std::int32_t{0}}}}},
              address(2, {192, 0, 2, 1})})
            .read();
    EXPECT_EQ(tree->node(interfaceNode(*tree, "wlan0")).description, "Wireless interface");
    EXPECT_EQ(tree->node(interfaceNode(*tree, "eth0")).description, "Ethernet interface");
}

TEST(StateReaders, FilesOfWhatABuildDoesNotReadAreTold) {
    const TemporaryDirectory root;
    const Roots roots{.files = root.path(""), .proc = root.path("/proc")};
    constexpr std::array places{StatePlace{"/var/lib/none", ""}, StatePlace{"/run", "dhclient"}};
    const StateReader without{nullptr, places, Client::Dhclient};
    ClientFacts facts;
    root.write("/run/other", "");
    readState(without, roots, facts);
    EXPECT_THAT(ZR::Testing::textsOf(facts.diagnostics), IsEmpty());
    root.write("/run/dhclient.eth0.pid", "");
    readState(without, roots, facts);
    EXPECT_THAT(ZR::Testing::textsOf(facts.diagnostics),
                ElementsAre("this build does not read what is of dhclient, and there is " +
                            root.path("/run/dhclient.eth0.pid")));
}

TEST(StateReaders, AFullBuildHasAReaderOfEverything) {
    for (const StateReader& reader : stateReaders()) {
        EXPECT_NE(reader.read, nullptr);
    }
    EXPECT_EQ(Built::leftOut, "");
}

TEST(NoIpmiReader, TellsThatThereIsAServiceProcessor) {
    const TemporaryDirectory root;
    const NoIpmiReader reader{Roots{.files = root.path(""), .proc = root.path("/proc")}};
    std::vector<ZR::Diagnostic> diagnostics;
    EXPECT_EQ(reader.read(diagnostics), std::nullopt);
    EXPECT_THAT(ZR::Testing::textsOf(diagnostics), IsEmpty());
    root.write("/dev/ipmi/0", "");
    EXPECT_EQ(reader.read(diagnostics), std::nullopt);
    EXPECT_THAT(ZR::Testing::textsOf(diagnostics),
                ElementsAre("this build does not read service processors, and there is " +
                            root.path("/dev/ipmi/0")));
    EXPECT_FALSE(NoIpmiReader::changed());
}

TEST(LiveSource, ReadsThisMachine) {
    const auto source = openLiveSource();
    ASSERT_NE(source, nullptr);
    EXPECT_TRUE(source->changed());
    const auto tree = source->read();
    ASSERT_NE(tree, nullptr);
    EXPECT_EQ(tree->node(0).type, "ComputerSystem");
}

}  // namespace
}  // namespace ZR::Live
