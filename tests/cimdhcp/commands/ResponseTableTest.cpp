#include "commands/ResponseText.h"

#include <gtest/gtest.h>

#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"
#include "client/Response.h"
#include "kit/SmallSchema.h"

namespace cimdhcp {
namespace {

using cimom::Array;
using cimom::Scalar;
using cimom::Type;
using cimom::Value;

class ResponseTable : public ::testing::Test {
  protected:
    static cimom::Instance thing(const std::string& id) {
        cimom::Instance instance;
        instance.path = cimom::parseObjectPath("root/cimv2:TEST_Thing.Id=\"" + id + "\"");
        instance.properties = {
            {"Id", Value::ofString(id)},
            {"Text", Value::null(Type::string, false)},
            {"State", {Type::sint32, false, Scalar(std::int64_t{2})}},
            {"Options", {Type::uint16, true, Array{std::uint64_t{8}, std::uint64_t{14}}}}};
        return instance;
    }

    const cimom::ClassRepository repository_ = test::smallRepository();
};

TEST_F(ResponseTable, HasABlockPerInstanceAndLeavesNullOut) {
    EXPECT_EQ(asTable({"EnumerateInstances", {}, 0, {}, {thing("a"), thing("b"), std::nullopt}},
                      repository_, std::nullopt),
              "root/cimv2:TEST_Thing.Id=\"a\"\n"
              "  Id      = \"a\"\n"
              "  State   = 2 (Enabled)\n"
              "  Options = {8 (Eight), 14 (Fourteen)}\n"
              "\n"
              "root/cimv2:TEST_Thing.Id=\"b\"\n"
              "  Id      = \"b\"\n"
              "  State   = 2 (Enabled)\n"
              "  Options = {8 (Eight), 14 (Fourteen)}\n"
              "\n"
              "(null)\n");
}

TEST_F(ResponseTable, GoesOnInFurtherLinesOnATerminal) {
    EXPECT_EQ(asTable({"GetInstance", {}, 0, {}, {thing("a")}}, repository_, 33),
              "root/cimv2:TEST_Thing.Id=\"a\"\n"
              "  Id      = \"a\"\n"
              "  State   = 2 (Enabled)\n"
              "  Options = {8 (Eight), 14\n"
              "            (Fourteen)}\n");
}

TEST_F(ResponseTable, LeavesTheLinesToATerminalThatIsTooNarrow) {
    EXPECT_EQ(asTable({"GetInstance", {}, 0, {}, {thing("a")}}, repository_, 20),
              asTable({"GetInstance", {}, 0, {}, {thing("a")}}, repository_, std::nullopt));
}

TEST_F(ResponseTable, HasALinePerPathHoweverLong) {
    Response response{"EnumerateInstanceNames", {}, 0, {}, {}};
    const std::string text = "root/cimv2:TEST_Base.Id=\"" + std::string(100, 'x') + "\"";
    response.paths = {cimom::parseObjectPath(text), std::nullopt};
    EXPECT_EQ(asTable(response, repository_, 40), text + "\n(null)\n");
}

TEST_F(ResponseTable, LetsNothingSteerTheTerminal) {
    Response response{"EnumerateInstanceNames", {}, 0, {}, {}};
    response.paths = {cimom::parseObjectPath("root/cimv2:TEST_Base.Id=\"\x1B[2J\"")};
    EXPECT_EQ(asTable(response, repository_, 40), "root/cimv2:TEST_Base.Id=\"\\x1B[2J\"\n");
}

}  // namespace
}  // namespace cimdhcp
