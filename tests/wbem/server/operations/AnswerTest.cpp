#include "operations/Answer.h"

#include <gtest/gtest.h>

#include <memory>

namespace cimom::wbem {

TEST(Answer, IsWrittenPieceByPiece) {
    int left = 5;
    Answer answer(
        "<", [&left](std::string& out) { return left-- > 0 ? (out += "item", true) : false; }, ">");
    std::string out;
    answer.write(out, 8);
    EXPECT_EQ(out, "<itemitem");
    EXPECT_FALSE(answer.ended());
    out.clear();
    answer.write(out, 8);
    EXPECT_EQ(out, "itemitem");
    out.clear();
    answer.write(out, 1000);
    EXPECT_EQ(out, "item>");
    EXPECT_TRUE(answer.ended());
    answer.write(out, 1000);
    EXPECT_EQ(out, "item>");
}

TEST(Answer, AtHandIsWrittenWhole) {
    Answer answer("all of it");
    std::string out;
    answer.write(out, 1);
    EXPECT_EQ(out, "all of it");
    EXPECT_TRUE(answer.ended());
}

TEST(Answer, LetsGoOfItsObjectsAtTheEnd) {
    auto object = std::make_shared<int>(1);
    const std::weak_ptr<int> watched = object;
    Answer answer(
        "", [held = std::move(object)](std::string&) { return false; }, "");
    std::string out;
    answer.write(out, 1);
    EXPECT_TRUE(watched.expired());
}

}  // namespace cimom::wbem
