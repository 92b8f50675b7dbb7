#include "text/Duration.h"

#include <gtest/gtest.h>

namespace cimdhcp {
namespace {

TEST(Duration, IsInSecondsToTheMillisecond) {
    using Seconds = std::chrono::duration<double>;
    EXPECT_EQ(durationText(Seconds(0)), "0.000 s");
    EXPECT_EQ(durationText(Seconds(0.0123)), "0.012 s");
    EXPECT_EQ(durationText(Seconds(1.9999)), "2.000 s");
    EXPECT_EQ(durationText(Seconds(75.5)), "75.500 s");
    EXPECT_EQ(durationText(Seconds(-1)), "0.000 s");
}

}  // namespace
}  // namespace cimdhcp
