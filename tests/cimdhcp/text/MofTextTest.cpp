#include "text/MofText.h"

#include <gtest/gtest.h>

#include <limits>
#include <memory>

#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"

namespace cimdhcp {
namespace {

using cimom::Array;
using cimom::Scalar;
using cimom::Type;
using cimom::Value;

TEST(MofText, EscapesTexts) {
    EXPECT_EQ(mofString("plain 'x' büro"), R"("plain 'x' büro")");
    EXPECT_EQ(mofString("a\"b\\c\b\t\n\f\r"), R"("a\"b\\c\b\t\n\f\r")");
}

TEST(MofText, WritesOtherControlCharactersWithFourDigits) {
    // A shorter escape would swallow the digit behind it.
    EXPECT_EQ(mofString(std::string("\x1B\x7F\0"
                                    "1",
                                    4)),
              R"("\x001B\x007F\x00001")");
}

TEST(MofText, WritesEachKindOfScalar) {
    EXPECT_EQ(mofLiteral(Scalar()), "NULL");
    EXPECT_EQ(mofLiteral(Scalar(true)), "TRUE");
    EXPECT_EQ(mofLiteral(Scalar(false)), "FALSE");
    EXPECT_EQ(mofLiteral(Scalar(std::numeric_limits<std::uint64_t>::max())),
              "18446744073709551615");
    EXPECT_EQ(mofLiteral(Scalar(std::int64_t{-5})), "-5");
    EXPECT_EQ(mofLiteral(Scalar(u'x')), "'x'");
    EXPECT_EQ(mofLiteral(Scalar(u'\'')), "'\\''");
    EXPECT_EQ(mofLiteral(Scalar(std::string("x"))), "\"x\"");
}

TEST(MofText, WritesRealsWithAPoint) {
    EXPECT_EQ(mofLiteral(Scalar(1.5)), "1.5");
    EXPECT_EQ(mofLiteral(Scalar(2.0)), "2.0");
    EXPECT_EQ(mofLiteral(Scalar(1e300)), "1.0e+300");
    EXPECT_EQ(mofLiteral(Scalar(std::numeric_limits<double>::infinity())), "NULL");
}

TEST(MofText, WritesReferencesAsTheTextOfTheirPath) {
    const auto path = std::make_shared<const cimom::ObjectPath>(
        cimom::parseObjectPath("root/cimv2:TEST_Base.Id=\"a\""));
    EXPECT_EQ(mofLiteral(Scalar(path)), R"("root/cimv2:TEST_Base.Id=\"a\"")");
}

TEST(MofText, WritesEmbeddedInstancesAsTheTextOfTheirDeclaration) {
    cimom::Instance inner;
    inner.path.className = "TEST_Keyless";
    inner.properties.push_back({"Text", Value::ofString("x")});
    EXPECT_EQ(mofLiteral(Scalar(std::make_shared<const cimom::Instance>(inner))),
              R"("instance of TEST_Keyless { Text = \"x\"; };")");
}

TEST(MofText, WritesInitializers) {
    EXPECT_EQ(mofInitializer(Value::null(Type::uint16, false)), "NULL");
    EXPECT_EQ(mofInitializer(Value::null(Type::uint16, true)), "NULL");
    EXPECT_EQ(mofInitializer({Type::uint16, false, Scalar(std::uint64_t{2})}), "2");
    EXPECT_EQ(mofInitializer({Type::uint16, true, Array{}}), "{}");
    EXPECT_EQ(
        mofInitializer({Type::uint16, true, Array{std::uint64_t{8}, Scalar(), std::uint64_t{14}}}),
        "{8, NULL, 14}");
}

}  // namespace
}  // namespace cimdhcp
