#include "formats/DhcpPacket.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;

std::span<const std::byte> bytes(const std::string& content) {
    return std::as_bytes(std::span{content});
}

DhcpReply reply(const std::string& packet) {
    const auto parsed = parseDhcpReply(bytes(packet));
    const auto* const facts = std::get_if<DhcpReply>(&parsed);
    EXPECT_NE(facts, nullptr) << std::get<std::string_view>(parsed);
    return facts == nullptr ? DhcpReply{} : *facts;
}
std::string reason(const std::string& packet) {
    const auto parsed = parseDhcpReply(bytes(packet));
    const auto* const text = std::get_if<std::string_view>(&parsed);
    return text == nullptr ? "none" : std::string{*text};
}

/// A server's reply for 192.0.2.7 with these bytes as its options.
std::string packet(const std::string& options, const std::string& file = "",
                   const std::string& serverName = "") {
    std::string packet(240, '\0');
    packet[0] = 2;
    packet.replace(16, 4, "\xc0\x00\x02\x07", 4);
    packet.replace(44, serverName.size(), serverName);
    packet.replace(108, file.size(), file);
    packet.replace(236, 4, "\x63\x82\x53\x63");
    return packet + options;
}
std::string option(int code, const std::string& value) {
    return std::string{static_cast<char>(code)} + static_cast<char>(value.size()) + value;
}
const std::string endOption = "\xff";
const std::string server{"\xc0\x00\x02\x01", 4};
const std::string tenMinutes{"\0\0\x02\x58", 4};

TEST(DhcpReply, CapturedByVersion9) {
    EXPECT_EQ(reply(sample("dhcpcd-9/eth1.lease")),
              (DhcpReply{.address = "198.51.100.107"_ip,
                         .server = "198.51.100.1"_ip,
                         .bootp = false,
                         .leaseTime = 600,
                         .renewal = 300,
                         .rebinding = 525,
                         .options = {53, 54, 51, 58, 59, 1, 28, 15, 6, 3}}));
}

TEST(DhcpReply, CapturedByVersion10) {
    EXPECT_EQ(reply(sample("dhcpcd-10/eth1.lease")),
              (DhcpReply{.address = "198.51.100.121"_ip,
                         .server = "198.51.100.1"_ip,
                         .bootp = false,
                         .leaseTime = 600,
                         .renewal = 300,
                         .rebinding = 525,
                         .options = {53, 54, 51, 58, 59, 1, 28, 12, 15, 42, 6, 3}}));
}

TEST(DhcpReply, AServerMayRepeatWhoTheClientIs) {
    const DhcpReply found =
        reply(packet(option(61, "\x01\x52\xff") + option(61, "\x0a") + endOption));
    EXPECT_EQ(found.clientIdentifier, "01:52:ff:0a");
    EXPECT_THAT(found.options, ElementsAre(61));
}

TEST(DhcpReply, EveryBeginningOfACapturedOneHasAReason) {
    const std::string whole = sample("dhcpcd-10/eth1.lease");
    for (std::size_t size = 0; size < whole.size(); ++size) {
        EXPECT_NE(reason(whole.substr(0, size)), "none") << size;
    }
}

TEST(DhcpReply, NothingButAReplyWithTheCookieCounts) {
    EXPECT_EQ(reason(""), "shorter than a DHCP message");
    std::string request = packet(endOption);
    request[0] = 1;
    EXPECT_EQ(reason(request), "not a reply of a server");
    for (std::size_t i = 236; i < 240; ++i) {
        std::string bad = packet(endOption);
        bad[i] = 'x';
        EXPECT_EQ(reason(bad), "no DHCP magic cookie") << i;
    }
}

TEST(DhcpReply, AnOptionLongerThanTheMessageIsRefused) {
    EXPECT_EQ(reason(packet(option(53, "\5") + "\x36\x04\xc0")),
              "an option is longer than the message");
    EXPECT_EQ(reason(packet("\x36")), "an option is longer than the message");
}

TEST(DhcpReply, WithoutAnEndItWasTorn) {
    EXPECT_EQ(reason(packet(option(53, "\5") + option(54, server))), "no end option");
    EXPECT_EQ(reason(packet("")), "no end option");
}

TEST(DhcpReply, WithoutAMessageTypeItIsBootp) {
    EXPECT_EQ(reply(packet(endOption)),
              (DhcpReply{.address = "192.0.2.7"_ip, .server = {}, .bootp = true, .leaseTime = {}}));
    EXPECT_THAT(reply(packet(endOption)).options, testing::IsEmpty());
}

TEST(DhcpReply, PaddingAndWhatFollowsTheEndDoNotCount) {
    EXPECT_EQ(
        reply(packet(std::string(3, '\0') + option(53, "\5") + endOption + option(54, server))),
        (DhcpReply{.address = "192.0.2.7"_ip,
                   .server = {},
                   .bootp = false,
                   .leaseTime = {},
                   .options = {53}}));
}

TEST(DhcpReply, OptionsMayGoOnInTheFileAndServerNameFields) {
    const std::string both = option(53, "\5") + option(52, "\3") + endOption;
    EXPECT_EQ(
        reply(packet(both, option(54, server) + endOption, option(51, tenMinutes) + endOption)),
        (DhcpReply{.address = "192.0.2.7"_ip,
                   .server = "192.0.2.1"_ip,
                   .bootp = false,
                   .leaseTime = 600,
                   .options = {53, 52, 54, 51}}));
    const std::string fileOnly = option(53, "\5") + option(52, "\1") + endOption;
    EXPECT_EQ(
        reply(packet(fileOnly, option(54, server) + endOption, option(51, tenMinutes))).leaseTime,
        std::nullopt);
    const std::string neither = option(53, "\5") + endOption;
    EXPECT_EQ(reply(packet(neither, option(54, server) + endOption)).server, std::nullopt);
}

