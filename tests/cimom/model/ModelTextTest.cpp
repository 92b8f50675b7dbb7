// Paths and times as text, and text as bytes.
#include <gtest/gtest.h>

#include <limits>
#include <random>

#include "cimom/DateTimeText.h"
#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"
#include "cimom/Utf8.h"

namespace cimom {
namespace {

Value number64(std::uint64_t content) {
    return Value{Type::uint64, false, Scalar(content)};
}

Value onlyKey(const std::string& text) {
    const ObjectPath path = parseObjectPath("C.K=" + text);
    return path.keys.at(0).value;
}

TEST(ObjectPathText, ReadsAFullPath) {
    const ObjectPath path =
        parseObjectPath("//host:5989/root/cimv2:CIM_X.InstanceID=\"Computer%eth0\",Number=17");
    EXPECT_EQ(path.host, "host:5989");
    EXPECT_EQ(path.nameSpace, "root/cimv2");
    EXPECT_EQ(path.className, "CIM_X");
    ASSERT_EQ(path.keys.size(), 2U);
    EXPECT_EQ(path.keys[0], (NamedValue{"InstanceID", Value::ofString("Computer%eth0")}));
    EXPECT_EQ(path.keys[1], (NamedValue{"Number", number64(17)}));
}

TEST(ObjectPathText, HostNamespaceAndKeysMayBeLeftOut) {
    EXPECT_EQ(parseObjectPath("CIM_X"), (ObjectPath{"", "", "CIM_X", {}}));
    EXPECT_EQ(parseObjectPath("root/cimv2:CIM_X"), (ObjectPath{"", "root/cimv2", "CIM_X", {}}));
    EXPECT_EQ(parseObjectPath("CIM_X.A=1").keys.size(), 1U);
    EXPECT_EQ(parseObjectPath("//h/CIM_X").host, "h");
}

TEST(ObjectPathText, ALeadingSlashAndASchemeAreRead) {
    EXPECT_EQ(parseObjectPath("/root/cimv2:CIM_X").nameSpace, "root/cimv2");
    const ObjectPath path = parseObjectPath("https://host/root:CIM_X");
    EXPECT_EQ(path.host, "host");
    EXPECT_EQ(path.nameSpace, "root");
}

TEST(ObjectPathText, ASchemeInsideAValueIsNone) {
    const ObjectPath path = parseObjectPath("CIM_X.Url=\"http://host/\"");
    EXPECT_EQ(path.host, "");
    EXPECT_EQ(path.keys.at(0).value, Value::ofString("http://host/"));
}

TEST(ObjectPathText, ReadsEveryKindOfValue) {
    EXPECT_EQ(onlyKey("\"\""), Value::ofString(""));
    EXPECT_EQ(onlyKey("\"a\\\"b\\\\c,d.e=f\""), Value::ofString("a\"b\\c,d.e=f"));
    EXPECT_EQ(onlyKey("TRUE"), (Value{Type::boolean, false, Scalar(true)}));
    EXPECT_EQ(onlyKey("false"), (Value{Type::boolean, false, Scalar(false)}));
    EXPECT_EQ(onlyKey("-0"), number64(0));
    EXPECT_EQ(onlyKey("18446744073709551615"), number64(std::numeric_limits<std::uint64_t>::max()));
    EXPECT_EQ(onlyKey("+5"), number64(5));
    EXPECT_EQ(onlyKey("-9223372036854775808"),
              (Value{Type::sint64, false, Scalar(std::numeric_limits<std::int64_t>::min())}));
    EXPECT_EQ(onlyKey("-1.5e3"), (Value{Type::real64, false, Scalar(-1500.0)}));
    EXPECT_EQ(onlyKey("+.5"), (Value{Type::real64, false, Scalar(0.5)}));
}

TEST(ObjectPathText, ANestedReferenceIsReadAsItsText) {
    const ObjectPath path = parseObjectPath(
        "root/cimv2:A.Left=\"root/cimv2:B.Name=\\\"eth0\\\",Path=\\\"c:\\\\\\\\\\\"\",Right=\"x\"");
    ASSERT_EQ(path.keys.size(), 2U);
    EXPECT_EQ(path.keys[0].value, Value::ofString("root/cimv2:B.Name=\"eth0\",Path=\"c:\\\\\""));
    const Scalar* const nested = path.keys[0].value.scalar();
    ASSERT_NE(nested, nullptr);
    EXPECT_EQ(parseObjectPath(std::get<std::string>(*nested)).keys.at(1).value,
              Value::ofString("c:\\"));
}

TEST(ObjectPathText, WritesNoHostAndNoLeadingSlash) {
    const ObjectPath path{"host",
                          "root/cimv2",
                          "QVXZR_DHCPSettingData",
                          {{"InstanceID", Value::ofString("Computer%eth0")}}};
    EXPECT_EQ(toText(path), "root/cimv2:QVXZR_DHCPSettingData.InstanceID=\"Computer%eth0\"");
    EXPECT_EQ(toText(ObjectPath{"", "", "CIM_X", {}}), "CIM_X");
}

TEST(ObjectPathText, WritesKeysInTheirOrderAndEscapesOnlyQuotesAndBackslashes) {
    const ObjectPath path{"", "", "C", {{"Z", Value::ofString("a\"b\\c\nd")}, {"A", number64(3)}}};
    EXPECT_EQ(toText(path), "C.Z=\"a\\\"b\\\\c\nd\",A=3");
}

TEST(ObjectPathText, WritesEveryKindOfValue) {
    const auto text = [](Type type, Scalar scalar) {
        return toText({"", "", "C", {{"K", Value{type, false, std::move(scalar)}}}});
    };
    EXPECT_EQ(text(Type::boolean, true), "C.K=TRUE");
    EXPECT_EQ(text(Type::sint8, std::int64_t{-3}), "C.K=-3");
    EXPECT_EQ(text(Type::real64, 2.0), "C.K=2.0");
    EXPECT_EQ(text(Type::real64, 0.1), "C.K=0.1");
    EXPECT_EQ(text(Type::real64, std::numeric_limits<double>::infinity()), "C.K=INF");
    EXPECT_EQ(text(Type::char16, u'\u00E4'), "C.K=\"\xC3\xA4\"");
    EXPECT_EQ(text(Type::datetime, std::string("20240131093000.000000+060")),
              "C.K=\"20240131093000.000000+060\"");
}

TEST(ObjectPathText, WritesANestedReferenceWithItsQuotesEscapedOnceMore) {
    const auto nested = std::make_shared<const ObjectPath>(
        ObjectPath{"h", "root/cimv2", "B", {{"Name", Value::ofString("eth\"0")}}});
    const ObjectPath path{
        "", "root/cimv2", "A", {{"Left", Value{Type::reference, false, Scalar(nested)}}}};
    EXPECT_EQ(toText(path), "root/cimv2:A.Left=\"root/cimv2:B.Name=\\\"eth\\\\\\\"0\\\"\"");
}

TEST(ObjectPathText, LeavesOutKeysThatHaveNoTextForm) {
    const ObjectPath path{"",
                          "",
                          "C",
                          {{"Null", Value::null(Type::reference, false)},
                           {"Name", Value::ofString("x")},
                           {"Array", Value{Type::uint8, true, Array()}}}};
    EXPECT_EQ(toText(path), "C.Name=\"x\"");
}

struct WrongPath {
    const char* text;
    const char* reason;
};

class WrongObjectPath : public testing::TestWithParam<WrongPath> {};

TEST_P(WrongObjectPath, IsRefusedWithThePlaceAndTheReason) {
    try {
        const ObjectPath path = parseObjectPath(GetParam().text);
        FAIL() << "read as " << toText(path);
    } catch (const ObjectPathError& error) {
        EXPECT_EQ(error.what(), std::string("object path, column ") + GetParam().reason);
    }
}

constexpr const char* badValue =
    "5: this value is neither a quoted string nor a number, TRUE or FALSE in range";

INSTANTIATE_TEST_SUITE_P(
    Texts, WrongObjectPath,
    testing::Values(WrongPath{"", "1: a class name was expected"},
                    WrongPath{"/", "2: a class name was expected"},
                    WrongPath{"1X", "1: a class name was expected"},
                    WrongPath{"//host", "7: a slash is missing after the host"},
                    WrongPath{"///root:X", "3: the host is empty"},
                    WrongPath{"//host/root/cimv2", "12: a full stop before the keys was expected"},
                    WrongPath{":X", "1: a namespace was expected"},
                    WrongPath{"root//cimv2:X", "6: a part of the namespace is empty"},
                    WrongPath{"root/:X", "6: a part of the namespace is empty"},
                    WrongPath{"root:", "6: a class name was expected"},
                    WrongPath{"X.", "3: the name of a key was expected"},
                    WrongPath{"X.A", "4: an equals sign after the key's name was expected"},
                    WrongPath{"X.A=", "5: a value was expected"},
                    WrongPath{"X.A=1,", "7: the name of a key was expected"},
                    WrongPath{"X.A=1,a=2", "7: key a is given twice"},
                    WrongPath{"X.A=1, B=2", "7: the name of a key was expected"},
                    WrongPath{"X.A=\"x", "5: the string has no closing quotation mark"},
                    WrongPath{"X.A=\"x\\", "7: only \\\\ and \\\" can stand after a backslash"},
                    WrongPath{"X.A=\"\\n\"", "6: only \\\\ and \\\" can stand after a backslash"},
                    WrongPath{"X.A=\"x\"y", "8: a comma or the end was expected"},
                    WrongPath{"X.A=eth0", badValue}, WrongPath{"X.A=0x10", badValue},
                    WrongPath{"X.A=-", badValue}, WrongPath{"X.A=18446744073709551616", badValue},
                    WrongPath{"X.A=1e999", badValue}, WrongPath{"X.A=inf", badValue},
                    WrongPath{"X.A=NULL", badValue}));

/// Reading must end in a path or an ObjectPathError, whatever the text; and what
/// was read must come back from its own text.
TEST(ObjectPathText, NoTextDoesHarmAndWhatIsReadCanBeWrittenAndReadAgain) {
    // A fixed seed: a text that fails must fail again.
    std::mt19937 random(1);  // NOLINT(cert-msc32-c,cert-msc51-cpp)
    const std::string alphabet = "aX_1/:.,=\"\\-+eT ";
    const std::string seed = "//h/root/cimv2:X.A=\"a\\\"b\",B=-12,C=TRUE,D=1.5";
    unsigned read = 0;
    for (int round = 0; round < 20000; ++round) {
        std::string text = seed;
        for (unsigned change = random() % 4; change > 0; --change) {
            text[random() % text.size()] = alphabet[random() % alphabet.size()];
        }
        text.resize(text.size() - random() % 3);
        try {
            const ObjectPath path = parseObjectPath(text);
            EXPECT_EQ(parseObjectPath(toText(path)), path) << text;
            ++read;
        } catch (const ObjectPathError&) {
            continue;
        }
    }
    EXPECT_GT(read, 100U);
}

}  // namespace
}  // namespace cimom

