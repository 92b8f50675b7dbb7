#include "formats/TimeSpan.h"

#include <gtest/gtest.h>

namespace ZR::Live {
namespace {

TEST(TimeSpan, AllSpellings) {
    EXPECT_EQ(parseTimeSpan("600"), 600U);
    EXPECT_EQ(parseTimeSpan("10min"), 600U);
    EXPECT_EQ(parseTimeSpan("8min 45s"), 525U);
    EXPECT_EQ(parseTimeSpan(" 1h  30min "), 5400U);
    EXPECT_EQ(parseTimeSpan("1y 2month 3w 4d 5h 6min 7s"),
              31557600U + 2 * 2629800U + 3 * 604800U + 4 * 86400U + 5 * 3600U + 6 * 60U + 7);
    EXPECT_EQ(parseTimeSpan("1s 999ms 999us"), 1U);
    EXPECT_EQ(parseTimeSpan("2 min"), 120U);
    EXPECT_EQ(parseTimeSpan("0"), 0U);
}

TEST(TimeSpan, BothFormsOfInfinity) {
    EXPECT_EQ(parseTimeSpan("infinity"), infiniteTime);
    EXPECT_EQ(parseTimeSpan("4294967295"), infiniteTime);
}

TEST(TimeSpan, WhatIsNotATimeSpanIsNone) {
    for (const char* text :
         {"", " ", "min", "1fortnight", "-1", "1.5h", "1 2x", "99999999999999999",
          "99999999999999999999999", "infinity 1s", "18446744073709551615us 1us"}) {
        EXPECT_EQ(parseTimeSpan(text), std::nullopt) << text;
    }
}

}  // namespace
}  // namespace ZR::Live
