#include "clients/DhclientLease.h"

#include <gtest/gtest.h>

#include "LinuxSupport.h"
#include "facts/Lease.h"

namespace ZR::Live {
namespace {

DhclientLease leaseOf(const std::string& interface, const std::string& address,
                      std::int64_t expires) {
    return {.ipv6 = false,
            .interfaceName = ZR::Live::interfaceName(interface),
            .addresses = {{.address = ipAddress(address), .expires = expires}},
            .server = "198.51.100.1"_ip};
}

/// The leases of a text without what only some of the tests are about.
std::vector<DhclientLease> leasesIn(std::string_view text) {
    std::vector<DhclientLease> leases = parseDhclientLeases(text).leases;
    for (DhclientLease& lease : leases) {
        lease.options.clear();
        lease.clientIdentifier.clear();
        for (DhclientAddress& address : lease.addresses) {
            address = {.address = address.address, .expires = address.expires};
        }
    }
    return leases;
}

std::vector<DhclientDamage> damageOf(std::string_view text) {
    return parseDhclientLeases(text).damage;
}

std::optional<std::int64_t> expiryOf(const std::string& time) {
    const auto parsed =
        leasesIn("lease { interface \"eth1\"; fixed-address 198.51.100.7; expire " + time + "; }");
    return parsed.empty() ? std::nullopt : std::optional{parsed.at(0).addresses.at(0).expires};
}

TEST(DhclientLease, CapturedSingleLease) {
    EXPECT_EQ(leasesIn(sample("isc-dhclient/dhclient.eth1.leases")),
              (std::vector<DhclientLease>{leaseOf("eth1", "198.51.100.106", 1795216781)}));
}

TEST(DhclientLease, CapturedLeaseUnderIfupdown) {
    EXPECT_EQ(leasesIn(sample("ifupdown/dhclient.eth1.leases")),
              (std::vector<DhclientLease>{leaseOf("eth1", "198.51.100.106", 1795216956)}));
}

TEST(DhclientLease, CapturedInfiniteLeaseEndsInTheYear2162) {
    EXPECT_EQ(leasesIn(sample("isc-dhclient/dhclient.leases.infinite-and-quoted-semicolon")),
              (std::vector<DhclientLease>{leaseOf("eth2", "198.51.100.122", 6090183616),
                                          leaseOf("eth1", "198.51.100.106", 1795216921)}));
}

TEST(DhclientLease, CapturedReleaseIsACopyThatHasEnded) {
    EXPECT_EQ(leasesIn(sample("isc-dhclient/dhclient.leases.two-interfaces-then-release-eth1")),
              (std::vector<DhclientLease>{leaseOf("eth2", "198.51.100.122", 1795216832),
                                          leaseOf("eth1", "198.51.100.106", 1795216233)}));
}

TEST(DhclientLease, CapturedTimesInLocalFormat) {
    EXPECT_EQ(leasesIn(sample("isc-dhclient/dhclient.leases.db-time-format-local")),
              (std::vector<DhclientLease>{leaseOf("eth2", "198.51.100.122", 6090183609),
                                          leaseOf("eth1", "198.51.100.106", 1795216914)}));
}

TEST(DhclientLease, CapturedDhcpv6Lease) {
    EXPECT_EQ(leasesIn(sample("isc-dhclient/dhclient6.eth1.leases")),
              (std::vector<DhclientLease>{
                  {.ipv6 = true,
                   .interfaceName = "eth1"_name,
                   .addresses = {{.address = "2001:db8:99::14d"_ip, .expires = 1795216781}},
                   .server = {}}}));
}

TEST(DhclientLease, CapturedDhcpv6ReleaseIsMarkedAlthoughItsTimesLookValid) {
    EXPECT_EQ(leasesIn(sample("isc-dhclient/dhclient6.eth1.leases.after-release")),
              (std::vector<DhclientLease>{
                  {.ipv6 = true,
                   .interfaceName = "eth1"_name,
                   .addresses = {{.address = "2001:db8:99::16e"_ip, .expires = 1795217908}},
                   .server = {},
                   .released = true}}));
}

TEST(DhclientLease, TheLastBlockOfAnInterfaceWins) {
    const auto parsed = leasesIn(R"(
        lease { interface "a"; fixed-address 192.0.2.1; expire never; }
        lease { interface "b"; fixed-address 192.0.2.2; expire never; }
        lease { interface "a"; fixed-address 192.0.2.3; expire never; })");
    ASSERT_EQ(parsed.size(), 2U);
    EXPECT_EQ(parsed[0].addresses[0].address, "192.0.2.3"_ip);
    EXPECT_EQ(parsed[1].addresses[0].address, "192.0.2.2"_ip);
}

TEST(DhclientLease, BothProtocolsOfAnInterfaceStandSideBySide) {
    const auto parsed = leasesIn(
        "lease { interface \"a\"; fixed-address 192.0.2.1; expire never; }"
        "lease6 { interface \"a\"; }");
    EXPECT_EQ(parsed.size(), 2U);
}

TEST(DhclientLease, AHalfWrittenLastBlockIsLeftOut) {
    const std::string whole = sample("isc-dhclient/dhclient.eth1.leases");
    const std::string newer =
        "lease {\n  interface \"eth1\";\n  fixed-address 198.51.100.200;\n  renew 5 2027/11/20";
    const auto parsed = leasesIn(whole + newer);
    EXPECT_EQ(parsed, (std::vector<DhclientLease>{leaseOf("eth1", "198.51.100.106", 1795216781)}));
}

TEST(DhclientLease, EveryCutOfAFileKeepsOnlyWholeBlocks) {
    for (const char* name : {"isc-dhclient/dhclient.leases.infinite-and-quoted-semicolon",
                             "isc-dhclient/dhclient6.eth1.leases.after-release"}) {
        const std::string whole = sample(name);
        for (std::size_t length = 0; length < whole.size(); ++length) {
            for (const DhclientLease& lease : leasesIn(std::string_view{whole}.substr(0, length))) {
                EXPECT_EQ(lease.addresses.size(), 1U) << name << " cut at " << length;
                EXPECT_GT(lease.addresses[0].expires, 0) << name << " cut at " << length;
            }
        }
    }
}

TEST(DhclientLease, QuotedTextsMayHoldWhateverEndsStatementsElsewhere) {
    const auto parsed = leasesIn(
        R"(lease { option domain-name "};\";#\\"; interface "eth1"; fixed-address 192.0.2.1; expire never; })");
    ASSERT_EQ(parsed.size(), 1U);
    EXPECT_EQ(parsed[0].interfaceName, "eth1"_name);
}

