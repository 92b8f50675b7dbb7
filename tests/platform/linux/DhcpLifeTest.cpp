// A real client and a real server on the two ends of a virtual cable.

#include <gtest/gtest.h>
#include <unistd.h>

#include <chrono>
#include <functional>
#include <thread>

#include "LinuxSupport.h"
#include "LiveMachine.h"
#include "kit/Namespaces.h"
#include "zrlinux/LiveSource.h"

namespace ZR::Live {
namespace {

using NodeLexicon::Properties;
using Servers = std::vector<std::string>;

constexpr const char* dhclient = "/usr/sbin/dhclient";
constexpr const char* dnsmasq = "/usr/sbin/dnsmasq";

bool eventually(const std::function<bool()>& condition) {
    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds{10};
    while (!condition()) {
        if (std::chrono::steady_clock::now() > end) {
            return false;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds{20});
    }
    return true;
}

#define ZR_NEEDS_DHCP()                                                      \
    do {                                                                     \
        if (::access(dhclient, X_OK) != 0 || ::access(dnsmasq, X_OK) != 0) { \
            GTEST_SKIP() << "needs " << dhclient << " and " << dnsmasq;      \
        }                                                                    \
    } while (false)

/// A cable whose far end, in another namespace, has a DHCP server; on the near end,
/// eth1, a client can run with nothing of this machine in its reach.
class Laboratory {
  public:
    explicit Laboratory(const char* leaseTime) {
        run("mkdir -p /var/lib/dhcp");
        // The client's script would write a resolver configuration and run hooks.
        run("mount -t tmpfs tmpfs /etc/dhcp && mkdir /etc/dhcp/dhclient-enter-hooks.d && "
            "echo 'make_resolv_conf() { :; }' > /etc/dhcp/dhclient-enter-hooks.d/quiet");
        run("ip link add eth1 type veth peer name far netns " + far_.process());
        run("ip link set eth1 up");
        const std::string there = "nsenter --net=/proc/" + far_.process() + "/ns/net ";
        run(there + "ip addr add 198.51.100.1/24 dev far");
        run(there + "ip link set far up");
        run(there + dnsmasq +
            " --conf-file=/dev/null --user=root --port=0 --interface=far --bind-interfaces"
            " --no-ping --dhcp-authoritative --dhcp-leasefile=/run/server.leases"
            " --pid-file=/run/server.pid --log-facility=/run/server.log"
            " --dhcp-range=198.51.100.100,198.51.100.120,255.255.255.0," +
            leaseTime);
    }

  private:
    OtherNamespace far_;
};

class Watched {
  public:
    explicit Watched(std::string link = "eth1") : link_(std::move(link)) {}

    PropertyValue operator[](Properties property) { return valueOf(tree(), link_, property); }

    const Snapshot& tree() {
        if (source_->changed()) {
            tree_ = source_->read();
        }
        return *tree_;
    }

