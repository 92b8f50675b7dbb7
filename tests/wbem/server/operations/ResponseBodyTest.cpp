#include "operations/ResponseBody.h"

#include <gtest/gtest.h>

#include <memory>

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

}  // namespace cimom::wbem
