#include "clients/DhclientLease.h"

#include <gtest/gtest.h>

#include "LinuxSupport.h"
#include "facts/Lease.h"

namespace ZR::Live {
namespace {

DhclientLease leaseOf(const std::string& interface, const std::string& address,
                      std::optional<std::int64_t> expires) {
    return {.ipv6 = false,
            .interfaceName = ZR::Live::interfaceName(interface),
            .addresses = {{.address = ipAddress(address), .expires = expires}},
            .server = "198.51.100.1"_ip};
}

std::optional<std::int64_t> expiryOf(const std::string& time) {
    const auto parsed = parseDhclientLeases(
        "lease { interface \"eth1\"; fixed-address 198.51.100.7; expire " + time + "; }");
    return parsed.at(0).addresses.at(0).expires;
}

TEST(DhclientLease, CapturedSingleLease) {
    EXPECT_EQ(parseDhclientLeases(sample("isc-dhclient/dhclient.eth1.leases")),
              (std::vector<DhclientLease>{leaseOf("eth1", "198.51.100.106", 1795216781)}));
}

TEST(DhclientLease, CapturedLeaseUnderIfupdown) {
    EXPECT_EQ(parseDhclientLeases(sample("ifupdown/dhclient.eth1.leases")),
              (std::vector<DhclientLease>{leaseOf("eth1", "198.51.100.106", 1795216956)}));
}

TEST(DhclientLease, CapturedInfiniteLeaseEndsInTheYear2162) {
    EXPECT_EQ(
        parseDhclientLeases(sample("isc-dhclient/dhclient.leases.infinite-and-quoted-semicolon")),
        (std::vector<DhclientLease>{leaseOf("eth2", "198.51.100.122", 6090183616),
                                    leaseOf("eth1", "198.51.100.106", 1795216921)}));
}

TEST(DhclientLease, CapturedReleaseIsACopyThatHasEnded) {
    EXPECT_EQ(parseDhclientLeases(
                  sample("isc-dhclient/dhclient.leases.two-interfaces-then-release-eth1")),
              (std::vector<DhclientLease>{leaseOf("eth2", "198.51.100.122", 1795216832),
                                          leaseOf("eth1", "198.51.100.106", 1795216233)}));
}

TEST(DhclientLease, CapturedTimesInLocalFormat) {
    EXPECT_EQ(parseDhclientLeases(sample("isc-dhclient/dhclient.leases.db-time-format-local")),
              (std::vector<DhclientLease>{leaseOf("eth2", "198.51.100.122", 6090183609),
                                          leaseOf("eth1", "198.51.100.106", 1795216914)}));
}

TEST(DhclientLease, CapturedDhcpv6Lease) {
    EXPECT_EQ(parseDhclientLeases(sample("isc-dhclient/dhclient6.eth1.leases")),
              (std::vector<DhclientLease>{
                  {.ipv6 = true,
                   .interfaceName = "eth1"_name,
                   .addresses = {{.address = "2001:db8:99::14d"_ip, .expires = 1795216781}},
                   .server = {}}}));
}

TEST(DhclientLease, CapturedDhcpv6ReleaseIsMarkedAlthoughItsTimesLookValid) {
    EXPECT_EQ(parseDhclientLeases(sample("isc-dhclient/dhclient6.eth1.leases.after-release")),
              (std::vector<DhclientLease>{
                  {.ipv6 = true,
                   .interfaceName = "eth1"_name,
                   .addresses = {{.address = "2001:db8:99::16e"_ip, .expires = 1795217908}},
                   .server = {},
                   .released = true}}));
}

TEST(DhclientLease, TheLastBlockOfAnInterfaceWins) {
    const auto parsed = parseDhclientLeases(R"(
        lease { interface "a"; fixed-address 192.0.2.1; }
        lease { interface "b"; fixed-address 192.0.2.2; }
        lease { interface "a"; fixed-address 192.0.2.3; })");
    ASSERT_EQ(parsed.size(), 2U);
    EXPECT_EQ(parsed[0].addresses[0].address, "192.0.2.3"_ip);
    EXPECT_EQ(parsed[1].addresses[0].address, "192.0.2.2"_ip);
}

TEST(DhclientLease, BothProtocolsOfAnInterfaceStandSideBySide) {
    const auto parsed =
        parseDhclientLeases("lease { interface \"a\"; } lease6 { interface \"a\"; }");
    EXPECT_EQ(parsed.size(), 2U);
}

TEST(DhclientLease, AHalfWrittenLastBlockIsLeftOut) {
    const std::string whole = sample("isc-dhclient/dhclient.eth1.leases");
    const std::string newer =
        "lease {\n  interface \"eth1\";\n  fixed-address 198.51.100.200;\n  renew 5 2027/11/20";
    const auto parsed = parseDhclientLeases(whole + newer);
    EXPECT_EQ(parsed, (std::vector<DhclientLease>{leaseOf("eth1", "198.51.100.106", 1795216781)}));
}

TEST(DhclientLease, EveryCutOfAFileKeepsOnlyWholeBlocks) {
    for (const char* name : {"isc-dhclient/dhclient.leases.infinite-and-quoted-semicolon",
                             "isc-dhclient/dhclient6.eth1.leases.after-release"}) {
        const std::string whole = sample(name);
        for (std::size_t length = 0; length < whole.size(); ++length) {
            for (const DhclientLease& lease :
                 parseDhclientLeases(std::string_view{whole}.substr(0, length))) {
                EXPECT_EQ(lease.addresses.size(), 1U) << name << " cut at " << length;
                EXPECT_TRUE(lease.addresses[0].expires) << name << " cut at " << length;
            }
        }
    }
}

TEST(DhclientLease, QuotedTextsMayHoldWhateverEndsStatementsElsewhere) {
    const auto parsed = parseDhclientLeases(
        R"(lease { option domain-name "};\";#\\"; interface "eth1"; fixed-address 192.0.2.1; })");
    ASSERT_EQ(parsed.size(), 1U);
    EXPECT_EQ(parsed[0].interfaceName, "eth1"_name);
}

