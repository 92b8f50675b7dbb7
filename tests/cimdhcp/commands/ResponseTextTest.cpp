// Responses as JSON and as MOF.
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <limits>
#include <memory>

#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"
#include "cimom/Status.h"
#include "client/Response.h"
#include "commands/classes/ResponseText.h"
#include "kit/SmallSchema.h"

namespace cimdhcp {
namespace {

using ParsedJson = nlohmann::json;
using cimom::Array;
using cimom::Scalar;
using cimom::Type;
using cimom::Value;

/// One value in its place in the response.
ParsedJson valueIn(const Value& value) {
    cimom::Instance instance;
    instance.path.className = "TEST_Thing";
    instance.properties.push_back({"P", value});
    const ParsedJson document =
        ParsedJson::parse(asJson({"GetInstance", {}, 0, {}, {instance}}, false));
    return document["instances"][0]["properties"]["P"];
}

TEST(ResponseJson, HasAllPartsInTheirOrder) {
    Response response{"EnumerateInstanceNames", {}, 1, {}, {}};
    response.paths = {cimom::parseObjectPath("root/cimv2:TEST_Base.Id=\"a\""), std::nullopt};
    EXPECT_EQ(asJson(response, true), R"({
  "operation": "EnumerateInstanceNames",
  "status": {
    "code": 0,
    "name": "OK"
  },
  "returnDone": 1,
  "paths": [
    "root/cimv2:TEST_Base.Id=\"a\"",
    null
  ],
  "instances": []
}
)");
}

TEST(ResponseJson, AServerDoesNotTellAboutItsProvider) {
    EXPECT_NE(asJson({"GetInstance", {}, std::nullopt, {}, {}}, true).find("\"returnDone\": null"),
              std::string::npos);
}

TEST(ResponseJson, HasNothingOfTheProviderUnlessAskedFor) {
    EXPECT_EQ(asJson({"GetInstance", {}, 1, {}, {}}, false).find("returnDone"), std::string::npos);
}

TEST(ResponseJson, HasInstancesWithTheirProperties) {
    cimom::Instance instance;
    instance.path = cimom::parseObjectPath("root/cimv2:TEST_Base.Id=\"a\"");
    instance.properties = {{"Id", Value::ofString("a")},
                           {"Options", {Type::uint16, true, Array{std::uint64_t{8}, Scalar()}}},
                           {"State", Value::null(Type::sint32, false)}};
    EXPECT_EQ(asJson({"EnumerateInstances", {}, 0, {}, {instance, std::nullopt}}, true), R"({
  "operation": "EnumerateInstances",
  "status": {
    "code": 0,
    "name": "OK"
  },
  "returnDone": 0,
  "paths": [],
  "instances": [
    {
      "path": "root/cimv2:TEST_Base.Id=\"a\"",
      "class": "TEST_Base",
      "properties": {
        "Id": {
          "type": "string",
          "value": "a"
        },
        "Options": {
          "type": "uint16",
          "value": [
            8,
            null
          ]
        },
        "State": {
          "type": "sint32",
          "value": null
        }
      }
    },
    null
  ]
}
)");
}

TEST(ResponseJson, NamesTheStatus) {
    const Response response{"GetInstance", {CMPI_RC_ERR_NOT_FOUND, "words"}, 0, {}, {}};
    EXPECT_EQ(ParsedJson::parse(asJson(response, false))["status"],
              ParsedJson({{"code", 6}, {"name", "CIM_ERR_NOT_FOUND"}}));
}

TEST(ResponseJson, KeepsNumbersExactly) {
    EXPECT_EQ(
        valueIn({Type::uint64, false, Scalar(std::numeric_limits<std::uint64_t>::max())}).dump(),
        R"({"type":"uint64","value":18446744073709551615})");
    EXPECT_EQ(
        valueIn({Type::sint64, false, Scalar(std::numeric_limits<std::int64_t>::min())}).dump(),
        R"({"type":"sint64","value":-9223372036854775808})");
}

TEST(ResponseJson, WritesTheOtherTypes) {
    EXPECT_EQ(valueIn({Type::boolean, false, Scalar(true)})["value"], true);
    EXPECT_EQ(valueIn({Type::char16, false, Scalar(u'ü')})["value"], "ü");
    EXPECT_EQ(valueIn({Type::real64, false, Scalar(1.5)})["value"], 1.5);
    EXPECT_EQ(
        valueIn({Type::real64, false, Scalar(std::numeric_limits<double>::infinity())})["value"],
        "INF");
    EXPECT_EQ(
        valueIn({Type::real64, false, Scalar(-std::numeric_limits<double>::infinity())})["value"],
        "-INF");
    EXPECT_EQ(
        valueIn({Type::real64, false, Scalar(std::numeric_limits<double>::quiet_NaN())})["value"],
        "NaN");
    const auto path =
        std::make_shared<const cimom::ObjectPath>(cimom::parseObjectPath("a:TEST_Base.Id=\"x\""));
    EXPECT_EQ(valueIn({Type::reference, false, Scalar(path)}),
              ParsedJson({{"type", "reference"}, {"value", "a:TEST_Base.Id=\"x\""}}));
}

TEST(ResponseJson, NestsEmbeddedInstances) {
    cimom::Instance inner;
    inner.path.className = "TEST_Keyless";
    inner.properties.push_back({"Text", Value::ofString("x")});
    const ParsedJson json =
        valueIn({Type::instance, false, Scalar(std::make_shared<const cimom::Instance>(inner))});
    EXPECT_EQ(json["value"]["class"], "TEST_Keyless");
    EXPECT_EQ(json["value"]["properties"]["Text"]["value"], "x");
}

TEST(ResponseJson, IsJsonWhateverTheBytes) {
    EXPECT_EQ(valueIn(Value::ofString("a\xFF"))["value"], "a\xEF\xBF\xBD");
}

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
