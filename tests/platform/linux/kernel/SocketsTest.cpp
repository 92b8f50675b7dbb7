#include "kernel/Sockets.h"

#include <arpa/inet.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <linux/if_ether.h>
#include <sys/socket.h>

#include "LinuxSupport.h"
#include "kit/Diagnostics.h"
#include "kit/Namespaces.h"
#include "zrcommon/UniqueFd.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

TEST(UdpSockets, OnlyThoseOfTheClientPort) {
    EXPECT_THAT(
        parseUdpSockets(
            "   sl  local_address rem_address   st tx_queue rx_queue tr tm->when retrnsmt   uid\n"
            "  142: " +
            asTheKernelPrints({198, 51, 100, 7}) + ":0044 " + asTheKernelPrints({198, 51, 100, 1}) +
            ":0043 01 00000000:00000000 00:00000000 00000000     0\n"
            "  143: 00000000:0044 00000000:0000 07 00000000:00000000 00:00000000 00000000  1000\n"
            "  144: 00000000:0043 00000000:0000 07 00000000:00000000 00:00000000 00000000     0\n"),
        ElementsAre(PortSocket{.address = "198.51.100.7"_ip, .peer = "198.51.100.1"_ip},
                    PortSocket{.address = {}, .peer = {}, .user = 1000}));
}

TEST(UdpSockets, AnyTextGivesFacts) {
    for (const char* text :
         {"", "\n\n", "1: 2 3", "1: 2:45 3:4", "1: x:0044 0:0", "1: 00000000:0044",
          "1: 100000000:0044 00000000:0000", "1: 00000000:0044 00000000:0000 07 0:0 0:0 0",
          "1: 00000000:0044 00000000:0000 07 0:0 0:0 0 x"}) {
        EXPECT_THAT(parseUdpSockets(text), IsEmpty()) << text;
    }
}

TEST(PacketSockets, ThoseThatHearIPv4OnALink) {
    EXPECT_THAT(
        parsePacketSockets("sk       RefCnt Type Proto  Iface R Rmem   User   Inode\n"
                           "0000000000000000 3      3    0003   2     1 0      0      1\n"
                           "0000000000000000 3      3    0800   3     1 0      0      2\n"
                           "0000000000000000 3      3    0003   2     1 0      0      3\n"
                           "0000000000000000 3      3    88cc   4     1 0      0      4\n"
                           "0000000000000000 3      3    0003   0     1 0      0      5\n"),
        ElementsAre(PacketSocket{.link = 2, .inode = 1}, PacketSocket{.link = 3, .inode = 2},
                    PacketSocket{.link = 2, .inode = 3}));
    EXPECT_THAT(parsePacketSockets("a b c 0003\n\nx\n0 3 3 0003 2 1 0 0 x\n"), IsEmpty());
}

TEST(Sockets, EachLinkOnceAndOnlyBesideABoundSocket) {
    const TemporaryDirectory root;
    const Roots roots{.files = root.path(), .proc = root.path("/proc")};
    root.write("/proc/thread-self/net/packet",
               "0 3 3 0003 2 1 0 0 1\n0 3 3 0003 3 1 0 0 2\n0 3 3 0003 2 1 0 0 3\n");
    std::vector<ZR::Diagnostic> diagnostics;
    EXPECT_THAT(readSockets(roots, diagnostics).packetLinks, IsEmpty());
    root.write("/proc/thread-self/net/udp", "1: 00000000:0044 00000000:0000 07 0:0 0:0 0 0\n");
    EXPECT_THAT(readSockets(roots, diagnostics).packetLinks, ElementsAre(2, 3));
    EXPECT_THAT(
        readSockets(roots, diagnostics).packets,
        ElementsAre(PacketSocket{.link = 2, .inode = 1}, PacketSocket{.link = 3, .inode = 2},
                    PacketSocket{.link = 2, .inode = 3}));
    EXPECT_THAT(ZR::Testing::textsOf(diagnostics), IsEmpty());
}

