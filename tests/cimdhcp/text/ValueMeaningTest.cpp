#include "text/ValueMeaning.h"

#include <gtest/gtest.h>

#include "kit/SmallSchema.h"

namespace cimdhcp {
namespace {

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

}  // namespace
}  // namespace cimdhcp
