// The live machine against a real kernel, in a network namespace of its own.

#include <arpa/inet.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <thread>

#include "LinuxSupport.h"
#include "LiveMachine.h"
#include "kit/Diagnostics.h"
#include "kit/Namespaces.h"
#include "zrclient/InstrumentationService.h"
#include "zrcommon/UniqueFd.h"
#include "zrlinux/LiveSource.h"

namespace ZR::Live {
namespace {

using NodeLexicon::Properties;
using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Not;

/// The kernel computes operational states by and by. Waits until it has done so.
void awaitState(const std::string& name, const std::string& state) {
    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds{10};
    while (run("ip -o link show " + name).find(" state " + state + ' ') == std::string::npos) {
        ASSERT_LT(std::chrono::steady_clock::now(), end) << name << " is never " << state;
        std::this_thread::sleep_for(std::chrono::milliseconds{5});
    }
}

/// A machine that is read only when it says that it changed, as the service does.
class Watched {
  public:
    const Snapshot& now() {
        if (source_->changed()) {
            tree_ = source_->read();
        }
        return *tree_;
    }
    bool changed() { return source_->changed(); }

  private:
    std::unique_ptr<SnapshotSource> source_ = openLiveSource();
    std::shared_ptr<const Snapshot> tree_;
};

TEST(Kernel, AMachineWithoutANameShowsItsInterfaces) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        ASSERT_EQ(::sethostname("", 0), 0);
        run("ip link add br0 type bridge");
        Watched machine;
        EXPECT_THAT(interfaceNames(machine.now()), ElementsAre("br0"));
        EXPECT_EQ(machine.now().find(0, Properties::Name)->value, PropertyValue{});
        EXPECT_THAT(ZR::Testing::textsOf(machine.now().diagnostics()),
                    Contains("the system has no name"));
    }));
}

TEST(Kernel, AMachineThatRestsAsksForNothing) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        const auto source = openLiveSource();
        static_cast<void>(source->read());
        const auto now = std::chrono::steady_clock::now();
        const ChangeSigns alone = source->signs();
        ASSERT_TRUE(alone.descriptor);
        ASSERT_TRUE(alone.askAt) << "a service processor may come";
        EXPECT_GT(*alone.askAt - now, std::chrono::seconds{50}) << "and nothing else, beside lo";
        run("ip link add br0 type bridge");
        while (source->changed()) {
            static_cast<void>(source->read());
        }
        const ChangeSigns linked = source->signs();
        ASSERT_TRUE(linked.askAt);
        EXPECT_LE(*linked.askAt - std::chrono::steady_clock::now(), std::chrono::milliseconds{1001})
            << "clients may come";
    }));
}

TEST(Kernel, WhoWaitsIsWokenByTheKernelAndByFiles) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(60, [] {
        InstrumentationService service(openLiveSource());
        InstrumentationService::Waiter waiter(service);
        auto known = waiter.next(nullptr);
        std::atomic<int> seen = 0;
        std::thread watching([&] {
            while (const auto next = waiter.next(known)) {
                known = next;
                ++seen;
            }
        });
        const auto wakes = [&](const char* command) {
            const int before = seen;
            run(command);
            const auto end = std::chrono::steady_clock::now() + std::chrono::seconds{10};
            while (seen == before && std::chrono::steady_clock::now() < end) {
                std::this_thread::sleep_for(std::chrono::milliseconds{2});
            }
            EXPECT_GT(seen, before) << command;
        };
        wakes("ip link add br0 type bridge");
        wakes("ip addr add 192.0.2.1/24 dev br0");
        wakes("mkdir -p /var/lib/dhcp && echo > /var/lib/dhcp/dhclient.leases");
        wakes("ip link del br0");
        waiter.stop();
        watching.join();
    }));
}