TEST(DhclientLease, EscapesAreOctalOrLiteral) {
    const auto parsed = leasesIn(R"(lease6 { interface "\145th\061"; })");
    ASSERT_EQ(parsed.size(), 1U);
    EXPECT_EQ(parsed[0].interfaceName, "eth1"_name);
}

TEST(DhclientLease, ABlockWithAnUnendedQuotedTextIsLeftOut) {
    const auto parsed = leasesIn("lease { interface \"eth1; } lease { }\\");
    EXPECT_TRUE(parsed.empty());
}

TEST(DhclientLease, CommentsEndWithTheirLine) {
    const auto parsed = leasesIn(
        "# lease6 { interface \"no\"; }\nlease6 { # }\n interface \"eth1\"; # ;\n}\n# end");
    ASSERT_EQ(parsed.size(), 1U);
    EXPECT_EQ(parsed[0].interfaceName, "eth1"_name);
}

TEST(DhclientLease, UnknownStatementsAndBlocksAreSkipped) {
    const auto parsed = leasesIn(R"(
        default-duid "\000\001"; authoring-byte-order little-endian;
        failover peer "x" { state { a; } } ; } stray;
        lease { interface "eth1"; medium { x { y; } z; } filename "lease { }"; name "n";
                option agent.circuit-id 0:1:a; fixed-address 192.0.2.1; expire never; }
        lease 192.0.2.9 { interface "server"; })");
    ASSERT_EQ(parsed.size(), 1U);
    EXPECT_EQ(parsed[0].interfaceName, "eth1"_name);
    EXPECT_EQ(parsed[0].addresses[0].address, "192.0.2.1"_ip);
}

TEST(DhclientLease, BlocksWithoutAUsableInterfaceNameAreLeftOut) {
    EXPECT_TRUE(leasesIn(R"(lease { fixed-address 192.0.2.1; expire never; }
                                       lease { interface "../../etc"; }
                                       lease { interface "sixteen--letters"; }
                                       lease { interface; })")
                    .empty());
}

