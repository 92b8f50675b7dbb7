#include "text/IntegerText.h"

#include <gtest/gtest.h>

#include <limits>

namespace cimdhcp {
namespace {

TEST(IntegerText, ReadsAllFormsOfMof) {
    EXPECT_EQ(readInteger("0"), (Integer{false, 0}));
    EXPECT_EQ(readInteger("42"), (Integer{false, 42}));
    EXPECT_EQ(readInteger("+42"), (Integer{false, 42}));
    EXPECT_EQ(readInteger("-42"), (Integer{true, 42}));
    EXPECT_EQ(readInteger("0x1F"), (Integer{false, 31}));
    EXPECT_EQ(readInteger("0X1b"), (Integer{false, 27}));
    EXPECT_EQ(readInteger("-0x10"), (Integer{true, 16}));
    EXPECT_EQ(readInteger("017"), (Integer{false, 15}));
    EXPECT_EQ(readInteger("101b"), (Integer{false, 5}));
    EXPECT_EQ(readInteger("101B"), (Integer{false, 5}));
}

TEST(IntegerText, ReadsBothEndsOfTheRange) {
    EXPECT_EQ(readInteger("18446744073709551615"),
              (Integer{false, std::numeric_limits<std::uint64_t>::max()}));
    EXPECT_EQ(readInteger("18446744073709551616"), std::nullopt);
}

TEST(IntegerText, HasOneZero) {
    EXPECT_EQ(readInteger("-0"), readInteger("0"));
}

TEST(IntegerText, RefusesWhatIsNoInteger) {
    for (const char* text :
         {"", "-", "0x", "b", "x", "1.5", " 1", "1 ", "--1", "0x-1", "08", "12b"}) {
        EXPECT_EQ(readInteger(text), std::nullopt) << text;
    }
}

TEST(IntegerText, OrdersAcrossTheSigns) {
    const auto lowest = Integer::of(std::numeric_limits<std::int64_t>::min());
    EXPECT_EQ(lowest, (Integer{true, 9223372036854775808U}));
    EXPECT_LT(lowest, Integer::of(-1));
    EXPECT_LT(Integer::of(-1), Integer::of(0));
    EXPECT_LT(Integer::of(5), (Integer{false, std::numeric_limits<std::uint64_t>::max()}));
}

}  // namespace
}  // namespace cimdhcp
