#include "zrclient/NodeLexicon.h"

#include <gtest/gtest.h>

#include <climits>

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
