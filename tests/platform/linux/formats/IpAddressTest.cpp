#include "formats/IpAddress.h"

#include <gtest/gtest.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <vector>

#include "LinuxSupport.h"

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

}  // namespace
}  // namespace ZR::Live