  private:
    std::string link_;
    std::unique_ptr<SnapshotSource> source_ = openLiveSource();
    std::shared_ptr<const Snapshot> tree_;
};

/// Starts the client, which goes to the background with its lease. It writes its
/// process number only then, and it cannot be ended properly before.
void start(const std::string& options) {
    run(dhclient + std::string{" -1 -pf /run/client.pid "} + options + " eth1 < /dev/null");
    EXPECT_TRUE(eventually([] { return !File::read("/run/client.pid").value_or("").empty(); }));
}

/// The client's way through a lease: it starts, shows its lease, gives it back.
void liveThroughWith(const char* program, const std::string& startCommand,
                     const std::string& releaseCommand) {
    const Laboratory laboratory{"600s"};
    Watched eth1;
    EXPECT_EQ(eth1[Properties::DHCPServerAddresses], PropertyValue{Servers{}});
    run(startCommand);
    EXPECT_TRUE(eventually([&] {
        return eth1[Properties::DHCPServerAddresses] == PropertyValue{Servers{"198.51.100.1"}};
    })) << program;
    EXPECT_EQ(eth1[Properties::DHCPEnabled], PropertyValue{true});
    EXPECT_EQ(eth1[Properties::AddressSource], number(1));
    run(releaseCommand);
    EXPECT_TRUE(eventually([&] {
        return eth1[Properties::DHCPServerAddresses] == PropertyValue{Servers{}} &&
               eth1[Properties::IPv4Address] == PropertyValue{};
    })) << program;
}

void expectLeased(Watched& eth1) {
    EXPECT_TRUE(eventually([&] {
        return eth1[Properties::DHCPServerAddresses] == PropertyValue{Servers{"198.51.100.1"}};
    }));
    EXPECT_EQ(eth1[Properties::DHCPEnabled], PropertyValue{true});
    EXPECT_EQ(eth1[Properties::AddressSource], number(1));
    EXPECT_EQ(eth1[Properties::InterfaceState], number(1));
    const PropertyValue address = eth1[Properties::IPv4Address];
    const auto* const text = std::get_if<std::string>(&address);
    ASSERT_NE(text, nullptr);
    EXPECT_TRUE(text->starts_with("198.51.100.1")) << *text;
}

void liveThrough(const std::string& options, const char* leaseTime) {
    const Laboratory laboratory{leaseTime};
    Watched eth1;
    EXPECT_EQ(eth1[Properties::DHCPServerAddresses], PropertyValue{Servers{}});
    EXPECT_EQ(eth1[Properties::DHCPEnabled], PropertyValue{false});

    start(options);
    expectLeased(eth1);

    run(dhclient + std::string{" -r -pf /run/client.pid "} + options + " eth1 < /dev/null");
    EXPECT_TRUE(eventually(
        [&] { return eth1[Properties::DHCPServerAddresses] == PropertyValue{Servers{}}; }));
    EXPECT_TRUE(eventually([&] { return eth1[Properties::IPv4Address] == PropertyValue{}; }));
    EXPECT_TRUE(eventually([&] { return eth1[Properties::DHCPEnabled] == PropertyValue{false}; }));
    EXPECT_EQ(eth1[Properties::AddressSource], number(0));
}

TEST(DhcpLife, ALeaseShowsFromItsBeginningToItsRelease) {
    ZR_NEEDS_NAMESPACES();
    ZR_NEEDS_DHCP();
    EXPECT_TRUE(passesInNamespaces(30, [] { liveThrough("", "600s"); }));
}

TEST(DhcpLife, ALeaseInAFileOfTheClientsOwnChoiceShowsToo) {
    ZR_NEEDS_NAMESPACES();
    ZR_NEEDS_DHCP();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        run("mkdir /run/elsewhere");
        liveThrough("-lf /run/elsewhere/own.db", "600s");
    }));
}

TEST(DhcpLife, ALeaseOfDhcpcdShowsToo) {
    ZR_NEEDS_NAMESPACES();
    ZR_NEEDS_DHCP();
    if (::access("/usr/sbin/dhcpcd", X_OK) != 0) {
        GTEST_SKIP() << "needs dhcpcd";
    }
    EXPECT_TRUE(passesInNamespaces(60, [] {
        run("mkdir /var/lib/dhcpcd");
        liveThroughWith("dhcpcd",
                        "dhcpcd --nohook resolv.conf --noipv4ll --nodelay --noarp --nodev -4 -w "
                        "eth1 < /dev/null",
                        "dhcpcd -4 -k eth1 < /dev/null");
    }));
}

TEST(DhcpLife, ALeaseOfUdhcpcShowsWithItsServerWhereItsScriptTellsIt) {
    ZR_NEEDS_NAMESPACES();
    ZR_NEEDS_DHCP();
    if (::access("/usr/sbin/udhcpc", X_OK) != 0) {
        GTEST_SKIP() << "needs udhcpc";
    }
    EXPECT_TRUE(passesInNamespaces(60, [] {
        const TemporaryDirectory directory;
        directory.write("/script", R"(#!/bin/sh
case $1 in
    bound) ip address add "$ip/$mask" dev "$interface"
        printf 'ip=%s\nserverid=%s\nlease=%s\n' "$ip" "$serverid" "$lease" \
            >"/run/udhcpc.$interface.state" ;;
    deconfig) ip -4 address flush dev "$interface"; rm -f "/run/udhcpc.$interface.state" ;;
esac
)");
        const std::string script = directory.path("/script");
        run("chmod 755 " + script);
        liveThroughWith("udhcpc",
                        "udhcpc -i eth1 -b -p /run/udhcpc.pid -s " + script + " < /dev/null",
                        "kill -USR2 $(cat /run/udhcpc.pid)");
    }));
}

