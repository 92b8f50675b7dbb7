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

TEST(NodeLexicon, NumberThatIsNoAddressSourceHasAnUnknownOrigin) {
    EXPECT_EQ(addressOriginOf(6), 0);
    EXPECT_EQ(addressOriginOf(UINT_MAX), 0);
}

}  // namespace
