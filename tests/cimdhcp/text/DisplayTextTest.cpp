#include "text/DisplayText.h"

#include <gtest/gtest.h>

namespace cimdhcp {
namespace {

using Lines = std::vector<std::string>;

TEST(DisplayText, KeepsPrintableText) {
    EXPECT_EQ(printable("eth0 büro 東京"), "eth0 büro 東京");
}

TEST(DisplayText, EscapesWhatCouldSteerATerminal) {
    EXPECT_EQ(printable("a\x1B[31mb\n\x7F"), "a\\x1B[31mb\\x0A\\x7F");
    EXPECT_EQ(printable("\xC2\x9B"), "\\u009B");
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

}  // namespace
}  // namespace cimdhcp
