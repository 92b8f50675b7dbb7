#include "operations/Spool.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "cimxml/Errors.h"

namespace cimom::wbem {

std::string content(const Spool& spool) {
    std::string text;
    spool.read(0, spool.size(), text);
    return text;
}

TEST(Spool, GivesBackWhatItGotWhereverThatIs) {
    Spool spool(1'000'000);
    std::string expected;
    for (int count = 0; count < 30'000; ++count) {
        const std::string piece = std::to_string(count) + ',';
        spool.append(piece);
        expected += piece;
    }
    EXPECT_EQ(spool.size(), expected.size());
    EXPECT_EQ(content(spool), expected);
    // Also across the border between file and memory, which is at some multiple.
    for (std::size_t at = 0; at + 1000 < expected.size(); at += 999) {
        std::string text = "before ";
        spool.read(at, 1000, text);
        ASSERT_EQ(text, "before " + expected.substr(at, 1000));
    }
}

TEST(Spool, ForgetsWhatIsCut) {
    Spool spool(1'000'000);
    spool.append("kept");
    spool.append("forgotten");
    spool.cut(4);
    EXPECT_EQ(content(spool), "kept");
    spool.append(std::string(200'000, 'x'));
    spool.cut(4);
    EXPECT_EQ(content(spool), "kept");
    spool.append(" and more");
    EXPECT_EQ(content(spool), "kept and more");
    spool.append(std::string(100'000, 'y'));
    EXPECT_EQ(content(spool), "kept and more" + std::string(100'000, 'y'));
    spool.cut(200'000);
    EXPECT_EQ(spool.size(), 100'013U);
}

TEST(Spool, HasALimit) {
    Spool spool(10);
    spool.append("0123456789");
    try {
        spool.append("x");
        FAIL();
    } catch (const CimError& error) {
        EXPECT_EQ(error.code, static_cast<unsigned>(CimStatus::serverLimitsExceeded));
        EXPECT_STREQ(error.what(), "the result is longer than 10 bytes");
    }
    EXPECT_EQ(content(spool), "0123456789");
}

TEST(Spool, TellsThatThereIsNoRoomOnTheDisk) {
    const char* const before = std::getenv("TMPDIR");
    const std::string kept = before == nullptr ? "" : before;
    ::setenv("TMPDIR", "/nowhere", 1);
    Spool spool(1'000'000);
    spool.append("short results need no disk");
    try {
        spool.append(std::string(100'000, 'x'));
        FAIL();
    } catch (const CimError& error) {
        EXPECT_STREQ(error.what(), "no temporary file in /nowhere: No such file or directory");
    }
    if (kept.empty()) {
        ::unsetenv("TMPDIR");
    } else {
        ::setenv("TMPDIR", kept.c_str(), 1);
    }
}

}  // namespace cimom::wbem
