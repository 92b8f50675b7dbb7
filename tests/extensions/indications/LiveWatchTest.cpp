// Leases and endpoints on the machine as its kernel and its DHCP client show it.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <algorithm>
#include <set>
#include <thread>

#include "WatchSupport.h"
#include "kit/Namespaces.h"

namespace watching {
namespace {

using testing::Contains;
using testing::IsEmpty;
using ZR::Live::passesInNamespaces;
using ZR::Live::run;

constexpr const char* client = "/usr/sbin/dhclient";
constexpr const char* server = "/usr/sbin/dnsmasq";

#define NEEDS_DHCP()                                                      \
    do {                                                                  \
        ZR_NEEDS_NAMESPACES();                                            \
        if (::access(client, X_OK) != 0 || ::access(server, X_OK) != 0) { \
            GTEST_SKIP() << "needs " << client << " and " << server;      \
        }                                                                 \
    } while (false)

/// A cable to another namespace with a DHCP server, and a client's directories.
class Cable {
  public:
    explicit Cable(const std::string& leaseTime) {
        run("mkdir -p /var/lib/dhcp");
        // The client's script would write a resolver configuration and run hooks.
        run("mount -t tmpfs tmpfs /etc/dhcp && mkdir /etc/dhcp/dhclient-enter-hooks.d && "
            "echo 'make_resolv_conf() { :; }' > /etc/dhcp/dhclient-enter-hooks.d/quiet");
        run("ip link add eth1 type veth peer name far netns " + far_.process());
        run("ip link set eth1 up");
        there("ip addr add 198.51.100.1/24 dev far");
        there("ip link set far up");
        there(std::string(server) +
              " --conf-file=/dev/null --user=root --port=0 --interface=far --bind-interfaces"
              " --no-ping --dhcp-authoritative --dhcp-leasefile=/run/server.leases"
              " --pid-file=/run/server.pid --log-facility=/run/server.log"
              " --dhcp-range=198.51.100.100,198.51.100.120,255.255.255.0," +
              leaseTime);
    }
    void there(const std::string& command) const {
        run("nsenter --net=/proc/" + far_.process() + "/ns/net " + command);
    }

