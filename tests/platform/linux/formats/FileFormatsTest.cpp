// The formats of files and command lines.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <string>
#include <vector>

#include "LinuxSupport.h"
#include "formats/Assignments.h"
#include "formats/NetworkFile.h"
#include "formats/NetworkdLease.h"
#include "formats/OptionWalk.h"
#include "formats/ValueFormats.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

std::vector<std::string> keys(std::string_view text) {
    std::vector<std::string> found;
    forEachKey(text, [&](std::string_view section, std::string_view key, std::string_view value) {
        found.push_back(std::string{section} + '|' + std::string{key} + '|' + std::string{value});
    });
    return found;
}

TEST(KeyFile, KeysBelongToTheSectionAboveThem) {
    EXPECT_THAT(keys("a=1\n[one]\n b = 2 \n[two]\r\nc=\nd=x=y"),
                ElementsAre("|a|1", "one|b|2", "two|c|", "two|d|x=y"));
}

TEST(KeyFile, CommentsAndWhatIsNotAPairAreSkipped) {
    EXPECT_THAT(keys("# a=1\n; b=2\n\nnothing\n[half\n"), IsEmpty());
}

TEST(KeyFile, ATornEndIsTheValueSoFar) {
    EXPECT_THAT(keys("[s]\nkey=val"), ElementsAre("s|key|val"));
    EXPECT_THAT(keys("[s"), IsEmpty());
}

NetworkFile networkFile(std::string_view text) {
    NetworkFile settings;
    applyNetworkFile(text, settings);
    return settings;
}

TEST(NetworkFile, CapturedFiles) {
    EXPECT_EQ(networkFile(sample("networkd/10-eth1.network")), (NetworkFile{.dhcp4 = true,
                                                                            .dhcp6 = true,
                                                                            .linkLocal4 = true,
                                                                            .addresses = {},
                                                                            .matchName = "eth1"}));
    EXPECT_EQ(networkFile(sample("networkd-257/10-eth1.network")),
              (NetworkFile{.dhcp4 = true,
                           .dhcp6 = true,
                           .linkLocal4 = false,
                           .addresses = {},
                           .matchName = "eth1"}));
}

TEST(NetworkFile, AllSpellingsOfDhcp) {
    const auto dhcp = [](const std::string& value) {
        const NetworkFile settings = networkFile("[Network]\nDHCP=" + value + "\n");
        return std::pair{settings.dhcp4, settings.dhcp6};
    };
    for (const char* value : {"yes", "true", "1", "on", "Yes", "both"}) {
        EXPECT_EQ(dhcp(value), std::pair(true, true)) << value;
    }
    for (const char* value : {"no", "false", "0", "off", "none"}) {
        EXPECT_EQ(dhcp(value), std::pair(false, false)) << value;
    }
    EXPECT_EQ(dhcp("ipv4"), std::pair(true, false));
    EXPECT_EQ(dhcp("v4"), std::pair(true, false));
    EXPECT_EQ(dhcp("ipv6"), std::pair(false, true));
    EXPECT_EQ(dhcp("v6"), std::pair(false, true));
}

TEST(NetworkFile, AnUnknownValueChangesNothing) {
    EXPECT_TRUE(networkFile("[Network]\nDHCP=yes\nDHCP=maybe\n").dhcp4);
    EXPECT_TRUE(networkFile("[Network]\nDHCP=yes\nDHCP=\n").dhcp4);
}

TEST(NetworkFile, OnlyItsOwnSectionCounts) {
    EXPECT_EQ(networkFile("DHCP=yes\n[Match]\nDHCP=yes\n[DHCPv4]\nDHCP=yes\nAddress=192.0.2.1\n"),
              NetworkFile{});
}

TEST(NetworkFile, CommentsAndBlanksDoNotCount) {
    EXPECT_EQ(networkFile("\r\n[Network]\r\n # DHCP=no\n; DHCP=no\n  DHCP = ipv4 \r\n"),
              (NetworkFile{.dhcp4 = true, .addresses = {}}));
}

TEST(NetworkFile, IPv4AddressesOfBothSections) {
    EXPECT_THAT(networkFile("[Network]\nAddress=192.0.2.1/24\nAddress=2001:db8::1/64\n"
                            "[Address]\nAddress=192.0.2.2/24\n")
                    .addresses,
                ElementsAre("192.0.2.1"_ip, "192.0.2.2"_ip));
}

TEST(NetworkFile, AnEmptyAddressForgetsThoseBefore) {
    EXPECT_THAT(
        networkFile("[Network]\nAddress=192.0.2.1/24\nAddress=\nAddress=192.0.2.3\n").addresses,
        ElementsAre("192.0.2.3"_ip));
}

TEST(NetworkdLease, CapturedByVersion252) {
    EXPECT_EQ(parseNetworkdLease(sample("networkd/run-systemd-netif-leases-2.txt")),
              (NetworkdLease{.address = "198.51.100.110"_ip,
                             .server = "198.51.100.1"_ip,
                             .lifetime = 600,
                             .options = {1, 3, 54, 28, 51, 6, 42, 15, 12},
                             .clientIdentifier = "fffea6fdf300020000ab1162026949ec04e8a7"}));
}

TEST(NetworkdLease, CapturedInfinite) {
    for (const char* file : {"networkd/run-systemd-netif-leases-3.infinite.txt",
                             "networkd-257/run-systemd-netif-leases-2.infinite.txt"}) {
        const NetworkdLease lease = parseNetworkdLease(sample(file));
        EXPECT_TRUE(lease.address) << file;
        EXPECT_EQ(lease.server, "198.51.100.1"_ip) << file;
        EXPECT_EQ(lease.lifetime, infiniteTime) << file;
        EXPECT_EQ(lease.damage, "") << file;
    }
}