TEST(Sockets, WhereEveryUserMayBindThePortOnlyClientsAreBelieved) {
    const TemporaryDirectory root;
    const Roots roots{.files = root.path(), .proc = root.path("/proc")};
    root.write("/proc/thread-self/net/udp",
               "1: 00000000:0044 00000000:0000 07 0:0 0:0 0 0\n"
               "2: 00000000:0044 00000000:0000 07 0:0 0:0 0 998\n"
               "3: 00000000:0044 00000000:0000 07 0:0 0:0 0 1000\n");
    const std::vector<uid_t> users{998};
    const auto found = [&](std::vector<ZR::Diagnostic>& diagnostics) {
        std::vector<uid_t> owners;
        for (const PortSocket& socket : readSockets(roots, diagnostics, users).bound) {
            owners.push_back(socket.user);
        }
        return owners;
    };
    for (const char* start : {"", "1024\n", "69\n"}) {
        if (*start != '\0') {
            root.write("/proc/sys/net/ipv4/ip_unprivileged_port_start", start);
        }
        std::vector<ZR::Diagnostic> diagnostics;
        EXPECT_THAT(found(diagnostics), ElementsAre(0, 998, 1000)) << start;
        EXPECT_THAT(ZR::Testing::textsOf(diagnostics), IsEmpty()) << start;
    }
    for (const char* start : {"68\n", "0\n"}) {
        root.write("/proc/sys/net/ipv4/ip_unprivileged_port_start", start);
        std::vector<ZR::Diagnostic> diagnostics;
        EXPECT_THAT(found(diagnostics), ElementsAre(0, 998)) << start;
        EXPECT_THAT(diagnostics,
                    ElementsAre(ZR::Diagnostic{"a socket of user 1000 on UDP port 68 is not "
                                               "trusted: every user may open one here",
                                               ZR::Diagnostic::Kind::Untrusted}));
    }
}

TEST(Sockets, WithoutAProcessFileSystemThereAreNone) {
    const TemporaryDirectory root;
    std::vector<ZR::Diagnostic> diagnostics;
    EXPECT_EQ(readSockets({.files = root.path(), .proc = root.path("/proc")}, diagnostics),
              ClientSockets{});
    EXPECT_THAT(ZR::Testing::textsOf(diagnostics), IsEmpty());
}

TEST(Sockets, OfARealKernel) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(30, [] {
        std::vector<ZR::Diagnostic> diagnostics;
        EXPECT_EQ(readSockets({}, diagnostics), ClientSockets{});

        run("ip link set lo up");
        const UniqueFd client{::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0)};
        const auto bindTo = [](const UniqueFd& socket, const char* text, std::uint16_t port,
                               auto call) {
            sockaddr_in address{};
            address.sin_family = AF_INET;
            address.sin_port = htons(port);
            ASSERT_EQ(::inet_pton(AF_INET, text, &address.sin_addr), 1);
            const auto* const generic =
                static_cast<const sockaddr*>(static_cast<const void*>(&address));
            ASSERT_EQ(call(socket.get(), generic, sizeof address), 0);
        };
        bindTo(client, "127.0.0.1", 68, ::bind);
        bindTo(client, "127.0.0.2", 67, ::connect);
        const UniqueFd listener{
            ::socket(AF_PACKET, SOCK_RAW | SOCK_CLOEXEC, htons(std::uint16_t{ETH_P_ALL}))};
        ASSERT_TRUE(listener);
        const ClientSockets sockets = readSockets({}, diagnostics);
        EXPECT_THAT(sockets.bound,
                    ElementsAre(PortSocket{.address = "127.0.0.1"_ip, .peer = "127.0.0.2"_ip}));
        EXPECT_THAT(sockets.packetLinks, IsEmpty()) << "it hears all links";
        EXPECT_THAT(ZR::Testing::textsOf(diagnostics), IsEmpty());

        ASSERT_EQ(::fchown(client.get(), 65534, 65534), 0);  // as if nobody had opened it
        EXPECT_EQ(readSockets({}, diagnostics).bound.at(0).user, 65534U);
        run("echo 68 > /proc/sys/net/ipv4/ip_unprivileged_port_start");
        EXPECT_THAT(readSockets({}, diagnostics).bound, IsEmpty());
        EXPECT_EQ(diagnostics.size(), 1U);
    }));
}

}  // namespace
}  // namespace ZR::Live
