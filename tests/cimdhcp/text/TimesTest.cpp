#include "text/Times.h"

#include <gtest/gtest.h>

#include <limits>

namespace cimdhcp {
namespace {

constexpr std::int64_t now = 1'795'320'000;  // 2026-11-22T04:00:00Z

TEST(Moment, IsToldFromNow) {
    EXPECT_EQ(relativeText(now, now), "in 0 s");
    EXPECT_EQ(relativeText(now + 119, now), "in 119 s");
    EXPECT_EQ(relativeText(now + 120, now), "in 2 min");
    EXPECT_EQ(relativeText(now + 119 * 60, now), "in 119 min");
    EXPECT_EQ(relativeText(now + 2 * 3600 - 1, now), "in 2 h");
    EXPECT_EQ(relativeText(now + 4 * 3600 - 30, now), "in 4 h");
    EXPECT_EQ(relativeText(now + 47 * 3600, now), "in 47 h");
    EXPECT_EQ(relativeText(now + 48 * 3600, now), "in 2 d");
    EXPECT_EQ(relativeText(now + 100 * 86400, now), "in 100 d");
}

TEST(Moment, ThatHasPassedIsAgo) {
    EXPECT_EQ(relativeText(now - 1, now), "1 s ago");
    EXPECT_EQ(relativeText(now - 12 * 60, now), "12 min ago");
    EXPECT_EQ(relativeText(now - 3 * 86400, now), "3 d ago");
}

TEST(Moment, ThatIsFarAwayIsADate) {
    EXPECT_EQ(relativeText(now + 101 * 86400, now), "2027-03-03");
    EXPECT_EQ(relativeText(0, now), "1970-01-01");
    // No distance is too long to be worked out.
    EXPECT_EQ(relativeText(std::numeric_limits<std::int64_t>::max(), now), "9999-12-31");
    EXPECT_EQ(relativeText(std::numeric_limits<std::int64_t>::min(), now), "1970-01-01");
}

TEST(Moment, HasAFormForPrograms) {
    EXPECT_EQ(isoText(now), "2026-11-22T04:00:00Z");
    EXPECT_EQ(isoText(0), "1970-01-01T00:00:00Z");
    EXPECT_EQ(isoText(253'402'300'799), "9999-12-31T23:59:59Z");
    EXPECT_EQ(isoText(std::numeric_limits<std::int64_t>::max()), "9999-12-31T23:59:59Z");
}

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