TEST(NetworkdLease, CapturedByVersion257) {
    EXPECT_EQ(parseNetworkdLease(sample("networkd-257/run-systemd-netif-leases-2.txt")),
              (NetworkdLease{.address = "198.51.100.111"_ip,
                             .server = "198.51.100.1"_ip,
                             .lifetime = 600,
                             .options = {1, 3, 54, 28, 51, 6, 42, 15, 12},
                             .clientIdentifier = "ff925a88c400020000ab116c5df15fb1efe9f3"}));
}

TEST(NetworkdLease, WhatIsNotAnAddressOrTimeIsLeftOutAndTheFirstIsTold) {
    const NetworkdLease lease =
        parseNetworkdLease("\nADDRESS=host\nSERVER_ADDRESS=1.2.3\nT1=soon\nLIFETIME=\n");
    EXPECT_FALSE(lease.address || lease.server || lease.lifetime);
    EXPECT_EQ(lease.damage, "line 2: ADDRESS is not an IPv4 address");
    EXPECT_EQ(parseNetworkdLease("ADDRESS=192.0.2.7\nscrap\n").damage,
              "line 2: not of the form KEY=value");
    EXPECT_EQ(parseNetworkdLease("SERVER_ADDRESS=x\n").damage,
              "line 1: SERVER_ADDRESS is not an IPv4 address");
}

TEST(ShellAssignments, PlainAndQuotedValues) {
    EXPECT_THAT(parseShellAssignments("A=one\nB='two words'\nC=\"say \\\"hi\\\"\"\n D=\n"),
                ElementsAre(ShellAssignment{"A", "one"}, ShellAssignment{"B", "two words"},
                            ShellAssignment{"C", "say \"hi\""}, ShellAssignment{"D", ""}));
}

TEST(ShellAssignments, ExportedOnesCountToo) {
    EXPECT_THAT(parseShellAssignments("export A=1\nexport\tB=2\nexporting=3\n"),
                ElementsAre(ShellAssignment{"A", "1"}, ShellAssignment{"B", "2"},
                            ShellAssignment{"exporting", "3"}));
}

TEST(ShellAssignments, CommentsAndCommandsAreSkipped) {
    EXPECT_THAT(parseShellAssignments("# A=1\n. /etc/other\nif [ x = y ]; then\n=1\na-b=2\n"),
                IsEmpty());
    EXPECT_THAT(parseShellAssignments("A=1 # the one\nB=2; rm -rf x\n"),
                ElementsAre(ShellAssignment{"A", "1"}, ShellAssignment{"B", "2"}));
}

TEST(ShellAssignments, NothingIsExpanded) {
    EXPECT_THAT(parseShellAssignments("A=$(id)\nB=\"$A\"\n"),
                ElementsAre(ShellAssignment{"A", "$(id)"}, ShellAssignment{"B", "$A"}));
}

TEST(ShellAssignments, AnOpenQuoteEndsWithItsLine) {
    EXPECT_THAT(parseShellAssignments("A='half\nB=2\n\\\nC=3\\"),
                ElementsAre(ShellAssignment{"A", "half"}, ShellAssignment{"B", "2"},
                            ShellAssignment{"C", "3\\"}));
}

TEST(ShellAssignments, OfANameTheLastValueCounts) {
    const auto assignments = parseShellAssignments("A=1\nA=2\n");
    EXPECT_EQ(lastValue(assignments, "A"), "2");
    EXPECT_EQ(lastValue(assignments, "B"), "");
}

std::vector<std::string> walk(const std::vector<std::string_view>& arguments) {
    constexpr std::array<std::string_view, 1> longWithValue{"interface"};
    OptionWalk walk{arguments, "iv", longWithValue};
    std::vector<std::string> found;
    for (CommandOption option; walk.next(option);) {
        const std::string name =
            option.letter != '\0' ? std::string(1, option.letter) : std::string{option.longName};
        found.push_back((option.isOperand() ? "operand" : name) + ':' + std::string{option.value});
    }
    return found;
}

TEST(OptionWalk, LettersMayStandTogether) {
    EXPECT_THAT(walk({"-bf", "-nieth1", "-i", "eth2"}),
                ElementsAre("b:", "f:", "n:", "i:eth1", "i:eth2"));
}

TEST(OptionWalk, LongNamesTakeTheirValueEitherWay) {
    EXPECT_THAT(walk({"--interface", "eth1", "--interface=eth2", "--quiet", "--other=x"}),
                ElementsAre("interface:eth1", "interface:eth2", "quiet:", "other:x"));
}

TEST(OptionWalk, WhatIsNotAnOptionIsAnOperand) {
    EXPECT_THAT(walk({"eth1", "-", "", "--", "-b", "--x"}),
                ElementsAre("operand:eth1", "operand:-", "operand:", "operand:-b", "operand:--x"));
}

TEST(OptionWalk, AMissingValueIsEmpty) {
    EXPECT_THAT(walk({"-i"}), ElementsAre("i:"));
    EXPECT_THAT(walk({"--interface"}), ElementsAre("interface:"));
    EXPECT_THAT(walk({"--=x"}), ElementsAre("-:x"));
    EXPECT_THAT(walk({}), ElementsAre());
    EXPECT_THAT(walk({"--"}), ElementsAre());
}

}  // namespace
}  // namespace ZR::Live