TEST(DhclientLease, EscapesAreOctalOrLiteral) {
    const auto parsed = parseDhclientLeases(R"(lease { interface "\145th\061"; })");
    ASSERT_EQ(parsed.size(), 1U);
    EXPECT_EQ(parsed[0].interfaceName, "eth1"_name);
}

TEST(DhclientLease, ABlockWithAnUnendedQuotedTextIsLeftOut) {
    const auto parsed = parseDhclientLeases("lease { interface \"eth1; } lease { }\\");
    EXPECT_TRUE(parsed.empty());
}

TEST(DhclientLease, CommentsEndWithTheirLine) {
    const auto parsed = parseDhclientLeases(
        "# lease { interface \"no\"; }\nlease { # }\n interface \"eth1\"; # ;\n}\n# end");
    ASSERT_EQ(parsed.size(), 1U);
    EXPECT_EQ(parsed[0].interfaceName, "eth1"_name);
}

TEST(DhclientLease, UnknownStatementsAndBlocksAreSkipped) {
    const auto parsed = parseDhclientLeases(R"(
        default-duid "\000\001"; authoring-byte-order little-endian;
        failover peer "x" { state { a; } } ; } stray;
        lease { interface "eth1"; medium { x { y; } z; } filename "lease { }"; name "n";
                option agent.circuit-id 0:1:a; fixed-address 192.0.2.1; }
        lease 192.0.2.9 { interface "server"; })");
    ASSERT_EQ(parsed.size(), 1U);
    EXPECT_EQ(parsed[0].interfaceName, "eth1"_name);
    EXPECT_EQ(parsed[0].addresses[0].address, "192.0.2.1"_ip);
}

TEST(DhclientLease, BlocksWithoutAUsableInterfaceNameAreLeftOut) {
    EXPECT_TRUE(parseDhclientLeases(R"(lease { fixed-address 192.0.2.1; }
                                       lease { interface "../../etc"; }
                                       lease { interface "sixteen--letters"; }
                                       lease { interface; })")
                    .empty());
}

TEST(DhclientLease, ABootpLeaseWithoutAnEndLastsForEver) {
    const auto parsed =
        parseDhclientLeases("lease { bootp; interface \"eth1\"; fixed-address 198.51.100.7; }");
    ASSERT_EQ(parsed.size(), 1U);
    EXPECT_TRUE(parsed[0].bootp);
    EXPECT_EQ(parsed[0].addresses[0].expires, Lease::never);
}

