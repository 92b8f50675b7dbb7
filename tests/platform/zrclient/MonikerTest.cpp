#include "zrclient/Moniker.h"

#include <gtest/gtest.h>

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
