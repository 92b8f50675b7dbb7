#include "text/ValueMeaning.h"

#include <gtest/gtest.h>

#include <memory>

#include "cimom/ClassDeclaration.h"
#include "cimom/ObjectPathText.h"
#include "kit/SmallSchema.h"

namespace cimdhcp {
namespace {

using cimom::Array;
using cimom::NamedValue;
using cimom::Scalar;
using cimom::Type;

const NamedValue state{"State", {Type::sint32, false, Scalar(std::int64_t{2})}};
const NamedValue options{
    "options", {Type::uint16, true, Array{std::uint64_t{8}, std::uint64_t{9}, std::uint64_t{14}}}};
const NamedValue bytes{"Byte", {Type::uint8, true, Array{std::uint64_t{8}}}};

class ValueMeaning : public ::testing::Test {
  protected:
    std::optional<std::string> of(const char* property, const cimom::Scalar& value) const {
        return meaning(*repository_.find("TEST_Thing")->property(property), value);
    }

    const cimom::ClassRepository repository_ = test::smallRepository();
};

TEST_F(ValueMeaning, FindsSingleValues) {
    EXPECT_EQ(of("State", std::int64_t{2}), "Enabled");
    EXPECT_EQ(of("State", std::int64_t{-1}), "Minus One");
    EXPECT_EQ(of("State", std::int64_t{16}), "Sixteen");
}

TEST_F(ValueMeaning, FindsRangesWithBothEnds) {
    EXPECT_EQ(of("State", std::int64_t{20}), "Twenties");
    EXPECT_EQ(of("State", std::int64_t{29}), "Twenties");
}

TEST_F(ValueMeaning, FindsOpenRanges) {
    EXPECT_EQ(of("State", std::int64_t{-100}), "Depth");
    EXPECT_EQ(of("State", std::int64_t{-99}), "Rest");
    EXPECT_EQ(of("State", std::int64_t{32767}), "Rest");
    EXPECT_EQ(of("State", std::int64_t{32768}), "Vendor");
}

TEST_F(ValueMeaning, GivesTheRestWhatNothingElseCovers) {
    EXPECT_EQ(of("State", std::int64_t{19}), "Rest");
    EXPECT_EQ(of("State", std::int64_t{30}), "Rest");
}

TEST_F(ValueMeaning, CountsFromZeroWithoutAMap) {
    EXPECT_EQ(of("Switch", std::uint64_t{0}), "Off");
    EXPECT_EQ(of("Switch", std::uint64_t{1}), "On");
    EXPECT_EQ(of("Switch", std::uint64_t{2}), std::nullopt);
}

TEST_F(ValueMeaning, FindsTexts) {
    EXPECT_EQ(of("Letter", std::string("b")), "Letter B");
    EXPECT_EQ(of("Letter", std::string("B")), std::nullopt);
}

TEST_F(ValueMeaning, IsNoneWithoutQualifiersOrValue) {
    EXPECT_EQ(of("Text", std::string("a")), std::nullopt);
    EXPECT_EQ(of("Byte", std::uint64_t{1}), std::nullopt);
    EXPECT_EQ(of("State", cimom::Scalar()), std::nullopt);
    EXPECT_EQ(of("State", true), std::nullopt);
}

TEST_F(ValueMeaning, IsNoneWhenTheMapIsLongerThanTheValues) {
    EXPECT_EQ(of("Short", std::uint64_t{1}), "One");
    EXPECT_EQ(of("Short", std::uint64_t{2}), std::nullopt);
}

class ShownMeaning : public ::testing::Test {
  protected:
    const cimom::ClassRepository repository_ = test::smallRepository();
    const cimom::ClassDeclaration* thing_ = repository_.find("TEST_Thing");
};

TEST_F(ShownMeaning, StandAlone) {
    EXPECT_EQ(meaningOf(thing_, state), "Enabled");
    EXPECT_EQ(meaningOf(thing_, options), "Eight, 9, Fourteen");
    EXPECT_EQ(meaningOf(thing_, bytes), "");
}

TEST_F(ShownMeaning, StandBehindTheirValues) {
    EXPECT_EQ(valueWithMeaning(thing_, state), "2 (Enabled)");
    EXPECT_EQ(valueWithMeaning(thing_, options), "{8 (Eight), 9, 14 (Fourteen)}");
    EXPECT_EQ(valueWithMeaning(thing_, bytes), "{8}");
}

TEST_F(ShownMeaning, AreMissingForAnUnknownClass) {
    EXPECT_EQ(meaningOf(nullptr, state), "");
    EXPECT_EQ(valueWithMeaning(nullptr, state), "2");
}

TEST_F(ShownMeaning, ShowReferencesAsPlainPaths) {
    const std::string text = "root/cimv2:TEST_Base.Id=\"a\"";
    const NamedValue other{
        "Other",
        {Type::reference, false,
         Scalar(std::make_shared<const cimom::ObjectPath>(cimom::parseObjectPath(text)))}};
    EXPECT_EQ(valueWithMeaning(thing_, other), text);
}

TEST_F(ShownMeaning, ShowNull) {
    EXPECT_EQ(valueWithMeaning(thing_, {"State", cimom::Value::null(Type::sint32, false)}), "NULL");
    EXPECT_EQ(meaningOf(thing_, {"State", cimom::Value::null(Type::sint32, false)}), "");
}

TEST(HeldText, IsTheTextOfATextAlone) {
    const cimom::Value text = cimom::Value::ofString("eth0");
    const cimom::Value null = cimom::Value::null(Type::string, false);
    EXPECT_EQ(heldText(&text), "eth0");
    EXPECT_EQ(heldText(&null), "");
    EXPECT_EQ(heldText(&state.value), "");
    EXPECT_EQ(heldText(nullptr), "");
}

}  // namespace
}  // namespace cimdhcp
