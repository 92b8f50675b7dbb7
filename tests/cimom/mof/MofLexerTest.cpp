#include <gtest/gtest.h>

#include <limits>

#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "mof/MofLexer.h"
#include "mof/MofValue.h"

namespace cimom {
namespace {

std::vector<MofToken> tokens(std::string_view text) {
    MofLexer lexer(text, "file.mof");
    std::vector<MofToken> result;
    for (MofToken token = lexer.next(); token.kind != MofTokenKind::end; token = lexer.next()) {
        result.push_back(token);
    }
    return result;
}

MofConstant valueOf(std::string_view text) {
    const auto all = tokens(text);
    return all.size() == 1 ? all.front().value : MofConstant();
}

std::string errorOf(std::string_view text) {
    try {
        tokens(text);
    } catch (const MofError& error) {
        return error.what();
    }
    return "no error";
}

MofConstant integer(std::uint64_t magnitude, bool negative = false) {
    return MofInteger{negative, magnitude};
}

TEST(MofLexer, CutsADeclarationIntoTokensWithTheirPlaces) {
    const auto all = tokens("class A_B\n  : C { };");
    ASSERT_EQ(all.size(), 7U);
    EXPECT_TRUE(all[0].isWord("CLASS"));
    EXPECT_EQ(all[1].text, "A_B");
    EXPECT_EQ(all[1].position, (MofPosition{1, 7}));
    EXPECT_TRUE(all[2].isSymbol(':'));
    EXPECT_EQ(all[2].position, (MofPosition{2, 3}));
    EXPECT_EQ(all[6].position, (MofPosition{2, 10}));
}

TEST(MofLexer, CommentsAndBlanksLieBetweenTokens) {
    const auto all = tokens("a // b\n/* c \n * d */e/**/f\r\n\tg // end");
    ASSERT_EQ(all.size(), 4U);
    EXPECT_EQ(all[1].text, "e");
    EXPECT_EQ(all[1].position, (MofPosition{3, 8}));
    EXPECT_EQ(all[2].text, "f");
    EXPECT_EQ(all[3].position, (MofPosition{4, 2}));
}

TEST(MofLexer, CommentsNeedNotBeUtf8) {
    EXPECT_EQ(tokens("// \xE4\n/* \xF6 */ a").size(), 1U);
}

TEST(MofLexer, AByteOrderMarkIsSkipped) {
    const auto all = tokens(
        "\xEF\xBB\xBF"
        "a");
    ASSERT_EQ(all.size(), 1U);
    EXPECT_EQ(all[0].position, (MofPosition{1, 1}));
}

TEST(MofLexer, TheEndComesForEver) {
    MofLexer lexer("", "f");
    EXPECT_EQ(lexer.next().kind, MofTokenKind::end);
    EXPECT_EQ(lexer.next().kind, MofTokenKind::end);
}

TEST(MofLexer, ReadsIntegersInFourBases) {
    EXPECT_EQ(valueOf("0"), integer(0));
    EXPECT_EQ(valueOf("42"), integer(42));
    EXPECT_EQ(valueOf("+7"), integer(7));
    EXPECT_EQ(valueOf("-7"), integer(7, true));
    EXPECT_EQ(valueOf("0x1fE"), integer(0x1FE));
    EXPECT_EQ(valueOf("-0X10"), integer(16, true));
    EXPECT_EQ(valueOf("101b"), integer(5));
    EXPECT_EQ(valueOf("0B"), integer(0));
    EXPECT_EQ(valueOf("017"), integer(15));
    EXPECT_EQ(valueOf("18446744073709551615"), integer(18446744073709551615U));
}

TEST(MofLexer, ReadsReals) {
    EXPECT_EQ(valueOf("1.5"), MofConstant(1.5));
    EXPECT_EQ(valueOf("-.25"), MofConstant(-0.25));
    EXPECT_EQ(valueOf("+2.0E+3"), MofConstant(2000.0));
    EXPECT_EQ(valueOf("2.5e-1"), MofConstant(0.25));
}

TEST(MofLexer, ASignEndsAHexadecimalNumber) {
    const auto all = tokens("0x1e+2");
    ASSERT_EQ(all.size(), 2U);
    EXPECT_EQ(all[0].value, integer(0x1E));
    EXPECT_EQ(all[1].value, integer(2));
}

TEST(MofLexer, ResolvesEscapes) {
    EXPECT_EQ(valueOf(R"("a\b\t\n\f\r\"\'\\b")"), MofConstant(std::string("a\b\t\n\f\r\"'\\b")));
    EXPECT_EQ(valueOf(R"("\x41\X00e4\x20ACx")"),
              MofConstant(std::string("A\xC3\xA4\xE2\x82\xACx")));
    EXPECT_EQ(valueOf(R"("\x00411")"), MofConstant(std::string("A1")));
    EXPECT_EQ(valueOf("\"\xC3\xA4 // /* \""), MofConstant(std::string("\xC3\xA4 // /* ")));
    EXPECT_EQ(valueOf("\"\""), MofConstant(std::string()));
}