using cimom::DateTime;
using cimom::parseDateTime;
using cimom::toText;

TEST(DateTimeText, ReadsPointsInTime) {
    EXPECT_EQ(parseDateTime("19700101000000.000000+000"), (DateTime{false, 0}));
    EXPECT_EQ(parseDateTime("20240131093000.000000+060"), (DateTime{false, 1706689800000000}));
    EXPECT_EQ(parseDateTime("20240131093000.123456-060"), (DateTime{false, 1706697000123456}));
    EXPECT_EQ(parseDateTime("19691231235959.999999+000"), (DateTime{false, -1}));
    EXPECT_EQ(parseDateTime("20240229000000.000000+000"), (DateTime{false, 1709164800000000}));
}

TEST(DateTimeText, ReadsIntervals) {
    EXPECT_EQ(parseDateTime("00000001000000.000000:000"), (DateTime{true, 86400000000}));
    EXPECT_EQ(parseDateTime("00000000010203.000004:000"), (DateTime{true, 3723000004}));
    EXPECT_EQ(parseDateTime("99999999235959.999999:000"), (DateTime{true, 8639999999999999999}));
}

TEST(DateTimeText, AsterisksCountAsTheSmallestValue) {
    EXPECT_EQ(parseDateTime("2024**********.******+000"), (DateTime{false, 1704067200000000}));
    EXPECT_EQ(parseDateTime("20240131093000.12****+060"), (DateTime{false, 1706689800120000}));
    EXPECT_EQ(parseDateTime("00000001******.******:000"), (DateTime{true, 86400000000}));
}