TEST(DhclientLease, ABootpLeaseWithoutAnEndLastsForEver) {
    const auto parsed =
        leasesIn("lease { bootp; interface \"eth1\"; fixed-address 198.51.100.7; }");
    ASSERT_EQ(parsed.size(), 1U);
    EXPECT_TRUE(parsed[0].bootp);
    EXPECT_EQ(parsed[0].addresses[0].expires, Lease::never);
}

TEST(DhclientLease, AReleasedBlockIsMarked) {
    EXPECT_TRUE(leasesIn("lease6 { interface \"e\"; released; }").at(0).released);
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
    const auto parsed = leasesIn(R"(lease6 { interface "e";
        ia-na 00:00:00:01 { starts 1000; iaaddr 2001:DB8::1 { max-life 60; }
                            iaaddr 2001:db8::2 { starts 2000; max-life 4294967295; }
                            iaaddr 2001:db8::3 { }
                            iaaddr 2001:db8::4 { starts 9223372036854775807; max-life 1; }
                            iaaddr nonsense { max-life 1; } }
        ia-pd 00:00:00:02 { iaprefix 2001:db8:5::/56 { max-life 60; } } })");
    ASSERT_EQ(parsed.size(), 1U);
    EXPECT_EQ(parsed[0].addresses, (std::vector<DhclientAddress>{
                                       {.address = "2001:db8::1"_ip, .expires = 1060},
                                       {.address = "2001:db8::2"_ip, .expires = Lease::never}}));
}

TEST(DhclientLease, DetailsOfACapturedLease) {
    const auto leases = parseDhclientLeases(sample("isc-dhclient/dhclient.eth1.leases")).leases;
    ASSERT_EQ(leases.size(), 1U);
    EXPECT_EQ(leases[0].options,
              (std::vector<std::uint16_t>{1, 3, 51, 53, 6, 54, 58, 42, 28, 59, 12, 15}));
    EXPECT_EQ(leases[0].clientIdentifier, "");
    ASSERT_EQ(leases[0].addresses.size(), 1U);
    const DhclientAddress& address = leases[0].addresses[0];
    EXPECT_EQ(address.expires, 1795216781);
    EXPECT_EQ(address.obtained, 1795216181);
    EXPECT_EQ(address.renews, 1795216412);
    EXPECT_EQ(address.rebinds, 1795216706);
}

TEST(DhclientLease, DetailsOfACapturedDhcpv6Lease) {
    const auto leases =
        parseDhclientLeases(sample("isc-dhclient/dhclient6.eth1.leases.after-release")).leases;
    ASSERT_EQ(leases.size(), 1U);
    EXPECT_EQ(leases[0].options, (std::vector<std::uint16_t>{3, 1, 2, 23, 13}));
    EXPECT_EQ(leases[0].clientIdentifier, "0:1:0:1:32:93:94:1b:52:54:0:0:0:1");
    ASSERT_EQ(leases[0].addresses.size(), 1U);
    const DhclientAddress& address = leases[0].addresses[0];
    EXPECT_EQ(address.obtained, 1795217308);
    EXPECT_EQ(address.renews, 1795217608);
    EXPECT_EQ(address.rebinds, 1795217833);
    EXPECT_EQ(address.expires, 1795217908);
}

TEST(DhclientLease, WithoutItsDurationALeaseDoesNotTellWhenItBegan) {
    const auto obtained = [](const std::string& statements) {
        return parseDhclientLeases("lease { interface \"e\"; fixed-address 192.0.2.1; " +
                                   statements + "}")
            .leases.at(0)
            .addresses.at(0)
            .obtained;
    };
    EXPECT_EQ(obtained("expire epoch 1000; option dhcp-lease-time 600;"), 400);
    EXPECT_EQ(obtained("option dhcp-lease-time 600; renew epoch 700; expire epoch 1000;"), 400);
    EXPECT_EQ(obtained("expire epoch 6090183616; option dhcp-lease-time 4294967295;"), 1795216321);
    EXPECT_EQ(obtained("expire epoch 1000;"), std::nullopt);
    EXPECT_EQ(obtained("expire never; option dhcp-lease-time 600;"), std::nullopt);
    EXPECT_EQ(obtained("expire epoch 1000; option dhcp-lease-time x;"), std::nullopt);
    EXPECT_EQ(obtained("expire epoch 1; option dhcp-lease-time 600;"), std::nullopt);
    EXPECT_EQ(obtained("renew epoch 1000; rebind epoch 1000; expire epoch 1000; option "
                       "dhcp-lease-time 600;"),
              std::nullopt)
        << "it was given back";
}

