#include <gtest/gtest.h>

#include <array>
#include <cstdlib>
#include <memory>
#include <string>

#include "cimxml/Errors.h"
#include "operations/ResponseBody.h"
#include "operations/Spool.h"

namespace cimom::wbem {

TEST(ResponseBody, IsWrittenPieceByPiece) {
    int left = 5;
    ResponseBody response(
        "<", [&left](std::string& out) { return left-- > 0 ? (out += "item", true) : false; }, ">");
    std::string out;
    response.write(out, 8);
    EXPECT_EQ(out, "<itemitem");
    EXPECT_FALSE(response.ended());
    out.clear();
    response.write(out, 8);
    EXPECT_EQ(out, "itemitem");
    out.clear();
    response.write(out, 1000);
    EXPECT_EQ(out, "item>");
    EXPECT_TRUE(response.ended());
    response.write(out, 1000);
    EXPECT_EQ(out, "item>");
}

TEST(ResponseBody, AtHandIsWrittenWhole) {
    ResponseBody response("all of it");
    std::string out;
    response.write(out, 1);
    EXPECT_EQ(out, "all of it");
    EXPECT_TRUE(response.ended());
}

TEST(ResponseBody, LetsGoOfItsObjectsAtTheEnd) {
    auto object = std::make_shared<int>(1);
    const std::weak_ptr<int> watched = object;
    ResponseBody response(
        "", [held = std::move(object)](std::string&) { return false; }, "");
    std::string out;
    response.write(out, 1);
    EXPECT_TRUE(watched.expired());
}

std::string content(const Spool& spool) {
    std::string text;
    spool.read(0, spool.size(), text);
    return text;
}

/// Makes the memory that spools share be in use, as long as it lives: others go to the disk.
class OtherSpools {
  public:
    OtherSpools() {
        for (Spool& each : spools_) {
            each.append(std::string(70'000, 'o'));
        }
    }

  private:
    std::array<Spool, 2> spools_{Spool(100'000), Spool(100'000)};
};

void expectWhatItGot(int pieces) {
    Spool spool(10'000'000);
    std::string expected;
    for (int count = 0; count < pieces; ++count) {
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

TEST(Spool, GivesBackWhatItGotFromMemory) {
    expectWhatItGot(30'000);
    // The memory is used again.
    expectWhatItGot(30'000);
}

TEST(Spool, GivesBackWhatItGotFromTheDisk) {
    const OtherSpools others;
    expectWhatItGot(30'000);
}

TEST(Spool, GivesBackWhatIsTooMuchForItsMemory) {
    expectWhatItGot(400'000);
}

void expectToForgetWhatIsCut() {
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

TEST(Spool, ForgetsWhatIsCut) {
    expectToForgetWhatIsCut();
    const OtherSpools others;
    expectToForgetWhatIsCut();
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
    const OtherSpools others;
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
