#include "cimom/Utf8.h"

#include <gtest/gtest.h>

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