TEST(DhcpLife, AnInfiniteLeaseIsPermanentAndStillFromDhcp) {
    ZR_NEEDS_NAMESPACES();
    ZR_NEEDS_DHCP();
    EXPECT_TRUE(passesInNamespaces(30, [] { liveThrough("", "infinite"); }));
}

TEST(DhcpLife, AClientThatIsKilledLeavesItsLeaseAlive) {
    ZR_NEEDS_NAMESPACES();
    ZR_NEEDS_DHCP();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        const Laboratory laboratory{"600s"};
        start("");
        Watched eth1;
        expectLeased(eth1);
        run("kill -9 $(cat /run/client.pid)");
        EXPECT_EQ(eth1[Properties::AddressSource], number(1));
        EXPECT_EQ(eth1[Properties::DHCPServerAddresses], PropertyValue{Servers{"198.51.100.1"}});
        run("ip addr flush dev eth1 scope global");
        EXPECT_EQ(eth1[Properties::DHCPServerAddresses], PropertyValue{Servers{}});
        EXPECT_EQ(eth1[Properties::AddressSource], number(0));
        EXPECT_TRUE(eventually([&] {
            return eth1[Properties::DHCPEnabled] == PropertyValue{false};
        })) << "its end takes a moment";
    }));
}

TEST(DhcpLife, ALinkThatIsRenamedUnderItsClientKeepsIt) {
    ZR_NEEDS_NAMESPACES();
    ZR_NEEDS_DHCP();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        const Laboratory laboratory{"600s"};
        start("");
        run("ip link set eth1 name lan0");
        Watched lan0{"lan0"};
        EXPECT_EQ(lan0[Properties::DHCPEnabled], PropertyValue{true});
        EXPECT_EQ(lan0[Properties::DHCPServerAddresses], PropertyValue{Servers{"198.51.100.1"}});
        run("ip addr flush dev lan0 scope global");
        EXPECT_EQ(lan0[Properties::DHCPServerAddresses], PropertyValue{Servers{}});
        EXPECT_EQ(lan0[Properties::DHCPEnabled], PropertyValue{true}) << "it still listens";
        EXPECT_EQ(lan0[Properties::AddressSource], number(0));
        run("kill $(cat /run/client.pid)");
        EXPECT_TRUE(
            eventually([&] { return lan0[Properties::DHCPEnabled] == PropertyValue{false}; }));
    }));
}

TEST(DhcpLife, AClientThatAsksInVainOnAContainersCableShowsWithinASecond) {
    ZR_NEEDS_NAMESPACES();
    if (::access("/usr/sbin/udhcpc", X_OK) != 0) {
        GTEST_SKIP() << "needs udhcpc";
    }
    EXPECT_TRUE(passesInNamespaces(30, [] {
        const OtherNamespace far;
        run("echo 1 > /proc/sys/net/ipv6/conf/default/disable_ipv6");
        run("ip link add eth1 type veth peer name far netns " + far.process());
        run("ip link set eth1 up && nsenter --net=/proc/" + far.process() +
            "/ns/net ip link set far up");
        Watched eth1;
        EXPECT_EQ(interfaceNames(eth1.tree()), std::vector<std::string>{"eth1"});
        EXPECT_EQ(eth1[Properties::DHCPEnabled], PropertyValue{false});
        // It writes no file that tells of it.
        run("udhcpc -i eth1 -f -s /bin/true < /dev/null > /dev/null 2>&1 & echo $! > /run/pid");
        EXPECT_TRUE(
            eventually([&] { return eth1[Properties::DHCPEnabled] == PropertyValue{true}; }));
        EXPECT_EQ(eth1[Properties::AddressSource], number(0));
        const auto lease = eth1.tree().first(NodeLexicon::NodeType::DHCPLease);
        ASSERT_NE(lease, Snapshot::none);
        EXPECT_EQ(eth1.tree().find(lease, Properties::Address), nullptr);
        run("kill $(cat /run/pid)");
        EXPECT_TRUE(
            eventually([&] { return eth1[Properties::DHCPEnabled] == PropertyValue{false}; }));
    }));
}

}  // namespace
}  // namespace ZR::Live
