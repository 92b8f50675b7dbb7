// What the messages of the kernel say.
#include <gtest/gtest.h>
#include <linux/if_addr.h>
#include <linux/if_link.h>
#include <linux/netlink.h>

#include <array>
#include <span>
#include <vector>

#include "LinuxSupport.h"
#include "kernel/Address.h"
#include "kernel/Attributes.h"
#include "kernel/Link.h"

namespace ZR::Live {
namespace {

std::vector<std::byte> bytesOf(std::initializer_list<unsigned> values) {
    std::vector<std::byte> bytes;
    for (const unsigned value : values) {
        bytes.push_back(static_cast<std::byte>(value));
    }
    return bytes;
}

/// What an attribute begins with, in this machine's byte order.
std::vector<std::byte> header(std::uint16_t length, std::uint16_t type) {
    const nlattr head{.nla_len = length, .nla_type = type};
    const auto bytes = std::as_bytes(std::span{&head, 1});
    return {bytes.begin(), bytes.end()};
}

std::vector<std::byte> joined(const std::vector<std::vector<std::byte>>& parts) {
    std::vector<std::byte> all;
    for (const auto& part : parts) {
        all.insert(all.end(), part.begin(), part.end());
    }
    return all;
}

std::vector<std::uint16_t> typesIn(const std::vector<std::byte>& bytes, bool& malformed) {
    std::vector<std::uint16_t> types;
    AttributeWalk walk{bytes};
    for (Attribute attribute; walk.next(attribute);) {
        types.push_back(attribute.type);
    }
    malformed = walk.malformed();
    return types;
}

TEST(Attributes, WalksOverPaddingAndEmptyPayloads) {
    bool malformed = true;
    const auto types = typesIn(joined({header(5, 1), bytesOf({0xff, 0, 0, 0}), header(4, 2),
                                       header(5, 3), bytesOf({0xff})}),
                               malformed);
    EXPECT_EQ(types, (std::vector<std::uint16_t>{1, 2, 3}));
    EXPECT_FALSE(malformed);
}

TEST(Attributes, FlagBitsAreNotPartOfTheType) {
    bool malformed = true;
    EXPECT_EQ(typesIn(header(4, 0x8012), malformed), (std::vector<std::uint16_t>{18}));
}

TEST(Attributes, LengthZeroEndsTheWalk) {
    bool malformed = false;
    EXPECT_TRUE(typesIn(joined({header(0, 1), header(4, 2)}), malformed).empty());
    EXPECT_TRUE(malformed);
}

TEST(Attributes, LengthBeyondTheEndEndsTheWalk) {
    bool malformed = false;
    EXPECT_EQ(typesIn(joined({header(4, 1), header(9, 2), bytesOf({1, 1, 1, 1})}), malformed),
              (std::vector<std::uint16_t>{1}));
    EXPECT_TRUE(malformed);
}

TEST(Attributes, AnyLengthAtAnyAlignmentIsWalked) {
    // Each cut of a valid row of attributes, at each alignment: nothing is read
    // outside the bytes (the sanitizers watch), and the walk ends.
    const auto whole = joined(
        {header(5, 1), bytesOf({7, 0, 0, 0}), header(8, 2), bytesOf({1, 2, 3, 4}), header(4, 3)});
    for (std::size_t shift = 0; shift < 4; ++shift) {
        for (std::size_t length = 0; length <= whole.size(); ++length) {
            std::vector<std::byte> shifted(shift);
            shifted.insert(shifted.end(), whole.begin(),
                           whole.begin() + static_cast<std::ptrdiff_t>(length));
            shifted.shrink_to_fit();
            AttributeWalk walk{std::span{shifted}.subspan(shift)};
            int count = 0;
            for (Attribute attribute; walk.next(attribute);) {
                ++count;
            }
            EXPECT_LE(count, 3);
        }
    }
}

TEST(Attributes, NumbersOfTooFewBytesAreNone) {
    EXPECT_EQ(valueAt<std::uint32_t>(bytesOf({1, 0, 0})), std::nullopt);
    EXPECT_EQ(valueAt<std::uint32_t>(bytesOf({1, 1, 1, 1})), 0x01010101U);
}

TEST(Attributes, TextEndsAtItsNulOrAtTheEnd) {
    EXPECT_EQ(textOf(bytesOf({'l', 'o', 0, 'x'})), "lo");
    EXPECT_EQ(textOf(bytesOf({'l', 'o'})), "lo");
    EXPECT_EQ(textOf({}), "");
}

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

constexpr std::uint16_t parentDeviceName = 56;
constexpr std::uint16_t alternativeNames = 52;

std::vector<std::byte> linkInfo(const std::string& kind, const std::string& slaveKind) {
    // The payload of a nested attribute looks like the attributes of a message.
    Message message{0, 0, std::uint32_t{0}};
    if (!kind.empty()) {
        message.text(IFLA_INFO_KIND, kind);
    }
    if (!slaveKind.empty()) {
        message.text(IFLA_INFO_SLAVE_KIND, slaveKind);
    }
    const auto& bytes = message.bytes();
    return {bytes.begin() + sizeof(nlmsghdr) + sizeof(std::uint32_t), bytes.end()};
}

constexpr std::array<std::uint8_t, 6> hardwareAddress{0x52, 0x93, 0xd4, 0xee, 0x0e, 0xca};

TEST(Link, EverythingThatTheKernelTells) {
    Message message = linkMessage(7, "eth0", 0x11043);
    message.number(IFLA_OPERSTATE, std::uint8_t{6})
        .number(IFLA_CARRIER, std::uint8_t{1})
        .number(IFLA_MASTER, std::uint32_t{9})
        .text(parentDeviceName, "0000:00:03.0")
        .text(IFLA_QDISC, "fq_codel")
        .attribute(IFLA_ADDRESS, std::as_bytes(std::span{hardwareAddress}))
        .number(IFLA_LINK_NETNSID, std::int32_t{3});
    EXPECT_EQ(parseLink(message.bytes()), (Link{.ifindex = 7,
                                                .name = "eth0"_name,
                                                .flags = 0x11043,
                                                .operstate = 6,
                                                .arphrdType = 1,
                                                .kind = "",
                                                .slaveKind = "",
                                                .master = 9,
                                                .hasParentDevice = true,
                                                .carrier = true,
                                                .hardwareAddress = "5293d4ee0eca",
                                                .farNamespace = 3}));
}

TEST(Link, AHardwareAddressHasSixBytes) {
    for (const std::size_t size : {0U, 4U, 5U}) {
        Message message = linkMessage(7, "eth0");
        message.attribute(IFLA_ADDRESS, std::as_bytes(std::span{hardwareAddress}).first(size));
        EXPECT_EQ(parseLink(message.bytes())->hardwareAddress, "") << size;
    }
}

TEST(Link, KindAndSlaveKindAreNested) {
    Message message = linkMessage(3, "port0");
    Message nested = linkMessage(3, "port0");
    nested.attribute(IFLA_LINKINFO, linkInfo("veth", "bridge"));
    const auto link = parseLink(nested.bytes());
    ASSERT_TRUE(link);
    EXPECT_EQ(link->kind, "veth");
    EXPECT_EQ(link->slaveKind, "bridge");
    EXPECT_EQ(parseLink(message.bytes())->kind, "");
}

TEST(Link, AlternativeNamesAreNotNames) {
    Message message = linkMessage(3, "eth0");
    message.text(alternativeNames, "a-much-longer-alternative-name");
    EXPECT_EQ(parseLink(message.bytes())->name, "eth0"_name);
}

TEST(Link, NamesThatTheKernelWouldRefuseAreRefused) {
    EXPECT_TRUE(parseLink(linkMessage(1, "fifteen-letters").bytes()));
    for (const char* name : {"", ".", "..", "a/b", "sixteen--letters", "two words"}) {
        EXPECT_FALSE(parseLink(linkMessage(1, name).bytes())) << name;
    }
}

TEST(Link, MessagesOfAnotherTypeAreNone) {
    EXPECT_FALSE(parseLink(addressMessage(1, {1, 2, 3, 4}).bytes()));
    EXPECT_FALSE(parseLink({}));
}

TEST(Link, LinksWithoutAnIndexAreNone) {
    EXPECT_FALSE(parseLink(linkMessage(0, "eth0").bytes()));
    EXPECT_FALSE(parseLink(linkMessage(-1, "eth0").bytes()));
}

TEST(Link, AttributesOfAnImpossibleLengthMakeTheMessageUnreadable) {
    constexpr nlattr empty{};  // length 0, less than its own header
    EXPECT_FALSE(parseLink(linkMessage(1, "eth0").raw(&empty, sizeof empty).bytes()));
    constexpr nlattr tooLong{.nla_len = 400, .nla_type = IFLA_OPERSTATE};
    EXPECT_FALSE(parseLink(linkMessage(1, "eth0").raw(&tooLong, sizeof tooLong).bytes()));
}

TEST(Link, ANestedAttributeOfAnImpossibleLengthMakesTheMessageUnreadable) {
    constexpr std::array<std::byte, 8> nested{std::byte{99}};
    EXPECT_FALSE(parseLink(linkMessage(1, "eth0").attribute(IFLA_LINKINFO, nested).bytes()));
}

TEST(Link, NumbersOfTooFewBytesCountAsNotTold) {
    Message message = linkMessage(1, "eth0");
    message.attribute(IFLA_MASTER, {}).attribute(IFLA_CARRIER, {}).attribute(IFLA_OPERSTATE, {});
    const auto link = parseLink(message.bytes());
    ASSERT_TRUE(link);
    EXPECT_EQ(link->master, 0U);
    EXPECT_EQ(link->carrier, std::nullopt);
}

TEST(Link, EveryCutOfAMessageIsReadWithinItsBounds) {
    Message message = linkMessage(7, "eth0");
    message.attribute(IFLA_LINKINFO, linkInfo("bridge", "")).number(IFLA_MASTER, 9);
    for (std::size_t length = 0; length < message.bytes().size(); ++length) {
        // A copy of exactly that length, so that the sanitizers see any step beyond.
        const std::vector<std::byte> cut{
            message.bytes().begin(), message.bytes().begin() + static_cast<std::ptrdiff_t>(length)};
        EXPECT_FALSE(parseLink(cut)) << length;
    }
}

TEST(Link, EveryClaimedLengthIsReadWithinItsBounds) {
    Message message = linkMessage(7, "eth0");
    message.number(IFLA_MASTER, 9);
    for (std::uint32_t length = 0; length < 200; ++length) {
        const auto link = parseLink(message.claimLength(length).bytes());
        if (length > message.bytes().size()) {
            EXPECT_FALSE(link);
        }
    }
}

}  // namespace
}  // namespace ZR::Live