TEST(Kernel, EachChangeShowsInTheVeryNextRead) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        Watched machine;
        EXPECT_THAT(interfaceNames(machine.now()), IsEmpty());

        run("ip link add br0 type bridge");
        EXPECT_THAT(interfaceNames(machine.now()), ElementsAre("br0"));
        EXPECT_EQ(machine.now().node(interfaceNode(machine.now(), "br0")).description, "Bridge");
        EXPECT_EQ(valueOf(machine.now(), "br0", Properties::InterfaceState), number(0));
        EXPECT_EQ(valueOf(machine.now(), "br0", Properties::AddressSource), number(0));

        run("ip link set br0 up");
        awaitState("br0", "UNKNOWN");
        EXPECT_EQ(valueOf(machine.now(), "br0", Properties::InterfaceState), number(1));

        run("ip addr add 192.0.2.1/24 dev br0");
        EXPECT_EQ(valueOf(machine.now(), "br0", Properties::IPv4Address),
                  PropertyValue{"192.0.2.1"});
        EXPECT_EQ(valueOf(machine.now(), "br0", Properties::AddressSource), number(3));
        EXPECT_EQ(valueOf(machine.now(), "br0", Properties::DHCPEnabled), PropertyValue{false});

        run("ip addr change 192.0.2.1/24 dev br0 valid_lft 600 preferred_lft 600");
        EXPECT_EQ(valueOf(machine.now(), "br0", Properties::AddressSource), number(0));
        EXPECT_EQ(valueOf(machine.now(), "br0", Properties::DHCPEnabled), PropertyValue{})
            << "a client that is not known may have set it";
        EXPECT_EQ(valueOf(machine.now(), "br0", Properties::DHCPServerAddresses),
                  PropertyValue{std::vector<std::string>{}});

        run("ip addr del 192.0.2.1/24 dev br0");
        EXPECT_EQ(valueOf(machine.now(), "br0", Properties::IPv4Address), PropertyValue{});

        run("ip addr add 169.254.7.8/16 dev br0 scope link");
        EXPECT_EQ(valueOf(machine.now(), "br0", Properties::AddressSource), number(4));

        run("ip link set br0 name lan0");
        EXPECT_THAT(interfaceNames(machine.now()), ElementsAre("lan0"));

        run("ip link del lan0");
        EXPECT_THAT(interfaceNames(machine.now()), IsEmpty());
    }));
}

TEST(Kernel, EndsOfVirtualCablesAreInterfacesWhereTheyHaveAnAddress) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        Watched machine;
        run("ip link add inner type veth peer name outer");
        EXPECT_THAT(interfaceNames(machine.now()), IsEmpty());
        run("ip addr add 192.0.2.1/24 dev inner");
        EXPECT_THAT(interfaceNames(machine.now()), ElementsAre("inner"));
        EXPECT_EQ(machine.now().node(interfaceNode(machine.now(), "inner")).description,
                  "Virtual Ethernet interface");
        run("ip link set inner up");
        awaitState("inner", "LOWERLAYERDOWN");
        EXPECT_EQ(valueOf(machine.now(), "inner", Properties::InterfaceState), number(0));
        run("ip link set outer up");
        awaitState("inner", "UP");
        EXPECT_EQ(valueOf(machine.now(), "inner", Properties::InterfaceState), number(1));
        run("ip link add br0 type bridge");
        run("ip link set outer master br0");
        EXPECT_THAT(interfaceNames(machine.now()), Contains("inner"));
        EXPECT_THAT(interfaceNames(machine.now()), Not(Contains("outer")));
    }));
}

TEST(Kernel, LinksOfOtherKindsAreToldApart) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        run("ip link add br0 type bridge");
        run("ip link add link br0 name mac0 type macvlan");
        run("ip link set lo up");
        // A tunnel device with an address of its own stays out, too.
        run("ip tuntap add tap0 mode tap && ip addr add 192.0.2.9/24 dev tap0");
        const auto tree = openLiveSource()->read();
        EXPECT_THAT(interfaceNames(*tree), ElementsAre("br0", "mac0"));
        EXPECT_EQ(tree->node(interfaceNode(*tree, "mac0")).description, "MAC VLAN");
    }));
}

TEST(Kernel, PortsOfABridgeHaveNoDhcpOfTheirOwn) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        run("ip link add br0 type bridge && ip link add br1 type bridge");
        run("ip link add link br0 name mac0 type macvlan");
        run("ip addr add 192.0.2.5/24 dev mac0");
        run("printf 'ip=192.0.2.5\\nlease=600\\n' > /run/udhcpc.mac0.state");
        Watched machine;
        EXPECT_EQ(valueOf(machine.now(), "mac0", Properties::DHCPEnabled), PropertyValue{true});
        run("ip link set mac0 master br1");
        EXPECT_EQ(valueOf(machine.now(), "mac0", Properties::DHCPEnabled), PropertyValue{false});
        EXPECT_EQ(valueOf(machine.now(), "mac0", Properties::AddressSource), number(0));
        EXPECT_EQ(valueOf(machine.now(), "mac0", Properties::IPv4Address),
                  PropertyValue{"192.0.2.5"});
    }));
}