  private:
    ZR::Live::OtherNamespace far_;
};

/// Waits until a line begins so; what came until then.
std::vector<std::string> until(Told& told, const std::string& beginning) {
    std::vector<std::string> lines;
    const auto end = std::chrono::steady_clock::now() + 20s;
    while (std::chrono::steady_clock::now() < end) {
        for (std::string& line : told.take()) {
            lines.push_back(std::move(line));
        }
        if (std::ranges::any_of(
                lines, [&](const std::string& line) { return line.starts_with(beginning); })) {
            return lines;
        }
        std::this_thread::sleep_for(10ms);
    }
    ADD_FAILURE() << "nothing begins with " << beginning << ": " << testing::PrintToString(lines);
    return lines;
}

TEST(LiveWatch, ALeaseIsToldFromItsBeginningToItsEnd) {
    NEEDS_DHCP();
    EXPECT_TRUE(passesInNamespaces(60, [] {
        const Cable cable("600s");
        cimom::ObjectManager manager(configuration());
        Told told;
        const auto active = subscribe(manager, "SELECT * FROM CIM_InstIndication", told);
        ASSERT_EQ(active.status, cimom::Status{});
        run(std::string(client) + " -1 -pf /run/client.pid eth1 < /dev/null");
        // When the client's script has ended, all signs have been given.
        const auto sign = std::chrono::steady_clock::now();
        until(told, "Creation ProtocolEndpoint eth1");
        std::this_thread::sleep_for(promised * underLoad);
        const auto delay = told.last() - sign;
        EXPECT_LT(delay, promised * underLoad);
        const std::vector<std::string> known = told.take();
        std::this_thread::sleep_for(1500ms);
        EXPECT_THAT(told.take(), IsEmpty()) << "a lease that rests is not told again";
        run(std::string(client) + " -r -pf /run/client.pid eth1 < /dev/null");
        const std::vector<std::string> end = until(told, "Deletion ProtocolEndpoint eth1");
        EXPECT_THAT(end, Contains(testing::StartsWith("Deletion Lease eth1")));
    }));
}

TEST(LiveWatch, ALinkThatGoesIsToldWithItsLease) {
    NEEDS_DHCP();
    EXPECT_TRUE(passesInNamespaces(60, [] {
        const Cable cable("600s");
        run(std::string(client) + " -1 -pf /run/client.pid eth1 < /dev/null");
        cimom::ObjectManager manager(configuration());
        Told told;
        const auto active = subscribe(manager, "SELECT * FROM CIM_InstDeletion", told);
        ASSERT_EQ(active.status, cimom::Status{});
        const auto sign = std::chrono::steady_clock::now();
        run("ip link del eth1");
        until(told, "Deletion ProtocolEndpoint eth1");
        EXPECT_LT(told.last() - sign, promised * underLoad);
    }));
}

/// What a client has left that has ended: a lease in its file, the address on the link.
std::string leftLease(const std::string& link, const std::string& address, int seconds) {
    return "echo 'lease { interface \"" + link + "\"; fixed-address " + address +
           "; option dhcp-server-identifier 198.51.100.1; expire '$(date -u -d '+" +
           std::to_string(seconds) + " seconds' '+%w %Y/%m/%d %T')'; }'";
}

TEST(LiveWatch, TheEndOfALeaseIsToldInTime) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(60, [] {
        cimom::ObjectManager manager(configuration());
        run("mkdir -p /var/lib/dhcp && ip link add eth1 type bridge && ip link set eth1 up && "
            "ip addr add 198.51.100.7/24 dev eth1 valid_lft 4 preferred_lft 4 && " +
            leftLease("eth1", "198.51.100.7", 4) + " > /var/lib/dhcp/dhclient.eth1.leases");
        Told told;
        const auto active = subscribe(manager, "SELECT * FROM CIM_InstIndication", told);
        ASSERT_EQ(active.status, cimom::Status{});
        until(told, "Deletion Lease eth1");
        // The kernel and the file each tell the end of their own, within a second.
        std::this_thread::sleep_for(2s);
        static_cast<void>(told.take());
        std::this_thread::sleep_for(1200ms);
        EXPECT_THAT(told.take(), IsEmpty());
    }));
}

TEST(LiveWatch, AThousandLinksAtOnceAreAllTold) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(110, [] {
        constexpr int links = 1000;
        cimom::ObjectManager manager(configuration());
        Told told;
        const auto active = subscribe(manager,
                                      "SELECT * FROM CIM_InstCreation WHERE SourceInstance ISA "
                                      "QVXZR_DHCPLease",
                                      told);
        ASSERT_EQ(active.status, cimom::Status{});
        run("mkdir -p /var/lib/dhcp; for i in $(seq " + std::to_string(links) +
            "); do echo \"lease { interface \\\"d$i\\\"; fixed-address "
            "10.1.$((i / 250)).$((1 + i % 250)); option dhcp-server-identifier 198.51.100.1; "
            "expire 5 2038/01/01 00:00:00; }\"; done > /var/lib/dhcp/dhclient.leases");
        run("for i in $(seq " + std::to_string(links) +
            "); do echo link add d$i type bridge; echo link set d$i up; echo addr add "
            "10.1.$((i / 250)).$((1 + i % 250))/32 dev d$i; "
            "done > /run/links && ip -batch /run/links");
        const auto end = std::chrono::steady_clock::now() + 60s;
        while (told.all().size() < links && std::chrono::steady_clock::now() < end) {
            std::this_thread::sleep_for(50ms);
        }
        std::this_thread::sleep_for(1200ms);
        const std::vector<std::string> lines = told.take();
        EXPECT_EQ(lines.size(), static_cast<std::size_t>(links));
        EXPECT_EQ(std::set<std::string>(lines.begin(), lines.end()).size(), lines.size());
    }));
}

}  // namespace
}  // namespace watching
