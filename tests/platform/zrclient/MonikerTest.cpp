#include <gtest/gtest.h>

#include <climits>

#include "zrclient/Moniker.h"
#include "zrclient/NodeLexicon.h"

namespace ZR {
namespace {

TEST(Moniker, KeepsKeysInTheirOrder) {
    Moniker moniker;
    moniker.addKey("Name", "eth0");
    moniker.addKey("SystemName", "host");
    ASSERT_EQ(moniker.getKeyCount(), 2U);
    std::string name;
    std::string value;
    ASSERT_TRUE(moniker.selectKey(1));
    EXPECT_TRUE(moniker.getName(name));
    EXPECT_TRUE(moniker.getValue(value));
    EXPECT_EQ(name, "SystemName");
    EXPECT_EQ(value, "host");
    ASSERT_TRUE(moniker.selectKey(0));
    EXPECT_TRUE(moniker.getName(name));
    EXPECT_TRUE(moniker.getValue(value));
    EXPECT_EQ(name, "Name");
    EXPECT_EQ(value, "eth0");
}

TEST(Moniker, HasNothingSelectedAtFirst) {
    Moniker moniker;
    moniker.addKey("Name", "eth0");
    std::string text = "untouched";
    EXPECT_FALSE(moniker.getName(text));
    EXPECT_FALSE(moniker.getValue(text));
    EXPECT_EQ(text, "untouched");
}

TEST(Moniker, AnEmptyOneHasNoKeyToSelect) {
    Moniker moniker;
    EXPECT_EQ(moniker.getKeyCount(), 0U);
    EXPECT_FALSE(moniker.selectKey(0));
    EXPECT_FALSE(moniker.selectKey(static_cast<std::size_t>(-1)));
}

TEST(Moniker, SelectingOutOfRangeKeepsTheSelection) {
    Moniker moniker;
    moniker.addKey("Name", "eth0");
    ASSERT_TRUE(moniker.selectKey(0));
    EXPECT_FALSE(moniker.selectKey(1));
    EXPECT_FALSE(moniker.selectKey(static_cast<std::size_t>(-1)));
    std::string value;
    EXPECT_TRUE(moniker.getValue(value));
    EXPECT_EQ(value, "eth0");
}

TEST(Moniker, KeepsAKeyGivenTwice) {
    Moniker moniker;
    moniker.addKey("Name", "first");
    moniker.addKey("Name", "second");
    ASSERT_EQ(moniker.getKeyCount(), 2U);
    std::string value;
    ASSERT_TRUE(moniker.selectKey(0));
    ASSERT_TRUE(moniker.getValue(value));
    EXPECT_EQ(value, "first");
    ASSERT_TRUE(moniker.selectKey(1));
    ASSERT_TRUE(moniker.getValue(value));
    EXPECT_EQ(value, "second");
}

TEST(Moniker, AddingAKeyKeepsTheSelection) {
    Moniker moniker;
    moniker.addKey("Name", "eth0");
    ASSERT_TRUE(moniker.selectKey(0));
    moniker.addKey("SystemName", "host");
    std::string name;
    ASSERT_TRUE(moniker.getName(name));
    EXPECT_EQ(name, "Name");
}

TEST(Moniker, IsEqualByKeysInOrderWhateverIsSelected) {
    Moniker one;
    one.addKey("Name", "eth0");
    one.addKey("SystemName", "host");
    Moniker same = one;
    ASSERT_TRUE(same.selectKey(1));
    EXPECT_EQ(one, same);

    Moniker reversed;
    reversed.addKey("SystemName", "host");
    reversed.addKey("Name", "eth0");
    EXPECT_FALSE(one == reversed);

    Moniker longer = one;
    longer.addKey("Name", "eth0");
    EXPECT_FALSE(one == longer);
    EXPECT_EQ(Moniker(), Moniker());
}

TEST(Moniker, AcceptsAnyBytes) {
    Moniker moniker;
    moniker.addKey("", std::string("\0a\n", 3));
    ASSERT_TRUE(moniker.selectKey(0));
    std::string name = "full";
    std::string value;
    ASSERT_TRUE(moniker.getName(name));
    ASSERT_TRUE(moniker.getValue(value));
    EXPECT_TRUE(name.empty());
    EXPECT_EQ(value, std::string("\0a\n", 3));
}

}  // namespace
}  // namespace ZR

namespace {

using ZR::NodeLexicon::addressOriginOf;

TEST(NodeLexicon, AddressSourcesHaveTheirAddressOrigins) {
    EXPECT_EQ(addressOriginOf(0), 0) << "unknown";
    EXPECT_EQ(addressOriginOf(1), 4) << "DHCP";
    EXPECT_EQ(addressOriginOf(2), 5) << "BOOTP";
    EXPECT_EQ(addressOriginOf(3), 3) << "static";
    EXPECT_EQ(addressOriginOf(4), 6) << "IPv4 link local";
    EXPECT_EQ(addressOriginOf(5), 1) << "other";
}

TEST(NodeLexicon, NumberThatIsNotAnAddressSourceHasAnUnknownOrigin) {
    EXPECT_EQ(addressOriginOf(6), 0);
    EXPECT_EQ(addressOriginOf(UINT_MAX), 0);
}

TEST(NodeLexicon, NumbersAndNamesFindEachOther) {
    for (const auto& entry : ZR::NodeLexicon::nodeTypes) {
        EXPECT_EQ(nameOf(entry.number), entry.name);
        EXPECT_EQ(ZR::NodeLexicon::nodeTypeOf(entry.name), entry.number);
    }
    for (const auto& entry : ZR::NodeLexicon::properties) {
        EXPECT_EQ(nameOf(entry.number), entry.name);
        EXPECT_EQ(ZR::NodeLexicon::propertyOf(entry.name), entry.number);
    }
    EXPECT_EQ(nameOf(ZR::NodeLexicon::NodeType{1}), "");
    EXPECT_EQ(nameOf(ZR::NodeLexicon::Properties{1}), "");
    EXPECT_EQ(ZR::NodeLexicon::nodeTypeOf("Network"), std::nullopt);
    EXPECT_EQ(ZR::NodeLexicon::propertyOf("name"), std::nullopt);
}

}  // namespace