// Its process is not among those that are seen; the sockets are the kernel's.
TEST(Kernel, TheSocketOfAHiddenClientShowsUntilItIsClosed) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        // A link that is up has states that the kernel computes by and by. This one is not,
        // so that nothing but the socket changes.
        run("ip link add br0 type bridge && ip addr add 192.0.2.5/24 dev br0 && "
            "ip link set lo up && echo 1 > /proc/sys/net/ipv4/ip_nonlocal_bind");
        const TemporaryDirectory root;
        std::filesystem::create_directories(root.path("/proc"));
        std::filesystem::create_symlink("/proc/thread-self", root.path("/proc/thread-self"));
        Surroundings surroundings;
        surroundings.roots = {.files = root.path(), .proc = root.path("/proc")};
        surroundings.realProcesses = false;
        std::int64_t now = 1'800'000'000;
        surroundings.now = [&now] { return now; };
        LiveMachine machine{std::move(surroundings)};

        UniqueFd client{::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0)};
        const auto join = [&](auto call, const char* text, std::uint16_t port) {
            sockaddr_in address{};
            address.sin_family = AF_INET;
            address.sin_port = htons(port);
            ASSERT_EQ(::inet_pton(AF_INET, text, &address.sin_addr), 1);
            const auto* const generic =
                static_cast<const sockaddr*>(static_cast<const void*>(&address));
            ASSERT_EQ(call(client.get(), generic, sizeof address), 0) << text;
        };
        join(::bind, "192.0.2.5", 68);
        join(::connect, "127.0.0.1", 67);
        const auto tree = machine.read();
        EXPECT_EQ(valueOf(*tree, "br0", Properties::DHCPEnabled), PropertyValue{true});
        EXPECT_EQ(valueOf(*tree, "br0", Properties::DHCPServerAddresses),
                  PropertyValue{std::vector<std::string>{"127.0.0.1"}});
        EXPECT_FALSE(machine.changed());
        client.reset();
        ++now;  // it is looked once a second
        EXPECT_TRUE(machine.changed());
        EXPECT_EQ(valueOf(*machine.read(), "br0", Properties::DHCPEnabled), PropertyValue{false});
        EXPECT_FALSE(machine.changed());
    }));
}

TEST(Kernel, AnIdleMachineIsNotReadAgain) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        run("ip link add br0 type bridge");
        Watched machine;
        static_cast<void>(machine.now());
        for (int i = 0; i < 1000; ++i) {
            ASSERT_FALSE(machine.changed());
        }
    }));
}

TEST(Kernel, ReadingWhileLinksComeAndGoEndsInTheirFinalState) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(60, [] {
        std::atomic<bool> finished = false;
        std::thread others{[&] {
            for (int i = 0; i < 8; ++i) {
                run("ip link add c" + std::to_string(i) + " type bridge");
                if (i % 2 == 0) {
                    run("ip link del c" + std::to_string(i));
                }
            }
            finished = true;
        }};
        Watched machine;
        while (!finished) {
            static_cast<void>(machine.now());
        }
        others.join();
        EXPECT_EQ(interfaceNames(machine.now()).size(), 4U);
    }));
}

TEST(Kernel, ManyLinksAreReadWhole) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(60, [] {
        // More than fits into one datagram of a dump, so that it comes in many parts. As
        // many bridges would hold the whole machine up for seconds when they go.
        std::string batch = "link add b0 type bridge\n";
        for (int i = 1; i < 100; ++i) {
            const std::string name = "b" + std::to_string(i);
            batch += "link add " + name + " link b0 type macvlan mode bridge\n";
            batch += "addr add 10.0.0." + std::to_string(i) + "/32 dev " + name + "\n";
        }
        const TemporaryDirectory directory;
        directory.write("/batch", batch);
        run("ip -batch " + directory.path("/batch"));
        const auto source = openLiveSource();
        const auto tree = source->read();
        EXPECT_EQ(interfaceNames(*tree).size(), 100U);
        EXPECT_EQ(valueOf(*tree, "b99", Properties::IPv4Address), PropertyValue{"10.0.0.99"});
    }));
}

}  // namespace
}  // namespace ZR::Live
