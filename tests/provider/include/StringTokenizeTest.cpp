#include "include/StringTokenize.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace ZR {

namespace {

using Tokens = std::vector<std::string>;

Tokens split(const std::string& text, const std::string& delimiters) {
    Tokens tokens;
    stringTokenize(text, tokens, delimiters);
    return tokens;
}

TEST(StringTokenize, SplitsAtTheDelimiter) {
    EXPECT_EQ(split("Computer%eth0", "%"), (Tokens{"Computer", "eth0"}));
}

TEST(StringTokenize, RunsOfDelimitersAndThoseAtTheEndsYieldNothing) {
    EXPECT_EQ(split(",a,,b,", ","), (Tokens{"a", "b"}));
}

TEST(StringTokenize, TextWithoutADelimiterIsOneToken) {
    EXPECT_EQ(split("eth0", "%"), Tokens{"eth0"});
}

TEST(StringTokenize, EmptyTextHasNone) {
    EXPECT_EQ(split("", ","), Tokens{});
}

TEST(StringTokenize, NothingButDelimitersHasNone) {
    EXPECT_EQ(split(",,,", ","), Tokens{});
}

TEST(StringTokenize, EveryCharacterOfTheDelimitersIsOne) {
    EXPECT_EQ(split("a,b;c;,d", ",;"), (Tokens{"a", "b", "c", "d"}));
}

TEST(StringTokenize, WithoutDelimitersTheTextIsOneToken) {
    EXPECT_EQ(split(",a,", ""), Tokens{",a,"});
    EXPECT_EQ(split("", ""), Tokens{});
}

TEST(StringTokenize, TokensAreAppended) {
    Tokens tokens{"present"};
    stringTokenize("a%b", tokens, "%");
    stringTokenize("", tokens, "%");
    stringTokenize("c", tokens, "%");
    EXPECT_EQ(tokens, (Tokens{"present", "a", "b", "c"}));
}

TEST(StringTokenize, ZeroBytesAreTextAndCanBeDelimiters) {
    const std::string text("a\0b%c", 5);
    EXPECT_EQ(split(text, "%"), (Tokens{std::string("a\0b", 3), "c"}));
    EXPECT_EQ(split(text, std::string(1, '\0')), (Tokens{"a", "b%c"}));
}

}  // namespace

}  // namespace ZR