TEST(DateTimeText, RefusesWhatIsNoDateTime) {
    for (const char* const text : {"",
                                   "yesterday",
                                   "20240131093000.000000+06",
                                   "20240131093000.000000+0600",
                                   "20241331093000.000000+060",
                                   "20240231093000.000000+060",
                                   "20240131243000.000000+060",
                                   "20240131096000.000000+060",
                                   "20240131093060.000000+060",
                                   "20240131093000,000000+060",
                                   "20240131093000.000000 060",
                                   "20240131093000.000000+0*0",
                                   "2024*131093000.000000+060",
                                   "2024**31093000.000000+060",
                                   "20240131093000.0*0000+060",
                                   "2024013109****.000000+060",
                                   "00000001000000.000000:001",
                                   "00000001240000.000000:000",
                                   "0000000a000000.000000:000",
                                   "20230229000000.000000+000",
                                   "-0240131093000.000000+060"}) {
        EXPECT_FALSE(parseDateTime(text)) << text;
    }
}

TEST(DateTimeText, WritesWhatItReads) {
    for (const char* const text :
         {"19700101000000.000000+000", "20240229235959.999999+000", "00000101000000.000000+000",
          "99991231235959.999999+000", "00000001020304.000005:000", "99999999235959.999999:000"}) {
        EXPECT_EQ(toText(*parseDateTime(text)), text);
    }
}