TEST(DhclientLease, TimesThatAServerLeavesToTheClientAreNone) {
    const auto leases = parseDhclientLeases(R"(lease6 { interface "e"; ia-na 0 { starts 1000;
        renew 0; rebind 4294967295; iaaddr 2001:db8::1 { max-life 60; } } })")
                            .leases;
    EXPECT_EQ(leases.at(0).addresses.at(0).obtained, 1000);
    EXPECT_EQ(leases.at(0).addresses.at(0).renews, std::nullopt);
    EXPECT_EQ(leases.at(0).addresses.at(0).rebinds, Lease::never);
}

TEST(DhclientLease, OptionsOfAllKindsOfNames) {
    const auto leases = parseDhclientLeases(R"(
        lease { interface "e"; fixed-address 192.0.2.1; expire never;
            option unknown-224 1:2; option rfc3442-classless-static-routes 24,192,0,2;
            option fqdn.encoded true; option fqdn.no-client-update true; option agent.circuit-id 0;
            option made-up "x"; option dhcp6.server-id 0; option unknown-65536 0; option; }
        lease6 { interface "e"; ia-pd 00:00:00:01 { } ia-ta 00:00:00:02 { }
            option dhcp6.unknown-65000 0; option vsio.x 1; option subnet-mask 0; })")
                            .leases;
    ASSERT_EQ(leases.size(), 2U);
    EXPECT_EQ(leases[0].options, (std::vector<std::uint16_t>{224, 121, 81, 82}));
    EXPECT_EQ(leases[1].options, (std::vector<std::uint16_t>{25, 4, 65000, 17}));
}

TEST(DhclientLease, ClientIdentifiersAreTextsOrBytes) {
    const auto identifier = [](const std::string& text) {
        return parseDhclientLeases(text).leases.at(0).clientIdentifier;
    };
    const std::string lease = "lease { interface \"e\"; fixed-address 192.0.2.1; expire never; ";
    EXPECT_EQ(identifier(lease + "option dhcp-client-identifier 1:52:54:0:0:0:1; }"),
              "1:52:54:0:0:0:1");
    EXPECT_EQ(identifier(lease + "option dhcp-client-identifier \"host-1\"; }"), "host-1");
    EXPECT_EQ(identifier(lease + R"(option dhcp-client-identifier "\001RT\000 "; })"),
              "1:52:54:0:20");
    const std::string own = "default-duid \"\\000\\003\\000\\001RT\"; ";
    EXPECT_EQ(identifier(own + "lease6 { interface \"e\"; }"), "0:3:0:1:52:54");
    EXPECT_EQ(identifier(own + "lease6 { interface \"e\"; option dhcp6.client-id 0:1; }"), "0:1");
    EXPECT_EQ(identifier(own + lease + "}"), "") << "DHCPv4 need not use it";
}

TEST(DhclientLease, WhatIsWholeIsNotDamaged) {
    for (const char* name :
         {"dhclient.eth1.leases", "dhclient.leases.infinite-and-quoted-semicolon",
          "dhclient.leases.two-interfaces-then-release-eth1", "dhclient6.eth1.leases",
          "dhclient.leases.db-time-format-local", "dhclient6.eth1.leases.after-release"}) {
        const DhclientLeases found =
            parseDhclientLeases(sample(std::string{"isc-dhclient/"} + name));
        EXPECT_EQ(found.damage, std::vector<DhclientDamage>{}) << name;
        EXPECT_FALSE(found.cutOff) << name;
    }
    EXPECT_EQ(damageOf(""), std::vector<DhclientDamage>{});
    EXPECT_EQ(damageOf("\n# x\ndefault-duid \"x\";\n; failover peer { }"),
              std::vector<DhclientDamage>{});
}