TEST(DhclientLease, AReleasedBlockIsMarked) {
    EXPECT_TRUE(parseDhclientLeases("lease { interface \"e\"; released; }").at(0).released);
}

TEST(DhclientLease, TimesInTheirThreeForms) {
    EXPECT_EQ(expiryOf("5 2026/11/20 23:19:41"), 1795216781);
    EXPECT_EQ(expiryOf("epoch 1795216914"), 1795216914);
    EXPECT_EQ(expiryOf("never"), Lease::never);
    EXPECT_EQ(expiryOf("2 2162/12/28 05:40:16"), 6090183616);
    EXPECT_EQ(expiryOf("4 1970/1/1 00:00:00"), 0);
    EXPECT_EQ(expiryOf("2 2028/02/29 00:00:00"), 1835395200);
}

TEST(DhclientLease, TimesThatAreNoneAreNotGuessed) {
    for (const char* time : {"5", "5 2026/11/20", "5 2026/13/20 00:00:00", "5 2026/02/30 00:00:00",
                             "5 2026/11/20 25:00:00", "5 2026-11-20 00:00:00", "epoch", "epoch 1x",
                             "epoch 99999999999999999999", "5 99999/01/01 00:00:00",
                             "5 2026/11/20/1 00:00:00", "5 // ::", "", "5 2026/11/20 23:19:-1"}) {
        EXPECT_EQ(expiryOf(time), std::nullopt) << time;
    }
}

TEST(DhclientLease, Dhcpv6TimesCountFromTheirStart) {
    const auto parsed = parseDhclientLeases(R"(lease6 { interface "e";
        ia-na 00:00:00:01 { starts 1000; iaaddr 2001:DB8::1 { max-life 60; }
                            iaaddr 2001:db8::2 { starts 2000; max-life 4294967295; }
                            iaaddr 2001:db8::3 { }
                            iaaddr 2001:db8::4 { starts 9223372036854775807; max-life 1; }
                            iaaddr nonsense { max-life 1; } }
        ia-pd 00:00:00:02 { iaprefix 2001:db8:5::/56 { max-life 60; } } })");
    ASSERT_EQ(parsed.size(), 1U);
    EXPECT_EQ(parsed[0].addresses, (std::vector<DhclientAddress>{
                                       {.address = "2001:db8::1"_ip, .expires = 1060},
                                       {.address = "2001:db8::2"_ip, .expires = Lease::never},
                                       {.address = "2001:db8::3"_ip, .expires = std::nullopt},
                                       {.address = "2001:db8::4"_ip, .expires = std::nullopt}}));
}

TEST(DhclientLease, AddressesAndServersThatAreNoneAreLeftOut) {
    const auto parsed = parseDhclientLeases(R"(lease { interface "e"; fixed-address example.org;
        option dhcp-server-identifier 300.1.1.1; expire never; })");
    ASSERT_EQ(parsed.size(), 1U);
    EXPECT_TRUE(parsed[0].addresses.empty());
    EXPECT_EQ(parsed[0].server, std::nullopt);
}

TEST(DhclientLease, DeepNestingCostsNoStack) {
    const std::string deep = "lease { x " + std::string(1'000'000, '{');
    EXPECT_TRUE(parseDhclientLeases(deep).empty());
    EXPECT_TRUE(parseDhclientLeases(std::string(1'000'000, '}')).empty());
}

TEST(DhclientLease, AnyBytesGiveFacts) {
    const std::string whole = sample("isc-dhclient/dhclient6.eth1.leases");
    std::size_t blocks = 0;
    for (std::size_t i = 0; i < whole.size(); ++i) {
        for (const char byte : {'\0', '"', '{', '}', ';', '\\', '#', '\xff'}) {
            std::string changed = whole;
            changed[i] = byte;
            blocks += parseDhclientLeases(changed).size();
        }
    }
    EXPECT_GT(blocks, 0U);
    EXPECT_LE(blocks, 8 * whole.size());
}

}  // namespace
}  // namespace ZR::Live
