// The paths, class names and values that arguments are.
#include <gtest/gtest.h>

#include "arguments/ArgumentValue.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"
#include "kit/SmallSchema.h"
#include "text/Failure.h"
#include "text/MofText.h"

namespace cimdhcp {
namespace {

template <typename Read>
std::string readingOf(Read&& read) {
    try {
        return "read as " + cimom::toText(std::forward<Read>(read)());
    } catch (const Failure& failure) {
        EXPECT_EQ(failure.status(), ExitStatus::usage);
        return failure.what();
    }
}

class PathArgument : public ::testing::Test {
  protected:
    cimom::ObjectPath read(const std::string& text) const {
        return readPathArgument(text, "root/cimv2", repository_);
    }

    const cimom::ClassRepository repository_ = test::smallRepository();
};

TEST_F(PathArgument, HasTheDefaultNamespaceWhenItNamesNone) {
    EXPECT_EQ(cimom::toText(read("TEST_Base.Id=\"a\"")), "root/cimv2:TEST_Base.Id=\"a\"");
    EXPECT_EQ(cimom::toText(read("root/other:TEST_Base.Id=\"a\"")),
              "root/other:TEST_Base.Id=\"a\"");
}

TEST_F(PathArgument, NeedsAKeyWhenItsClassHasKeys) {
    EXPECT_EQ(readingOf([&] { return read("TEST_Base"); }),
              "\"TEST_Base\" names a class, not an instance: its keys are missing; list the paths "
              "with: cimdhcp names TEST_Base");
    EXPECT_EQ(cimom::toText(read("TEST_Keyless")), "root/cimv2:TEST_Keyless");
    // What there is to say about an unknown class is for the object manager to say.
    EXPECT_EQ(cimom::toText(read("TEST_Unknown")), "root/cimv2:TEST_Unknown");
}

TEST_F(PathArgument, RemindsOfTheShellWhenTheQuotesAreGone) {
    const std::string text = readingOf([&] { return read("TEST_Base.Id=a"); });
    EXPECT_EQ(text.substr(0, 31), "cannot read \"TEST_Base.Id=a\": o") << text;
    EXPECT_NE(text.find("write it in single quotes"), std::string::npos) << text;
}

TEST(ClassArgument, MayHaveANamespace) {
    EXPECT_EQ(cimom::toText(readClassArgument("TEST_Base", "root/cimv2")), "root/cimv2:TEST_Base");
    EXPECT_EQ(cimom::toText(readClassArgument("a/b:TEST_Base", "root/cimv2")), "a/b:TEST_Base");
}

TEST(ClassArgument, IsNoInstance) {
    EXPECT_EQ(readingOf([] { return readClassArgument("TEST_Base.Id=\"a\"", "root/cimv2"); }),
              "\"TEST_Base.Id=\"a\"\" is the path of an instance; give its class alone: TEST_Base");
}

TEST(ClassArgument, IsNotEmpty) {
    EXPECT_EQ(readingOf([] { return readClassArgument("", "root/cimv2"); }),
              "cannot read \"\": object path, column 1: a class name was expected");
}

class ValueReading : public ::testing::Test {
  protected:
    cimom::Value read(const char* property, std::string_view text) const {
        const auto* declaration = repository_.find("TEST_Thing")->property(property);
        if (declaration == nullptr) {
            declaration = repository_.find("TEST_Link")->property(property);
        }
        return readValue(*declaration, text);
    }

    /// The value read, as MOF.
    std::string mof(const char* property, std::string_view text) const {
        return mofInitializer(read(property, text));
    }

    std::string refusal(const char* property, std::string_view text) const {
        try {
            return "read as " + mof(property, text);
        } catch (const Failure& failure) {
            EXPECT_EQ(failure.status(), ExitStatus::usage);
            return failure.what();
        }
    }

