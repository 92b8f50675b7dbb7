#include "sources/TokenTracker.h"

#include <gtest/gtest.h>

namespace ZR {
namespace {

/// Goes on to an offset, as the parser does.
void advance(TokenTracker::Iterator& at, std::size_t count) {
    for (; count > 0; --count) {
        ++at;
    }
}

TEST(PlaceOf, CountsLinesAndBytesFromOne) {
    EXPECT_EQ(placeOf(0, ""), (TextPlace{1, 1}));
    EXPECT_EQ(placeOf(2, "ab\ncd"), (TextPlace{1, 3}));
    EXPECT_EQ(placeOf(3, "ab\ncd"), (TextPlace{2, 1}));
    EXPECT_EQ(placeOf(4, "ab\ncd"), (TextPlace{2, 2}));
    EXPECT_EQ(placeOf(99, "ab\ncd"), (TextPlace{2, 3}));
    EXPECT_EQ(placeOf(2, "\n\n"), (TextPlace{3, 1}));
    EXPECT_EQ(placeOf(2, "\xc3\xa4x"), (TextPlace{1, 3}));
}

TEST(TokenTracker, FindsTheStartOfEachToken) {
    TokenTracker tokens(" [\"a\" , 17,\n{");
    TokenTracker::Iterator at = tokens.begin();
    advance(at, 2);
    EXPECT_EQ(tokens.start(), 1U);
    tokens.pass(0);
    advance(at, 3);
    EXPECT_EQ(tokens.start(), 2U);
    tokens.pass(0);
    advance(at, 6);  // the number and the comma that ends it
    EXPECT_EQ(tokens.start(), 8U);
    tokens.pass(1);
    advance(at, 2);
    EXPECT_EQ(tokens.start(), 12U);
    EXPECT_TRUE(at == tokens.end());
}

TEST(TokenTracker, BeginsBehindAByteOrderMark) {
    const TokenTracker tokens("\xEF\xBB\xBF {");
    EXPECT_EQ(tokens.start(), 4U);
}

TEST(TokenTracker, BehindTheLastTokenIsTheEnd) {
    TokenTracker tokens("[  ");
    TokenTracker::Iterator at = tokens.begin();
    advance(at, 1);
    tokens.pass(0);
    EXPECT_EQ(tokens.start(), 3U);
}

}  // namespace
}  // namespace ZR
