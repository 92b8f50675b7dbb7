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

class ResponseMof : public ::testing::Test {
  protected:
    const cimom::ClassRepository repository_ = test::smallRepository();
};

TEST_F(ResponseMof, DeclaresInstancesWithMeanings) {
    cimom::Instance instance;
    instance.path.className = "TEST_Thing";
    instance.properties = {
        {"Id", Value::ofString("a\"b\nc")},
        {"State", {Type::sint32, false, Scalar(std::int64_t{2})}},
        {"Options", {Type::uint16, true, Array{std::uint64_t{8}, std::uint64_t{14}}}},
        {"Text", Value::null(Type::string, false)}};
    EXPECT_EQ(asMof({"EnumerateInstances", {}, 0, {}, {instance, std::nullopt}}, repository_),
              "instance of TEST_Thing {\n"
              "    Id      = \"a\\\"b\\nc\";\n"
              "    State   = 2;  // Enabled\n"
              "    Options = {8, 14};  // Eight, Fourteen\n"
              "    Text    = NULL;\n"
              "};\n"
              "\n"
              "// The provider delivered a null instance.\n");
}

TEST_F(ResponseMof, DeclaresTheKeysOfPaths) {
    Response response{"EnumerateInstanceNames", {}, 0, {}, {}};
    response.paths = {cimom::parseObjectPath("root/cimv2:TEST_Base.Id=\"a\""), std::nullopt};
    EXPECT_EQ(asMof(response, repository_),
              "instance of TEST_Base {\n"
              "    Id = \"a\";\n"
              "};\n"
              "\n"
              "// The provider delivered a null path.\n");
}

TEST_F(ResponseMof, KeepsAnUnknownClass) {
    cimom::Instance instance;
    instance.path.className = "TEST_Unknown";
    instance.properties = {{"State", {Type::sint32, false, Scalar(std::int64_t{2})}}};
    EXPECT_EQ(asMof({"GetInstance", {}, 0, {}, {instance}}, repository_),
              "instance of TEST_Unknown {\n    State = 2;\n};\n");
}

TEST_F(ResponseMof, LetsNoMeaningEndItsComment) {
    cimom::ClassRepository repository;
    repository.loadText(
        "Qualifier Values : string[], Scope(property), Flavor(EnableOverride, ToSubclass);\n"
        "class TEST_Odd { [Values {\"a\\nb\"}] uint8 P; };",
        "odd.mof");
    cimom::Instance instance;
    instance.path.className = "TEST_Odd";
    instance.properties = {{"P", {Type::uint8, false, Scalar(std::uint64_t{0})}}};
    EXPECT_EQ(asMof({"GetInstance", {}, 0, {}, {instance}}, repository),
              "instance of TEST_Odd {\n    P = 0;  // a\\x0Ab\n};\n");
}

TEST_F(ResponseMof, IsEmptyForAnEmptyResponse) {
    EXPECT_EQ(asMof({"ModifyInstance", {}, 1, {}, {}}, repository_), "");
}

}  // namespace
}  // namespace cimdhcp