TEST(DhcpReply, AnOptionThatOverflowsItsFieldIsRefused) {
    const std::string overload = option(52, "\2") + endOption;
    EXPECT_EQ(reason(packet(overload, "", option(54, std::string(62, 'x')))), "none");
    std::string half(64, '\0');
    half[62] = '\x36';
    half[63] = '\1';
    EXPECT_EQ(reason(packet(overload, "", half)), "an option is longer than the message");
}

TEST(DhcpReply, PartsOfASplitOptionBelongTogether) {
    EXPECT_EQ(reply(packet(option(54, server.substr(0, 1)) + option(53, "\5") +
                           option(54, server.substr(1)) + endOption))
                  .server,
              "192.0.2.1"_ip);
}

TEST(DhcpReply, ValuesOfAnotherLengthAreNone) {
    const DhcpReply found = reply(packet(option(54, "\1\2") + option(51, "\1") + endOption));
    EXPECT_EQ(found.server, std::nullopt);
    EXPECT_EQ(found.leaseTime, std::nullopt);
}

TEST(DhcpReply, WithoutAnAddressItGivesNone) {
    std::string none = packet(endOption);
    none.replace(16, 4, 4, '\0');
    EXPECT_EQ(reply(none).address, std::nullopt);
}

Dhcp6Reply reply6(const std::string& packet) {
    const auto parsed = parseDhcp6Reply(bytes(packet));
    return std::get<Dhcp6Reply>(parsed);
}
bool isRefused6(const std::string& packet) {
    return std::holds_alternative<std::string_view>(parseDhcp6Reply(bytes(packet)));
}
std::string option6(int code, const std::string& value) {
    return std::string{'\0', static_cast<char>(code), '\0', static_cast<char>(value.size())} +
           value;
}
std::string address6(const std::string& lifetime) {
    std::string content(15, '\0');
    return option6(5, content.append(1, '\1').append(4, '\0').append(lifetime));
}
const std::string header6{"\7abc"};

TEST(Dhcp6Reply, CapturedByVersion9) {
    EXPECT_EQ(reply6(sample("dhcpcd-9/eth1.lease6")),
              (Dhcp6Reply{.addresses = {{.address = "2001:db8:99::142"_ip,
                                         .validLifetime = 600,
                                         .renewal = 300,
                                         .rebinding = 525}},
                          .options = {1, 2, 14, 3, 13, 7, 23},
                          .clientIdentifier = "00:01:00:01:32:93:90:69:52:54:00:00:00:02"}));
}

TEST(Dhcp6Reply, CapturedByVersion10) {
    EXPECT_EQ(reply6(sample("dhcpcd-10/eth1.lease6")),
              (Dhcp6Reply{.addresses = {{.address = "2001:db8:99::100"_ip,
                                         .validLifetime = 600,
                                         .renewal = 300,
                                         .rebinding = 525}},
                          .options = {1, 2, 3, 13, 23, 39},
                          .clientIdentifier = "00:01:00:01:32:93:91:cc:52:54:00:00:00:10"}));
}

TEST(Dhcp6Reply, BeginningsEndBetweenOptionsOrAreRefused) {
    const std::string whole = sample("dhcpcd-10/eth1.lease6");
    std::size_t accepted = 0;
    for (std::size_t size = 0; size < whole.size(); ++size) {
        accepted += isRefused6(whole.substr(0, size)) ? 0U : 1U;
    }
    EXPECT_EQ(accepted, 6U);  // behind the header and each of its options but the last
}

TEST(Dhcp6Reply, OtherMessagesAreRefused) {
    EXPECT_TRUE(isRefused6(""));
    EXPECT_TRUE(isRefused6("\7ab"));
    EXPECT_TRUE(isRefused6("\1abc"));
    EXPECT_EQ(reply6(header6), Dhcp6Reply{});
}

TEST(Dhcp6Reply, AddressesOfBothKindsOfAssociationsCount) {
    const std::string hour{"\0\0\x0e\x10", 4};
    const std::string na = option6(3, std::string(12, '\0') + address6(hour));
    const std::string ta = option6(4, std::string(4, '\0') + address6("\xff\xff\xff\xff"));
    EXPECT_EQ(reply6(header6 + na + ta),
              (Dhcp6Reply{.addresses = {{.address = "::1"_ip, .validLifetime = 3600},
                                        {.address = "::1"_ip, .validLifetime = UINT32_MAX}},
                          .options = {3, 4}}));
}

TEST(Dhcp6Reply, AnAddressWithoutALifetimeIsTakenBack) {
    const std::string none(4, '\0');
    EXPECT_THAT(reply6(header6 + option6(3, std::string(12, '\0') + address6(none))).addresses,
                testing::IsEmpty());
}

TEST(Dhcp6Reply, TooShortAssociationsAndAddressesAreRefused) {
    EXPECT_TRUE(isRefused6(header6 + option6(3, "short")));
    EXPECT_TRUE(isRefused6(header6 + option6(3, std::string(12, '\0') + option6(5, "short"))));
    EXPECT_TRUE(isRefused6(header6 + option6(4, "")));
}

}  // namespace
}  // namespace ZR::Live