    const cimom::ClassRepository repository_ = test::smallRepository();
};

TEST_F(ValueReading, TakesTextsAsTheyAre) {
    EXPECT_EQ(read("Text", " a \"b\" "), cimom::Value::ofString(" a \"b\" "));
    EXPECT_EQ(read("Text", ""), cimom::Value::ofString(""));
    EXPECT_EQ(read("Text", "NULL"), cimom::Value::ofString("NULL"));
}

TEST_F(ValueReading, TakesIntegersInTheirRange) {
    const cimom::Value byte = read("Byte", "0xFF");
    EXPECT_EQ(byte, (cimom::Value{cimom::Type::uint8, false, cimom::Scalar(std::uint64_t{255})}));
    EXPECT_EQ(mof("Big", "18446744073709551615"), "18446744073709551615");
    EXPECT_EQ(read("Small", "-128"),
              (cimom::Value{cimom::Type::sint8, false, cimom::Scalar(std::int64_t{-128})}));
    EXPECT_EQ(mof("Deep", "-9223372036854775808"), "-9223372036854775808");
    EXPECT_EQ(mof("Deep", "9223372036854775807"), "9223372036854775807");
}

TEST_F(ValueReading, RefusesIntegersOutOfRange) {
    EXPECT_EQ(refusal("Byte", "256"), "Byte cannot be \"256\": it takes a number from 0 to 255");
    EXPECT_EQ(refusal("Byte", "-1"), "Byte cannot be \"-1\": it takes a number from 0 to 255");
    EXPECT_EQ(refusal("Small", "128"),
              "Small cannot be \"128\": it takes a number from -128 to 127");
    EXPECT_EQ(refusal("Deep", "9223372036854775808"),
              "Deep cannot be \"9223372036854775808\": it takes a number from "
              "-9223372036854775808 to 9223372036854775807");
    EXPECT_EQ(refusal("Byte", "x"), "Byte cannot be \"x\": it takes a number from 0 to 255");
}

TEST_F(ValueReading, TakesBooleansRealsAndCharacters) {
    EXPECT_EQ(mof("Flag", "true"), "TRUE");
    EXPECT_EQ(mof("Flag", "FALSE"), "FALSE");
    EXPECT_EQ(refusal("Flag", "1"), "Flag cannot be \"1\": it takes TRUE or FALSE");
    EXPECT_EQ(mof("Real", "1.5"), "1.5");
    EXPECT_EQ(refusal("Real", "1.5x"), "Real cannot be \"1.5x\": it takes a number");
    EXPECT_EQ(mof("Character", "ü"), "'ü'");
    EXPECT_EQ(refusal("Character", "ab"), "Character cannot be \"ab\": it takes one character");
}

TEST_F(ValueReading, TakesDatetimes) {
    EXPECT_EQ(mof("When", "20261120081530.000000+060"), "\"20261120081530.000000+060\"");
    EXPECT_EQ(mof("When", "00000001132312.******:000"), "\"00000001132312.******:000\"");
    EXPECT_EQ(refusal("When", "2026-11-20"),
              "When cannot be \"2026-11-20\": it takes a datetime like 20261120081530.000000+000");
    EXPECT_EQ(refusal("When", "20261120081530x000000+060").substr(0, 16), "When cannot be \"");
}

TEST_F(ValueReading, TakesPathsForReferences) {
    EXPECT_EQ(mof("First", "TEST_Base.Id=\"a\""), R"("TEST_Base.Id=\"a\"")");
    EXPECT_EQ(refusal("First", "a b"), "First cannot be \"a b\": it takes an object path");
}

TEST_F(ValueReading, TakesArrays) {
    EXPECT_EQ(mof("Options", "{8, 0x0E ,NULL}"), "{8, 14, NULL}");
    EXPECT_EQ(mof("Options", " { } "), "{}");
    EXPECT_EQ(mof("Texts", R"({"a, b", "c\"d\\", ""})"), R"({"a, b", "c\"d\\", ""})");
}

TEST_F(ValueReading, RefusesBrokenArrays) {
    for (const char* text : {"8", "{8", "8}", "{8,}", "{,8}", "{8 9}", "{x}", "{8}}", "{"}) {
        EXPECT_EQ(refusal("Options", text),
                  "Options cannot be \"" + std::string(text) +
                      "\": it takes a list {value, value...}, each a number from 0 to 65535");
    }
    for (const char* text : {"{a}", "{\"a}", "{\"a\" \"b\"}", "{\"a\",}"}) {
        EXPECT_EQ(refusal("Texts", text),
                  "Texts cannot be \"" + std::string(text) +
                      "\": it takes a list {value, value...}, each a text in double quotes");
    }
}

TEST_F(ValueReading, TakesNullForAnythingButAText) {
    EXPECT_EQ(read("Byte", "null"), cimom::Value::null(cimom::Type::uint8, false));
    EXPECT_EQ(read("Texts", "NULL"), cimom::Value::null(cimom::Type::string, true));
    EXPECT_EQ(read("When", "NULL"), cimom::Value::null(cimom::Type::datetime, false));
}

}  // namespace
}  // namespace cimdhcp
