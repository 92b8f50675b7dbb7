#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <limits>
#include <memory>

#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"
#include "kit/SmallSchema.h"
#include "text/Columns.h"
#include "text/DisplayText.h"
#include "text/IntegerText.h"
#include "text/MofText.h"
#include "text/Times.h"
#include "text/ValueMeaning.h"

namespace cimdhcp {
namespace {

using Lines = std::vector<std::string>;
using cimom::Array;
using cimom::NamedValue;
using cimom::Scalar;
using cimom::Type;
using cimom::Value;

// Values as text, and their order.

TEST(DisplayText, KeepsPrintableText) {
    EXPECT_EQ(printable("eth0 büro 東京"), "eth0 büro 東京");
}

TEST(DisplayText, EscapesWhatCouldSteerATerminal) {
    EXPECT_EQ(printable("a\x1B[31mb\n\x7F"), "a\\x1B[31mb\\x0A\\x7F");
    EXPECT_EQ(printable("\xC2\x9B"), "\\u009B");
    // Marks of direction and separators of lines have no width, and mislead a reader.
    EXPECT_EQ(printable("a\u202Eb\u2066c\u200F"), "a\\u202Eb\\u2066c\\u200F");
    EXPECT_EQ(printable("a\u2028b\u2029\u061C"), "a\\u2028b\\u2029\\u061C");
    EXPECT_EQ(printable("\xC2\x85"), "\\u0085");
    EXPECT_EQ(printable("\u200D\u2026\u2030"), "\u200D\u2026\u2030");
    EXPECT_EQ(printable(std::string_view("a\0b", 3)), "a\\x00b");
}

TEST(DisplayText, EscapesBytesThatAreNoUtf8) {
    EXPECT_EQ(printable("a\xFFz\xC3"), "a\\xFFz\\xC3");
}

TEST(DisplayText, CountsWideCharactersTwice) {
    EXPECT_EQ(displayWidth(""), 0U);
    EXPECT_EQ(displayWidth("büro"), 4U);
    EXPECT_EQ(displayWidth("東京"), 4U);
}

TEST(DisplayText, CutsOnlyWhatDoesNotFit) {
    EXPECT_EQ(cutToWidth("abcdef", 6), "abcdef");
    EXPECT_EQ(cutToWidth("abcdefg", 6), "abcde…");
    EXPECT_EQ(cutToWidth("東京市", 5), "東京…");
    EXPECT_EQ(cutToWidth("ab", 1), "…");
    EXPECT_EQ(cutToWidth("東京", 2), "…");
}

TEST(DisplayText, WrapsAtBlanks) {
    EXPECT_EQ(wrapToWidth("one two three", 8), (Lines{"one two", "three"}));
    EXPECT_EQ(wrapToWidth("one two", 3), (Lines{"one", "two"}));
}

TEST(DisplayText, WrapsLongWordsWhereTheyAreFull) {
    EXPECT_EQ(wrapToWidth("abcdefgh", 3), (Lines{"abc", "def", "gh"}));
    EXPECT_EQ(wrapToWidth("東京市", 4), (Lines{"東京", "市"}));
}

TEST(DisplayText, WrapsNothingIntoOneEmptyLine) {
    EXPECT_EQ(wrapToWidth("", 10), Lines{""});
}

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

TEST(NaturalOrder, NumbersCountByTheirValue) {
    std::vector<std::string> texts{"eth10", "eth2",       "eth",       "Eth3", "eth02", "eth2.5",
                                   "10",    "192.0.2.17", "192.0.2.9", "9",    "",      "eth2"};
    std::sort(texts.begin(), texts.end(), comesBefore);
    EXPECT_THAT(texts, testing::ElementsAre("", "9", "10", "192.0.2.9", "192.0.2.17", "Eth3", "eth",
                                            "eth02", "eth2", "eth2", "eth2.5", "eth10"));
}

TEST(NaturalOrder, IsOneForAnyTexts) {
    const std::vector<std::string> texts{"a",  "a0",  "a00", "0a",   "00a",
                                         "a1", "a01", "a1b", "\xFF", "99999999999999999999999"};
    for (const std::string& a : texts) {
        EXPECT_FALSE(comesBefore(a, a));
        for (const std::string& b : texts) {
            if (a != b) {
                EXPECT_NE(comesBefore(a, b), comesBefore(b, a)) << a << ' ' << b;
            }
            for (const std::string& c : texts) {
                EXPECT_FALSE(comesBefore(a, b) && comesBefore(b, c) && !comesBefore(a, c))
                    << a << ' ' << b << ' ' << c;
            }
        }
    }
}

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
