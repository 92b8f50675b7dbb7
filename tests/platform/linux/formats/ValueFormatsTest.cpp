// Addresses, names, numbers and times as text.
#include <gtest/gtest.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <vector>

#include "LinuxSupport.h"
#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"
#include "formats/ValueFormats.h"

namespace ZR::Live {
namespace {

constexpr std::array<std::byte, 4> four{std::byte{198}, std::byte{51}, std::byte{100},
                                        std::byte{1}};

std::optional<std::string> textOf(const std::optional<IpAddress>& address) {
    return address ? std::optional{address->text()} : std::nullopt;
}

TEST(IpAddress, HasATextInBothFamilies) {
    std::array<std::byte, 16> sixteen{};
    sixteen[0] = std::byte{0xfe};
    sixteen[1] = std::byte{0x80};
    sixteen[15] = std::byte{1};
    EXPECT_EQ(textOf(IpAddress::fromBytes(AF_INET, four)), "198.51.100.1");
    EXPECT_EQ(textOf(IpAddress::fromBytes(AF_INET6, sixteen)), "fe80::1");
}

TEST(IpAddress, RefusesAnotherLengthOrFamily) {
    constexpr std::array<std::byte, 5> five{};
    EXPECT_EQ(IpAddress::fromBytes(AF_INET, five), std::nullopt);
    EXPECT_EQ(IpAddress::fromBytes(AF_INET, {}), std::nullopt);
    EXPECT_EQ(IpAddress::fromBytes(AF_INET6, four), std::nullopt);
    EXPECT_EQ(IpAddress::fromBytes(AF_UNIX, four), std::nullopt);
    EXPECT_EQ(IpAddress::fromText(AF_UNIX, "198.51.100.1"), std::nullopt);
}

TEST(IpAddress, GivesBackItsFamilyAndBytes) {
    const auto address = IpAddress::fromBytes(AF_INET, four);
    ASSERT_TRUE(address);
    EXPECT_EQ(address->family(), AF_INET);
    EXPECT_TRUE(address->isIPv4());
    EXPECT_TRUE(std::ranges::equal(address->bytes(), four));
    EXPECT_EQ("fe80::1"_ip.family(), AF_INET6);
    EXPECT_FALSE("fe80::1"_ip.isIPv4());
    EXPECT_EQ("fe80::1"_ip.bytes().size(), 16U);
}

TEST(IpAddress, EqualAddressesHaveOneForm) {
    EXPECT_EQ(textOf(IpAddress::fromText(AF_INET6, "2001:DB8:99:0:0:0:0:14d")), "2001:db8:99::14d");
    EXPECT_EQ(IpAddress::fromText(AF_INET6, "2001:DB8:99:0:0:0:0:14d"), "2001:db8:99::14d"_ip);
    EXPECT_EQ(textOf(IpAddress::fromText(AF_INET, "198.51.100.106")), "198.51.100.106");
}

TEST(IpAddress, DiffersByFamilyAndByEveryByte) {
    std::vector<IpAddress> addresses{"0.0.0.0"_ip, "::"_ip, "0.0.0.1"_ip, "1.0.0.0"_ip, "::1"_ip};
    std::sort(addresses.begin(), addresses.end());
    EXPECT_EQ(std::adjacent_find(addresses.begin(), addresses.end()), addresses.end());
    EXPECT_LT("9.0.0.0"_ip, "10.0.0.0"_ip) << "in the order of the bytes, not of the texts";
}

TEST(IpAddress, ThatOfZeroesIsUnspecified) {
    EXPECT_TRUE("0.0.0.0"_ip.isUnspecified());
    EXPECT_TRUE("::"_ip.isUnspecified());
    EXPECT_FALSE("0.0.0.1"_ip.isUnspecified());
    EXPECT_FALSE("::1"_ip.isUnspecified());
}

TEST(IpAddress, RefusesTextsThatAreNotOne) {
    for (const std::string_view text :
         {std::string_view{""}, std::string_view{"198.51.100"}, std::string_view{"198.51.100.256"},
          std::string_view{"198.51.100.1 "}, std::string_view{"198.51.100.1\0x", 14},
          std::string_view{"::1"}, std::string_view{"example"}}) {
        EXPECT_EQ(IpAddress::fromText(AF_INET, text), std::nullopt) << text;
    }
}

TEST(IpAddress, OfIPv4MayHaveAPrefixLengthBehindIt) {
    EXPECT_EQ(IpAddress::ipv4FromText("198.51.100.1"), "198.51.100.1"_ip);
    EXPECT_EQ(IpAddress::ipv4FromText("198.51.100.1/24"), "198.51.100.1"_ip);
    EXPECT_EQ(IpAddress::ipv4FromText("/24"), std::nullopt);
    EXPECT_EQ(IpAddress::ipv4FromText("2001:db8::1/64"), std::nullopt);
}

TEST(InterfaceName, IsWhatTheKernelTakes) {
    for (const std::string_view text : {"e", "eth0", "fifteen-letters", "...", "a.b", "\xc3\xa9"}) {
        const auto name = InterfaceName::from(text);
        ASSERT_TRUE(name) << text;
        EXPECT_EQ(name->view(), text);
    }
}

TEST(InterfaceName, IsNothingElse) {
    for (const std::string_view text :
         {std::string_view{""}, std::string_view{"."}, std::string_view{".."},
          std::string_view{"a/b"}, std::string_view{"sixteen--letters"},
          std::string_view{"two words"}, std::string_view{"tab\t"}, std::string_view{"line\n"},
          std::string_view{"a\0b", 3}}) {
        EXPECT_EQ(InterfaceName::from(text), std::nullopt) << text;
    }
}

TEST(InterfaceName, IsOrderedByItsBytes) {
    EXPECT_EQ("eth1"_name, "eth1"_name);
    EXPECT_NE("eth1"_name, "eth10"_name);
    EXPECT_LT("eth1"_name, "eth10"_name);
    EXPECT_LT("eth10"_name, "eth2"_name);
    EXPECT_LT("eth2"_name, "eth\xff"_name);
}

TEST(Numbers, TheWholeTextIsTheNumber) {
    EXPECT_EQ(parseNumber<std::uint32_t>("4294967295"), UINT32_MAX);
    EXPECT_EQ(parseNumber<std::int64_t>("-1"), -1);
    EXPECT_EQ(parseNumber<std::uint16_t>("0044", 16), 68);
}

TEST(Numbers, AnythingElseIsNone) {
    for (const char* text : {"", " 1", "1 ", "1x", "x", "0x1", "+1", "4294967296"}) {
        EXPECT_EQ(parseNumber<std::uint32_t>(text), std::nullopt) << text;
    }
    EXPECT_EQ(parseNumber<std::uint32_t>("-1"), std::nullopt);
}

TEST(TimeSpan, AllSpellings) {
    EXPECT_EQ(parseTimeSpan("600"), 600U);
    EXPECT_EQ(parseTimeSpan("10min"), 600U);
    EXPECT_EQ(parseTimeSpan("8min 45s"), 525U);
    EXPECT_EQ(parseTimeSpan(" 1h  30min "), 5400U);
    EXPECT_EQ(parseTimeSpan("1y 2month 3w 4d 5h 6min 7s"),
              31557600U + 2 * 2629800U + 3 * 604800U + 4 * 86400U + 5 * 3600U + 6 * 60U + 7);
    EXPECT_EQ(parseTimeSpan("1s 999ms 999us"), 1U);
    EXPECT_EQ(parseTimeSpan("2 min"), 120U);
    EXPECT_EQ(parseTimeSpan("0"), 0U);
}

TEST(TimeSpan, BothFormsOfInfinity) {
    EXPECT_EQ(parseTimeSpan("infinity"), infiniteTime);
    EXPECT_EQ(parseTimeSpan("4294967295"), infiniteTime);
}

TEST(TimeSpan, WhatIsNotATimeSpanIsNone) {
    for (const char* text :
         {"", " ", "min", "1fortnight", "-1", "1.5h", "1 2x", "99999999999999999",
          "99999999999999999999999", "infinity 1s", "18446744073709551615us 1us"}) {
        EXPECT_EQ(parseTimeSpan(text), std::nullopt) << text;
    }
}

}  // namespace
}  // namespace ZR::Live
