#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "Lindows/DHCPSettingData.h"
#include "kit/LogCapture.h"

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

TEST(StringTokenize, IsTracedAsAFunctionOfTheSettingData) {
    const Testing::LogCapture log;
    split("a%b", "%");
    ASSERT_EQ(log.log().size(), 2U);
    EXPECT_EQ(log.logMessages(), log.traceMessages());
    for (const auto& line : log.log()) {
        EXPECT_EQ(line.level, 3000);
        EXPECT_EQ(line.category, "Merrow.DHCPClientProvider");
        EXPECT_EQ(line.file, "Lindows/DHCPSettingData");
        EXPECT_EQ(line.function, "stringTokenize");
        EXPECT_THAT(line.message,
                    ::testing::MatchesRegex("(ENTERING|EXITING): stringTokenize\\(\\) in "
                                            "Lindows/DHCPSettingData \\[Line: [0-9]+\\],"
                                            "Parameters List:  text=a%b tokens=0x[0-9a-f]+ "
                                            "delimiters=%"));
    }
    EXPECT_TRUE(log.log().front().message.starts_with("ENTERING"));
    EXPECT_TRUE(log.log().back().message.starts_with("EXITING"));
}

}  // namespace

}  // namespace ZR
