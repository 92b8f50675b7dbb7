#include "formats/AddressText.h"

#include <gtest/gtest.h>
#include <sys/socket.h>

#include <array>

namespace ZR::Live {
namespace {

TEST(AddressText, PrintsBothFamilies) {
    constexpr std::array<std::byte, 4> four{std::byte{198}, std::byte{51}, std::byte{100},
                                            std::byte{1}};
    std::array<std::byte, 16> sixteen{};
    sixteen[0] = std::byte{0xfe};
    sixteen[1] = std::byte{0x80};
    sixteen[15] = std::byte{1};
    EXPECT_EQ(addressText(AF_INET, four), "198.51.100.1");
    EXPECT_EQ(addressText(AF_INET6, sixteen), "fe80::1");
}

TEST(AddressText, RefusesAnotherLengthOrFamily) {
    constexpr std::array<std::byte, 5> five{};
    EXPECT_EQ(addressText(AF_INET, five), std::nullopt);
    EXPECT_EQ(addressText(AF_INET, {}), std::nullopt);
    EXPECT_EQ(addressText(AF_UNIX, five), std::nullopt);
}

TEST(AddressText, EqualAddressesHaveOneForm) {
    EXPECT_EQ(canonicalAddress(AF_INET6, "2001:DB8:99:0:0:0:0:14d"), "2001:db8:99::14d");
    EXPECT_EQ(canonicalAddress(AF_INET, "198.51.100.106"), "198.51.100.106");
}

TEST(AddressText, RefusesWhatIsNoAddress) {
    for (const std::string_view text :
         {std::string_view{""}, std::string_view{"198.51.100"}, std::string_view{"198.51.100.256"},
          std::string_view{"198.51.100.1 "}, std::string_view{"198.51.100.1\0x", 14},
          std::string_view{"::1"}, std::string_view{"example"}}) {
        EXPECT_EQ(canonicalAddress(AF_INET, text), std::nullopt) << text;
    }
}

}  // namespace
}  // namespace ZR::Live
