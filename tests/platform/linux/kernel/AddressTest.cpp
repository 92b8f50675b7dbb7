#include "kernel/Address.h"

#include <gtest/gtest.h>
#include <linux/if_addr.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

constexpr std::array<std::uint8_t, 4> own{198, 51, 100, 7};
constexpr std::array<std::uint8_t, 4> peer{198, 51, 100, 9};

TEST(Address, EverythingThatTheKernelTells) {
    constexpr ifa_cacheinfo cache{.ifa_prefered = 500, .ifa_valid = 600, .cstamp = 1, .tstamp = 2};
    Message message = addressMessage(4, own, 0);
    message.number(IFA_CACHEINFO, cache).number(IFA_FLAGS, std::uint32_t{0x200});
    EXPECT_EQ(parseAddress(message.bytes()), (Address{.ifindex = 4,
                                                      .ip = "198.51.100.7"_ip,
                                                      .flags = 0x200,
                                                      .scope = 0,
                                                      .validLifetime = 600}));
}

TEST(Address, WithoutItsOwnAttributeTheFlagsAreThoseOfTheHeader) {
    const auto address = parseAddress(addressMessage(4, own, 0x80).bytes());
    ASSERT_TRUE(address);
    EXPECT_EQ(address->flags, 0x80U);
    EXPECT_EQ(address->validLifetime, Address::infinite);
}

TEST(Address, OnPointToPointLinksTheLocalEndCounts) {
    ifaddrmsg info{};
    info.ifa_family = 2;
    info.ifa_index = 4;
    Message message{RTM_NEWADDR, 0, info};
    message.attribute(IFA_LOCAL, std::as_bytes(std::span{own}));
    message.attribute(IFA_ADDRESS, std::as_bytes(std::span{peer}));
    EXPECT_EQ(parseAddress(message.bytes())->ip, "198.51.100.7"_ip);
}

TEST(Address, IPv6HasOneAttributeOnly) {
    ifaddrmsg info{};
    info.ifa_family = 10;
    info.ifa_index = 4;
    info.ifa_scope = 253;
    constexpr std::array<std::uint8_t, 16> linkLocal{0xfe, 0x80, 0, 0, 0, 0, 0, 0,
                                                     0,    0,    0, 0, 0, 0, 0, 1};
    Message message{RTM_NEWADDR, 0, info};
    message.attribute(IFA_ADDRESS, std::as_bytes(std::span{linkLocal}));
    const auto address = parseAddress(message.bytes());
    ASSERT_TRUE(address);
    EXPECT_EQ(address->ip, "fe80::1"_ip);
    EXPECT_EQ(address->scope, 253);
}

TEST(Address, AnAddressOfTheWrongLengthIsNone) {
    ifaddrmsg info{};
    info.ifa_family = 10;
    info.ifa_index = 4;
    Message message{RTM_NEWADDR, 0, info};
    message.attribute(IFA_ADDRESS, std::as_bytes(std::span{own}));
    EXPECT_FALSE(parseAddress(message.bytes()));
    Message empty{RTM_NEWADDR, 0, info};
    EXPECT_FALSE(parseAddress(empty.bytes()));
}

TEST(Address, OtherFamiliesAreNone) {
    ifaddrmsg info{};
    info.ifa_family = 1;
    info.ifa_index = 4;
    Message message{RTM_NEWADDR, 0, info};
    message.attribute(IFA_ADDRESS, std::as_bytes(std::span{own}));
    EXPECT_FALSE(parseAddress(message.bytes()));
}

TEST(Address, AttributesOfAnImpossibleLengthMakeTheMessageUnreadable) {
    constexpr nlattr empty{};
    EXPECT_FALSE(parseAddress(addressMessage(1, own).raw(&empty, sizeof empty).bytes()));
    constexpr nlattr tooLong{.nla_len = 65535, .nla_type = IFA_CACHEINFO};
    EXPECT_FALSE(parseAddress(addressMessage(1, own).raw(&tooLong, sizeof tooLong).bytes()));
}

TEST(Address, EveryCutOfAMessageIsReadWithinItsBounds) {
    const Message message = addressMessage(4, own);
    for (std::size_t length = 0; length < message.bytes().size(); ++length) {
        const std::vector<std::byte> cut{
            message.bytes().begin(), message.bytes().begin() + static_cast<std::ptrdiff_t>(length)};
        EXPECT_FALSE(parseAddress(cut)) << length;
    }
}

}  // namespace
}  // namespace ZR::Live