TEST(DateTimeText, HasNoTextForValuesOutsideOfTheForm) {
    EXPECT_FALSE(toText({true, -1}));
    EXPECT_FALSE(toText({true, 8640000000000000000}));
    EXPECT_FALSE(toText({false, 253402300800000000}));
    EXPECT_FALSE(toText({false, -62167219200000001}));
}

namespace cimom {
namespace {

std::string encoded(char32_t character) {
    std::string text;
    appendUtf8(text, character);
    return text;
}

TEST(Utf8, EveryCharacterIsReadAsItWasWritten) {
    for (char32_t character = 1; character <= 0x10FFFF; ++character) {
        if (isSurrogate(character)) {
            continue;
        }
        const std::string text = encoded(character);
        const Utf8Character read = readUtf8(text, 0);
        ASSERT_EQ(read.length, text.size()) << static_cast<std::uint32_t>(character);
        ASSERT_EQ(read.value, character);
    }
}

TEST(Utf8, LengthsGrowAtTheKnownBounds) {
    EXPECT_EQ(encoded(0x7F).size(), 1U);
    EXPECT_EQ(encoded(0x80), "\xC2\x80");
    EXPECT_EQ(encoded(0x20AC), "\xE2\x82\xAC");
    EXPECT_EQ(encoded(0x1F600), "\xF0\x9F\x98\x80");
}

TEST(Utf8, WhatIsNoCharacterIsWrittenAsTheReplacementCharacter) {
    EXPECT_EQ(encoded(0xD800), "\xEF\xBF\xBD");
    EXPECT_EQ(encoded(0x110000), "\xEF\xBF\xBD");
}

TEST(Utf8, InvalidSequencesHaveNoLength) {
    for (const std::string text :
         {"\x80", "\xC0\x80", "\xC3", "\xC3(", "\xE2\x82", "\xE0\x80\x80", "\xED\xA0\x80",
          "\xF4\x90\x80\x80", "\xF8\x88\x80\x80\x80", "\xFF"}) {
        EXPECT_EQ(readUtf8(text, 0).length, 0U);
    }
}

}  // namespace
}  // namespace cimom