TEST(MofLexer, ReadsCharacters) {
    EXPECT_EQ(valueOf("'a'"), MofConstant(u'a'));
    EXPECT_EQ(valueOf("'\\''"), MofConstant(u'\''));
    EXPECT_EQ(valueOf("'\\x20ac'"), MofConstant(u'\u20AC'));
    EXPECT_EQ(valueOf("'\xE2\x82\xAC'"), MofConstant(u'\u20AC'));
}

TEST(MofLexer, TellsWhereAndWhyATextIsWrong) {
    EXPECT_EQ(errorOf("a @"), "file.mof:1:3: unexpected character \"@\"");
    EXPECT_EQ(errorOf("\n\x01"), "file.mof:2:1: unexpected character byte 0x01");
    EXPECT_EQ(errorOf("\xC3\xA4"), "file.mof:1:1: unexpected character byte 0xC3");
    EXPECT_EQ(errorOf("a /* b\n"), "file.mof:1:3: this comment does not end");
    EXPECT_EQ(errorOf("/*/"), "file.mof:1:1: this comment does not end");
    EXPECT_EQ(errorOf("/ a"), "file.mof:1:1: unexpected character \"/\"");
    EXPECT_EQ(errorOf(" \"abc"), "file.mof:1:2: this string does not end on its line");
    EXPECT_EQ(errorOf("\"abc\n\""), "file.mof:1:1: this string does not end on its line");
    EXPECT_EQ(errorOf("\"abc\\"), "file.mof:1:5: unknown escape sequence");
    EXPECT_EQ(errorOf("\"a\\q\""), "file.mof:1:3: unknown escape sequence");
    EXPECT_EQ(errorOf("\"\\xg\""), "file.mof:1:2: \\x needs the number of a character");
    EXPECT_EQ(errorOf("\"\\x0\""), "file.mof:1:2: \\x needs the number of a character");
    EXPECT_EQ(errorOf("\"\\xD800\""), "file.mof:1:2: \\x needs the number of a character");
    EXPECT_EQ(errorOf("\"a\xE4\""), "file.mof:1:3: byte 0xE4 is not UTF-8");
    EXPECT_EQ(errorOf(std::string_view("\"a\0\"", 4)),
              "file.mof:1:3: a text cannot hold byte 0x00");
    EXPECT_EQ(errorOf("''"), "file.mof:1:1: a character literal holds exactly one character");
    EXPECT_EQ(errorOf("'ab'"), "file.mof:1:1: a character literal holds exactly one character");
    EXPECT_EQ(errorOf("'a"), "file.mof:1:1: this character does not end on its line");
    EXPECT_EQ(errorOf("'\xF0\x9F\x98\x80'"), "file.mof:1:1: a character literal holds 16 bits");
}

TEST(MofLexer, RefusesMalformedNumbers) {
    for (const std::string text :
         {"-", "+-1", "12a", "0x", "08", "1b2", "12b", "1.", "1.e5", "1.2.3", "1.5e", "."}) {
        const std::string written = text == "+-1" ? "+" : text;
        EXPECT_EQ(errorOf(text), "file.mof:1:1: \"" + written + "\" is not a number");
    }
    EXPECT_EQ(errorOf("18446744073709551616"),
              "file.mof:1:1: \"18446744073709551616\" does not fit 64 bits");
}

MofInitializer one(MofConstant constant) {
    return {false, {{std::move(constant), {3, 5}}}, {3, 5}};
}

MofConstant ofInteger(std::uint64_t magnitude, bool negative = false) {
    return MofInteger{negative, magnitude};
}

std::string errorOf(const MofInitializer& initializer, Type type, bool isArray = false) {
    try {
        static_cast<void>(typedValue(initializer, type, isArray, "f"));
    } catch (const MofError& error) {
        return error.what();
    }
    return "no error";
}

struct Range {
    Type type;
    std::uint64_t largest;
    std::uint64_t lowest;  ///< magnitude of the smallest value
};

TEST(MofValue, IntegersKeepTheRangeOfTheirType) {
    constexpr std::uint64_t two63 = 1ULL << 63U;
    for (const Range& range :
         {Range{Type::uint8, 255, 0}, Range{Type::uint16, 65535, 0},
          Range{Type::uint32, 4294967295, 0}, Range{Type::sint8, 127, 128},
          Range{Type::sint16, 32767, 32768}, Range{Type::sint32, 2147483647, 2147483648},
          Range{Type::sint64, two63 - 1, two63}}) {
        EXPECT_EQ(errorOf(one(ofInteger(range.largest)), range.type), "no error");
        EXPECT_EQ(errorOf(one(ofInteger(range.lowest, true)), range.type), "no error");
        EXPECT_EQ(errorOf(one(ofInteger(range.largest + 1)), range.type),
                  "f:3:5: " + std::to_string(range.largest + 1) + " does not fit " +
                      std::string(typeName(range.type)));
        EXPECT_EQ(errorOf(one(ofInteger(range.lowest + 1, true)), range.type),
                  "f:3:5: -" + std::to_string(range.lowest + 1) + " does not fit " +
                      std::string(typeName(range.type)));
    }
    EXPECT_EQ(errorOf(one(ofInteger(std::numeric_limits<std::uint64_t>::max())), Type::uint64),
              "no error");
}

