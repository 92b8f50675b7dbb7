// Responses and classes as tables, and in which order.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"
#include "client/Response.h"
#include "commands/classes/ClassTable.h"
#include "commands/classes/ResponseText.h"
#include "kit/SmallSchema.h"
#include "text/Failure.h"

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

cimom::ObjectPath path(const std::string& id) {
    return {"", "root", "A", {{"Id", Value::ofString(id)}}};
}

cimom::Instance instance(const std::string& id, std::optional<std::uint64_t> size) {
    cimom::Instance made{path(id), {{"Id", Value::ofString(id)}}};
    if (size) {
        made.properties.push_back({"Size", {cimom::Type::uint64, false, cimom::Scalar(*size)}});
    }
    return made;
}

std::string order(const Response& response) {
    std::string text;
    for (const auto& each : response.instances) {
        const cimom::Value* const id = each ? each->property("Id") : nullptr;
        text += id == nullptr ? "- " : std::get<std::string>(*id->scalar()) + ' ';
    }
    return text;
}

TEST(ResponseOrder, PathsAreSortedByTheirText) {
    Response response;
    response.paths = {path("eth10"), std::nullopt, path("eth2")};
    sortResponse("path", response);
    EXPECT_THAT(response.paths, testing::ElementsAre(path("eth2"), path("eth10"), std::nullopt));
}

TEST(ResponseOrder, InstancesAreSortedByAPropertyAndThoseWithoutItComeLast) {
    Response response;
    response.instances = {instance("c", 10), instance("d", std::nullopt), std::nullopt,
                          instance("a", 9), instance("b", 10)};
    sortResponse("size", response);
    EXPECT_EQ(order(response), "a c b d - ");
    sortResponse("PATH", response);
    EXPECT_EQ(order(response), "a b c d - ");
}

TEST(ResponseOrder, WhatNothingHasIsAMistake) {
    Response response;
    response.instances = {instance("a", 1)};
    try {
        sortResponse("Color", response);
        ADD_FAILURE() << "accepted";
    } catch (const Failure& failure) {
        EXPECT_STREQ(failure.what(),
                     "--sort: there is no column \"Color\"; there are: PATH, Id, Size");
    }
    Response nothing;
    sortResponse("Color", nothing);
}

const ClassEntry thing{"TEST_Thing", "TEST_Base", false, "Things", {"root/cimv2", "root/b"}};
const ClassEntry linkEntry{"TEST_Link", "", true, "Links", {"root/cimv2"}};

TEST(ClassTable, IsATable) {
    EXPECT_EQ(classTable({thing, linkEntry}, std::nullopt),
              "CLASS       SUPERCLASS  KIND         PROVIDER\n"
              "TEST_Thing  TEST_Base   element      Things\n"
              "TEST_Link   -           association  Links\n");
}

TEST(ClassTable, IsJson) {
    EXPECT_EQ(classJson({linkEntry}), R"({
  "classes": [
    {
      "class": "TEST_Link",
      "superclass": null,
      "kind": "association",
      "provider": "Links",
      "namespaces": [
        "root/cimv2"
      ]
    }
  ]
}
)");
}

}  // namespace
}  // namespace cimdhcp
