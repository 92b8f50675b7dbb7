#include "zrcommon/PropertyFile.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "kit/Files.h"

namespace ZR {

namespace {

using Testing::TemporaryDirectory;
using Testing::writeFile;

using Lines = std::vector<PropertyLine>;

std::string withZeroByte(const char* before, const char* after) {
    return std::string(before) + '\0' + after;
}

TEST(PropertyLines, NumberCountsEveryLineOfTheText) {
    EXPECT_EQ(parsePropertyLines("A=1\n\n# B=2\nC=3\n"), (Lines{{"A", "1", 1}, {"C", "3", 4}}));
}

TEST(PropertyLines, LastLineNeedsNoLineFeed) {
    EXPECT_EQ(parsePropertyLines("A=1"), (Lines{{"A", "1", 1}}));
}

TEST(PropertyLines, BlanksAroundKeyAndValueDoNotCount) {
    EXPECT_EQ(parsePropertyLines(" \tA\t = \t1 2 \t\n"), (Lines{{"A", "1 2", 1}}));
}

TEST(PropertyLines, CarriageReturnsBeforeLineFeedsDoNotCount) {
    EXPECT_EQ(parsePropertyLines("A=1\r\n\r\nB=2\r\n"), (Lines{{"A", "1", 1}, {"B", "2", 3}}));
}

TEST(PropertyLines, OnePairOfMatchingQuotesIsTakenOff) {
    EXPECT_EQ(parsePropertyLines("A=\"x\"\nB='x'\nC=\"'x'\"\nD='\"x\"'\nE=\"\"\nF=\" x \"\n"),
              (Lines{{"A", "x", 1},
                     {"B", "x", 2},
                     {"C", "'x'", 3},
                     {"D", "\"x\"", 4},
                     {"E", "", 5},
                     {"F", " x ", 6}}));
}

TEST(PropertyLines, QuotesThatDoNotMatchStay) {
    EXPECT_EQ(parsePropertyLines("A=\"x'\nB=\"x\nC=x\"\nD=\"\nE=\"x\" y\n"),
              (Lines{{"A", "\"x'", 1},
                     {"B", "\"x", 2},
                     {"C", "x\"", 3},
                     {"D", "\"", 4},
                     {"E", "\"x\" y", 5}}));
}

TEST(PropertyLines, CommentBeginsWithTheFirstCharacterThatIsNoBlank) {
    EXPECT_EQ(parsePropertyLines("#A=1\n  # B=2\nC=3 # not a comment\n"),
              (Lines{{"C", "3 # not a comment", 3}}));
}

TEST(PropertyLines, FirstEqualsSignEndsTheKey) {
    EXPECT_EQ(parsePropertyLines("A=b=c\nD==\n"), (Lines{{"A", "b=c", 1}, {"D", "=", 2}}));
}

TEST(PropertyLines, ValueMayBeEmpty) {
    EXPECT_EQ(parsePropertyLines("A=\nB =   \n"), (Lines{{"A", "", 1}, {"B", "", 2}}));
}

TEST(PropertyLines, LinesThatAreNoPairHaveAnEmptyKeyAndAreWhole) {
    EXPECT_EQ(parsePropertyLines("  words \n=x\n = x\n"),
              (Lines{{"", "words", 1}, {"", "=x", 2}, {"", "= x", 3}}));
}

TEST(PropertyLines, EmptyTextHasNone) {
    EXPECT_EQ(parsePropertyLines(""), Lines{});
}

TEST(PropertyLines, ZeroBytesBelongToTheText) {
    EXPECT_EQ(parsePropertyLines(withZeroByte("A=x", "y\nB=2\n")),
              (Lines{{"A", withZeroByte("x", "y"), 1}, {"B", "2", 2}}));
}

class PropertyFileTest : public testing::Test {
  protected:
    PropertyFile opened(const std::string& content) {
        writeFile(path_, content);
        PropertyFile file{File::Path(path_)};
        EXPECT_TRUE(file.open(PropertyFile::readMode));
        return file;
    }

    TemporaryDirectory directory_;
    std::string path_ = directory_ / "ifcfg-eth0";
};

TEST_F(PropertyFileTest, LastOfEqualKeysCounts) {
    EXPECT_EQ(opened("NAME=first\nOTHER=x\nNAME=last\n").getValue(L"NAME"), L"last");
}

TEST_F(PropertyFileTest, LastOfEqualKeysCountsEvenWhenItIsEmpty) {
    EXPECT_EQ(opened("NAME=first\nNAME=\n").getValue(L"NAME"), L"");
}

TEST_F(PropertyFileTest, MissingKeyIsTheEmptyText) {
    EXPECT_EQ(opened("NAME=x\n").getValue(L"NAM"), L"");
}

TEST_F(PropertyFileTest, KeysAreComparedWithRegardToCase) {
    EXPECT_EQ(opened("NAME=x\n").getValue(L"Name"), L"");
}

TEST_F(PropertyFileTest, EmptyKeyNeverHasAValue) {
    EXPECT_EQ(opened("=x\nwords\n").getValue(L""), L"");
}

TEST_F(PropertyFileTest, ReadsKeysAndValuesThatAreNotAscii) {
    EXPECT_EQ(opened("GR\xC3\x96SSE=\xE2\x82\xAC\n").getValue(L"GR\u00D6SSE"), L"\u20AC");
}

TEST_F(PropertyFileTest, BytesThatAreNoTextComeBackUnchanged) {
    const std::wstring value = opened("NAME=a\xFF\xC3z\n").getValue(L"NAME");
    EXPECT_EQ(value, (std::wstring{L'a', wchar_t{0xDCFF}, wchar_t{0xDCC3}, L'z'}));
}

TEST_F(PropertyFileTest, MissingFileCannotBeOpenedAndHasNoKeys) {
    PropertyFile file{File::Path(directory_ / "missing")};
    EXPECT_FALSE(file.open(PropertyFile::readMode));
    EXPECT_EQ(file.getValue(L"NAME"), L"");
}

TEST_F(PropertyFileTest, DirectoryCannotBeOpened) {
    PropertyFile file{File::Path(directory_.path().string())};
    EXPECT_FALSE(file.open(PropertyFile::readMode));
}

TEST_F(PropertyFileTest, OtherModesThanReadingAreRefused) {
    PropertyFile file = opened("NAME=x\n");
    for (const int mode : {0, 2, -1}) {
        EXPECT_FALSE(file.open(mode)) << mode;
        EXPECT_EQ(file.getValue(L"NAME"), L"") << mode;
    }
}

TEST_F(PropertyFileTest, OpeningAgainReadsTheFileAnew) {
    PropertyFile file = opened("NAME=old\nGONE=x\n");
    writeFile(path_, "NAME=new\n");
    EXPECT_EQ(file.getValue(L"NAME"), L"old");
    ASSERT_TRUE(file.open(PropertyFile::readMode));
    EXPECT_EQ(file.getValue(L"NAME"), L"new");
    EXPECT_EQ(file.getValue(L"GONE"), L"");
}

TEST_F(PropertyFileTest, OpeningAgainInVainForgetsWhatWasRead) {
    PropertyFile file = opened("NAME=old\n");
    std::filesystem::remove(path_);
    EXPECT_FALSE(file.open(PropertyFile::readMode));
    EXPECT_EQ(file.getValue(L"NAME"), L"");
}

TEST_F(PropertyFileTest, CloseForgetsWhatWasRead) {
    PropertyFile file = opened("NAME=x\n");
    file.close();
    EXPECT_EQ(file.getValue(L"NAME"), L"");
}

}  // namespace

}  // namespace ZR
