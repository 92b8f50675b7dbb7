#include "formats/Numbers.h"

#include <gtest/gtest.h>

#include <cstdint>

namespace ZR::Live {
namespace {

TEST(Numbers, TheWholeTextIsTheNumber) {
    EXPECT_EQ(parseNumber<std::uint32_t>("4294967295"), UINT32_MAX);
    EXPECT_EQ(parseNumber<std::int64_t>("-1"), -1);
    EXPECT_EQ(parseNumber<std::uint16_t>("0044", 16), 68);
}

TEST(Numbers, AnythingElseIsNone) {
    for (const char* text : {"", " 1", "1 ", "1x", "x", "0x1", "+1", "4294967296"}) {
        EXPECT_EQ(parseNumber<std::uint32_t>(text), std::nullopt) << text;
    }
    EXPECT_EQ(parseNumber<std::uint32_t>("-1"), std::nullopt);
}

}  // namespace
}  // namespace ZR::Live