TEST(DhclientLease, EachDamagedBlockIsToldWithItsLine) {
    const std::string whole = "lease { interface \"e\"; fixed-address 192.0.2.1; expire never; }\n";
    const auto one = [](std::size_t line, const char* what) {
        return std::vector<DhclientDamage>{{.line = line, .what = what}};
    };
    EXPECT_EQ(damageOf(whole + "lease {\n fixed-address 192.0.2.1; expire never; }"),
              one(2, "the lease names no interface"));
    EXPECT_EQ(damageOf(whole + "\n lease { interface \"e\"; expire never; }"),
              one(3, "the lease has no address"));
    EXPECT_EQ(damageOf("lease { interface \"e\"; fixed-address example.org; expire never; }"),
              one(1, "the lease has no address"));
    EXPECT_EQ(damageOf("lease { interface \"e\"; fixed-address 192.0.2.1; }"),
              one(1, "the lease has no end"));
    EXPECT_EQ(damageOf("lease { interface \"e\"; fixed-address 192.0.2.1; expire 5 x; }"),
              one(1, "\"expire\" is not followed by a time"));
    EXPECT_EQ(damageOf("lease { interface \"e\"; fixed-address 192.0.2.1; expire never; renew; }"),
              one(1, "\"renew\" is not followed by a time"));
    EXPECT_EQ(damageOf("lease { interface \"e\"; fixed-address 192.0.2.1; expire never; option "
                       "dhcp-server-identifier 300.1.1.1; }"),
              one(1, "the lease names a server without an address"));
    EXPECT_EQ(damageOf("}\n"), one(1, "a \"}\" that ends nothing"));
    EXPECT_EQ(damageOf("lease6 { interface \"e\"; ia-na 0 { iaaddr x { max-life 1; } } }"),
              one(1, "\"iaaddr\" is not followed by an address"));
    EXPECT_EQ(damageOf("lease6 { interface \"e\"; ia-na 0 { iaaddr ::1 { max-life 1; } } }"),
              one(1, "an address has no start or no lifetime"));
    for (const char* cut : {"lease", "lease { interface \"e\"", "lease { interface \"e",
                            "lease { interface \"e\"; ", "x { y {"}) {
        const DhclientLeases found = parseDhclientLeases(whole + cut);
        EXPECT_EQ(found.leases.size(), 1U) << cut;
        EXPECT_TRUE(found.cutOff) << cut;
        ASSERT_FALSE(found.damage.empty()) << cut;
        EXPECT_EQ(found.damage[0].line, 2U) << cut;
        EXPECT_TRUE(found.damage[0].what.starts_with("the file ends within ")) << cut;
    }
}

TEST(DhclientLease, ADamagedBlockDoesNotHideTheOneBefore) {
    EXPECT_EQ(leasesIn("lease { interface \"e\"; fixed-address 192.0.2.1; expire epoch 7; option "
                       "dhcp-server-identifier 198.51.100.1; }"
                       "lease { interface \"e\"; fixed-address 192.0.2.9; expire ?; }"),
              (std::vector<DhclientLease>{leaseOf("e", "192.0.2.1", 7)}));
    // Each address of DHCPv6 is a record of its own.
    const auto leases = parseDhclientLeases(R"(lease6 { interface "e"; ia-na 0 { starts 1;
        iaaddr ::1 { max-life 1; } iaaddr x { max-life 1; } iaaddr ::2 { } } })")
                            .leases;
    ASSERT_EQ(leases.size(), 1U);
    ASSERT_EQ(leases[0].addresses.size(), 1U);
    EXPECT_EQ(leases[0].addresses[0].address, "::1"_ip);
}

TEST(DhclientLease, OfAFileThatIsAllDamagedTheFirstLinesAreTold) {
    std::string text;
    for (int i = 0; i < 1000; ++i) {
        text += "}\n";
    }
    EXPECT_EQ(damageOf(text).size(), 10U);
}

TEST(DhclientLease, DeepNestingCostsNoStack) {
    const std::string deep = "lease { x " + std::string(1'000'000, '{');
    EXPECT_TRUE(leasesIn(deep).empty());
    EXPECT_TRUE(leasesIn(std::string(1'000'000, '}')).empty());
}

TEST(DhclientLease, AnyBytesGiveFacts) {
    const std::string whole = sample("isc-dhclient/dhclient6.eth1.leases");
    std::size_t blocks = 0;
    for (std::size_t i = 0; i < whole.size(); ++i) {
        for (const char byte : {'\0', '"', '{', '}', ';', '\\', '#', '\xff'}) {
            std::string changed = whole;
            changed[i] = byte;
            blocks += parseDhclientLeases(changed).leases.size();
        }
    }
    EXPECT_GT(blocks, 0U);
    EXPECT_LE(blocks, 8 * whole.size());
}

}  // namespace
}  // namespace ZR::Live
