#include "text/Style.h"

#include <gtest/gtest.h>

namespace cimdhcp {
namespace {

TEST(Color, IsForTerminalsUnlessSomebodySaysOtherwise) {
    EXPECT_TRUE(wantsColor(ColorMode::automatic, true, nullptr, "xterm"));
    EXPECT_TRUE(wantsColor(ColorMode::automatic, true, "", nullptr));
    EXPECT_FALSE(wantsColor(ColorMode::automatic, false, nullptr, "xterm"));
    EXPECT_FALSE(wantsColor(ColorMode::automatic, true, "1", "xterm"));
    EXPECT_FALSE(wantsColor(ColorMode::automatic, true, nullptr, "dumb"));
}

TEST(Color, IsAsWantedOtherwise) {
    EXPECT_TRUE(wantsColor(ColorMode::always, false, "1", "dumb"));
    EXPECT_FALSE(wantsColor(ColorMode::never, true, nullptr, "xterm"));
}

TEST(Style, LeavesTextAsItIsWithoutColor) {
    EXPECT_EQ(Style{}.strong("a"), "a");
    EXPECT_EQ(Style{}.alarming("a"), "a");
    const Style colored{true, true};
    EXPECT_EQ(colored.strong("a"), "\x1B[1ma\x1B[0m");
    EXPECT_EQ(colored.alarming("a"), "\x1B[31ma\x1B[0m");
}

}  // namespace
}  // namespace cimdhcp
