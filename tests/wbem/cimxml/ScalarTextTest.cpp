#include "cimom/Instance.h"
#include "cimxml/XmlText.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

namespace cimom::wbem {

std::string written(Type type, const Scalar& scalar) {
    std::string out;
    appendScalarText(out, type, scalar);
    return out;
}

TEST(ScalarText, WritesTheFormsOfTheStandard) {
    EXPECT_EQ(written(Type::boolean, true), "TRUE");
    EXPECT_EQ(written(Type::boolean, false), "FALSE");
    EXPECT_EQ(written(Type::uint64, std::numeric_limits<std::uint64_t>::max()),
              "18446744073709551615");
    EXPECT_EQ(written(Type::sint64, std::numeric_limits<std::int64_t>::min()),
              "-9223372036854775808");
    EXPECT_EQ(written(Type::char16, u'€'), "€");
    EXPECT_EQ(written(Type::char16, u'&'), "&amp;");
    EXPECT_EQ(written(Type::string, std::string("a<b")), "a&lt;b");
}

TEST(ScalarText, WritesRealsWithAPointAndAsFewDigitsAsTheyNeed) {
    EXPECT_EQ(written(Type::real64, 2.0), "2.0e+00");
    EXPECT_EQ(written(Type::real64, -0.125), "-1.25e-01");
    EXPECT_EQ(written(Type::real64, 0.1), "1.0e-01");
    EXPECT_EQ(written(Type::real32, static_cast<double>(0.1F)), "1.0e-01");
    EXPECT_EQ(written(Type::real64, std::numeric_limits<double>::infinity()), "INF");
    EXPECT_EQ(written(Type::real64, -std::numeric_limits<double>::infinity()), "-INF");
    EXPECT_EQ(written(Type::real32, std::numeric_limits<double>::quiet_NaN()), "NaN");
}

TEST(ScalarText, ReadsIntegersOfTheirRangeOnly) {
    EXPECT_EQ(readScalarText(Type::uint8, "255"), Scalar(std::uint64_t{255}));
    EXPECT_EQ(readScalarText(Type::uint8, "256"), std::nullopt);
    EXPECT_EQ(readScalarText(Type::uint8, "-1"), std::nullopt);
    EXPECT_EQ(readScalarText(Type::uint8, "+1"), std::nullopt);
    EXPECT_EQ(readScalarText(Type::uint16, "0xFFFF"), Scalar(std::uint64_t{65535}));
    EXPECT_EQ(readScalarText(Type::uint16, "0x"), std::nullopt);
    EXPECT_EQ(readScalarText(Type::sint8, "-128"), Scalar(std::int64_t{-128}));
    EXPECT_EQ(readScalarText(Type::sint8, "+127"), Scalar(std::int64_t{127}));
    EXPECT_EQ(readScalarText(Type::sint8, "0x-1"), std::nullopt);
    EXPECT_EQ(readScalarText(Type::sint8, "+-1"), std::nullopt);
    EXPECT_EQ(readScalarText(Type::sint8, "128"), std::nullopt);
    EXPECT_EQ(readScalarText(Type::uint32, " 1"), std::nullopt);
    EXPECT_EQ(readScalarText(Type::uint32, "1x"), std::nullopt);
    EXPECT_EQ(readScalarText(Type::uint32, ""), std::nullopt);
}

TEST(ScalarText, ReadsRealsInAllTheirForms) {
    EXPECT_EQ(readScalarText(Type::real64, "+1.5E3"), Scalar(1500.0));
    EXPECT_EQ(readScalarText(Type::real64, ".5"), Scalar(0.5));
    EXPECT_EQ(readScalarText(Type::real64, "-INF"),
              Scalar(-std::numeric_limits<double>::infinity()));
    EXPECT_EQ(readScalarText(Type::real32, "0.1"), Scalar(static_cast<double>(0.1F)));
    EXPECT_EQ(readScalarText(Type::real32, "1e39"), std::nullopt);
    EXPECT_EQ(readScalarText(Type::real64, "1e999"), std::nullopt);
    EXPECT_EQ(readScalarText(Type::real64, "infinity"), std::nullopt);
    EXPECT_EQ(readScalarText(Type::real64, "1.0 "), std::nullopt);
    EXPECT_EQ(readScalarText(Type::real64, "+-1"), std::nullopt);
    EXPECT_TRUE(std::isnan(std::get<double>(*readScalarText(Type::real32, "nan"))));
}

TEST(ScalarText, ReadsOneCharacterOnly) {
    EXPECT_EQ(readScalarText(Type::char16, "€"), Scalar(u'€'));
    EXPECT_EQ(readScalarText(Type::char16, "ab"), std::nullopt);
    EXPECT_EQ(readScalarText(Type::char16, ""), std::nullopt);
    EXPECT_EQ(readScalarText(Type::char16, "\xF0\x9F\x98\x80"), std::nullopt);
}

TEST(ScalarText, ReadsBooleansInAnyCase) {
    EXPECT_EQ(readScalarText(Type::boolean, "True"), Scalar(true));
    EXPECT_EQ(readScalarText(Type::boolean, "false"), Scalar(false));
    EXPECT_EQ(readScalarText(Type::boolean, "1"), std::nullopt);
}

TEST(ScalarText, ReadsDatetimesOnlyWhenTheyAreSome) {
    EXPECT_EQ(readScalarText(Type::datetime, "20240131093000.000000+060"),
              Scalar(std::string("20240131093000.000000+060")));
    EXPECT_EQ(readScalarText(Type::datetime, "2024-01-31"), std::nullopt);
}

TEST(ScalarText, TellsTheTypeOfANumber) {
    EXPECT_EQ(readNumberText("5"), (Value{Type::uint64, false, Scalar(std::uint64_t{5})}));
    EXPECT_EQ(readNumberText("-5"), (Value{Type::sint64, false, Scalar(std::int64_t{-5})}));
    EXPECT_EQ(readNumberText("0.5"), (Value{Type::real64, false, Scalar(0.5)}));
    EXPECT_EQ(readNumberText("five"), std::nullopt);
}

}  // namespace cimom::wbem
