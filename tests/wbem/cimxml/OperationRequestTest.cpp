#include "cimxml/OperationRequest.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimxml/Call.h"
#include "kit/ElementTable.h"
#include "kit/RandomObjects.h"
#include "operations/Parameters.h"

namespace cimom::wbem {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

ObjectPath thing(const std::string& id) {
    return {"host", "root/other", "A_Thing", {{"Id", Value::ofString(id)}}};
}

TEST(OperationRequest, IsReadByTheServerAsWhatItWas) {
    OperationRequest request("Associators", "root/cimv2");
    request.instanceName("ObjectName", thing("a<b"))
        .className("AssocClass", "A_Link")
        .className("ResultClass", std::nullopt)
        .text("Role", "<Role>")
        .text("ResultRole", std::nullopt)
        .flag("IncludeQualifiers", false)
        .flag("IncludeClassOrigin", true)
        .texts("PropertyList", std::vector<std::string>{"a", "&"});
    EXPECT_THAT(test::violations(readXml(request.body(), 64)), IsEmpty());
    const Call call = readCall(request.body(), 64);
    EXPECT_EQ(call.method, "Associators");
    EXPECT_EQ(call.nameSpace, "root/cimv2");
    Parameters parameters(call);
    EXPECT_EQ(parameters.requiredInstanceName("ObjectName"),
              (ObjectPath{"", "", "A_Thing", {{"Id", Value::ofString("a<b")}}}));
    EXPECT_EQ(parameters.className("AssocClass"), "A_Link");
    EXPECT_EQ(parameters.className("ResultClass"), std::nullopt);
    EXPECT_EQ(parameters.text("Role"), "<Role>");
    EXPECT_EQ(parameters.text("ResultRole"), std::nullopt);
    EXPECT_FALSE(parameters.flag("IncludeQualifiers", true));
    EXPECT_TRUE(parameters.flag("IncludeClassOrigin", false));
    EXPECT_THAT(*parameters.texts("PropertyList"), ElementsAre("a", "&"));
    parameters.finish();
}

TEST(OperationRequest, CarriesInstancesOfAnyContent) {
    test::RandomObjects random(test::randomSeed());
    for (int round = 0; round < 500; ++round) {
        Instance made = random.instance();
        made.path.keys = {{"Id", Value::ofString(random.text())}};
        OperationRequest request("ModifyInstance", "root");
        request.namedInstance("ModifiedInstance", made);
        ASSERT_THAT(test::violations(readXml(request.body(), 64)), IsEmpty());
        const Call call = readCall(request.body(), 64);
        const Instance back = Parameters(call).requiredNamedInstance("ModifiedInstance");
        ASSERT_EQ(back.properties, made.properties) << request.body();
        ASSERT_EQ(back.path.keys, made.path.keys) << request.body();
    }
}

TEST(OperationRequest, CarriesNewInstancesWithoutAPath) {
    Instance made;
    made.path = {"", "root/x", "A_Class", {{"Id", Value::ofString("1")}}};
    made.properties = {{"Id", Value::ofString("1")}};
    OperationRequest request("CreateInstance", "root/x");
    request.instance("NewInstance", made);
    ASSERT_THAT(test::violations(readXml(request.body(), 64)), IsEmpty());
    const Call call = readCall(request.body(), 64);
    const Instance back = Parameters(call).requiredInstance("NewInstance");
    EXPECT_EQ(back.path, (ObjectPath{"", "", "A_Class", {}}));
    EXPECT_EQ(back.properties, made.properties);
}

TEST(OperationRequest, NothingOfANamespaceGetsIntoAHeaderUnencoded) {
    EXPECT_EQ(OperationRequest("X", "root/cimv2").objectHeader(), "root/cimv2");
    EXPECT_EQ(OperationRequest("X", "a b\r\nEvil: 1/\xC3\xA4").objectHeader(),
              "a%20b%0D%0AEvil%3A%201/%C3%A4");
}

}  // namespace cimom::wbem
