#include "kernel/Link.h"

#include <gtest/gtest.h>
#include <linux/if_link.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

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