TEST(MofValue, IntegersAreHeldInTheSignednessOfTheirType) {
    EXPECT_EQ(typedValue(one(ofInteger(5)), Type::uint8, false, "f"),
              (Value{Type::uint8, false, Scalar(std::uint64_t{5})}));
    EXPECT_EQ(typedValue(one(ofInteger(5)), Type::sint8, false, "f"),
              (Value{Type::sint8, false, Scalar(std::int64_t{5})}));
    EXPECT_EQ(typedValue(one(ofInteger(1ULL << 63U, true)), Type::sint64, false, "f"),
              (Value{Type::sint64, false, Scalar(std::numeric_limits<std::int64_t>::min())}));
}

TEST(MofValue, OtherTypesTakeTheirOwnLiterals) {
    EXPECT_EQ(typedValue(one(true), Type::boolean, false, "f"),
              (Value{Type::boolean, false, Scalar(true)}));
    EXPECT_EQ(typedValue(one(u'x'), Type::char16, false, "f"),
              (Value{Type::char16, false, Scalar(u'x')}));
    EXPECT_EQ(typedValue(one(1.5), Type::real32, false, "f"),
              (Value{Type::real32, false, Scalar(1.5)}));
    EXPECT_EQ(typedValue(one(ofInteger(2, true)), Type::real64, false, "f"),
              (Value{Type::real64, false, Scalar(-2.0)}));
    EXPECT_EQ(typedValue(one(std::string("a")), Type::string, false, "f"), Value::ofString("a"));
}

TEST(MofValue, DatetimesHaveTheirTwentyFiveCharacters) {
    for (const char* good :
         {"20240131093000.000000+060", "00000001000000.000000:000", "202401310930**.******-000"}) {
        EXPECT_EQ(errorOf(one(std::string(good)), Type::datetime), "no error");
    }
    for (const char* bad : {"", "2024", "20240131093000.000000+06*", "20240131093000,000000+060",
                            "20240131093000.000000x060", "2024013109300a.000000+060"}) {
        EXPECT_EQ(errorOf(one(std::string(bad)), Type::datetime),
                  "f:3:5: this is not a value of type datetime");
    }
}

TEST(MofValue, NullFitsEverything) {
    for (unsigned index = 0; index <= static_cast<unsigned>(Type::instance); ++index) {
        const auto type = static_cast<Type>(index);
        EXPECT_EQ(typedValue(one({}), type, false, "f"), Value::null(type, false));
        EXPECT_EQ(typedValue(one({}), type, true, "f"), Value::null(type, true));
    }
}

TEST(MofValue, ListsAreForArraysAndTheirElementsMayBeNull) {
    const MofInitializer list{true, {{ofInteger(1), {4, 1}}, {{}, {4, 4}}}, {3, 9}};
    EXPECT_EQ(typedValue(list, Type::uint8, true, "f"),
              (Value{Type::uint8, true, Array{std::uint64_t{1}, std::monostate()}}));
    EXPECT_EQ(typedValue({true, {}, {}}, Type::uint8, true, "f"),
              (Value{Type::uint8, true, Array()}));
    EXPECT_EQ(errorOf(list, Type::uint8), "f:3:9: one value is needed here, not a list");
    EXPECT_EQ(errorOf(one(ofInteger(1)), Type::uint8, true),
              "f:3:5: a list in braces is needed here");
    EXPECT_EQ(errorOf(list, Type::string, true), "f:4:1: this is not a value of type string");
}

TEST(MofValue, ValuesOfAnotherTypeAreRefused) {
    EXPECT_EQ(errorOf(one(true), Type::uint8), "f:3:5: this is not a value of type uint8");
    EXPECT_EQ(errorOf(one(1.5), Type::uint8), "f:3:5: this is not a value of type uint8");
    EXPECT_EQ(errorOf(one(ofInteger(1)), Type::string),
              "f:3:5: this is not a value of type string");
    EXPECT_EQ(errorOf(one(ofInteger(1)), Type::boolean),
              "f:3:5: this is not a value of type boolean");
    EXPECT_EQ(errorOf(one(std::string("a")), Type::char16),
              "f:3:5: this is not a value of type char16");
    EXPECT_EQ(errorOf(one(u'a'), Type::string), "f:3:5: this is not a value of type string");
    EXPECT_EQ(errorOf(one(std::string("a")), Type::real32),
              "f:3:5: this is not a value of type real32");
    EXPECT_EQ(errorOf(one(1e39), Type::real32), "f:3:5: this number does not fit real32");
    EXPECT_EQ(errorOf(one(std::string("X.A=1")), Type::reference),
              "f:3:5: a reference can have no default value but NULL");
}

}  // namespace
}  // namespace cimom
