#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimxml/Call.h"
#include "cimxml/Errors.h"
#include "cimxml/OperationRequest.h"
#include "kit/ElementTable.h"
#include "kit/RandomObjects.h"
#include "kit/WireSupport.h"
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

std::string refusalOfBody(const std::string& body) {
    try {
        static_cast<void>(readCall(body, 16));
    } catch (const HttpFailure& failure) {
        return std::to_string(failure.status) + ' ' + failure.cimError + ": " + failure.what();
    }
    return "none";
}

std::string message(const std::string& content) {
    return R"(<CIM CIMVERSION="2.0" DTDVERSION="2.3.1"><MESSAGE ID="1" PROTOCOLVERSION="1.4">)" +
           content + "</MESSAGE></CIM>";
}

TEST(Call, ReadsAnOperation) {
    const Call call = readCall(
        test::callXml("GetClass", test::classParameter("A") + "<IPARAMVALUE NAME='Nothing'/>",
                      "a/b/c"),
        16);
    EXPECT_EQ(call.messageId, "17");
    EXPECT_EQ(call.method, "GetClass");
    EXPECT_EQ(call.nameSpace, "a/b/c");
    EXPECT_TRUE(call.intrinsic);
    ASSERT_EQ(call.parameters.size(), 2U);
    EXPECT_EQ(call.parameters[0].value->name, "CLASSNAME");
    EXPECT_EQ(call.parameters[1], (Parameter{"Nothing", std::nullopt}));
}

TEST(Call, ReadsAMethodOfAClassWithoutLookingIntoIt) {
    const Call call = readCall(
        message("<SIMPLEREQ><METHODCALL NAME='Reboot'><LOCALCLASSPATH/></METHODCALL></SIMPLEREQ>"),
        16);
    EXPECT_FALSE(call.intrinsic);
    EXPECT_EQ(call.method, "Reboot");
}

TEST(Call, PassesOverCorrelators) {
    EXPECT_EQ(
        refusalOfBody(message("<SIMPLEREQ><CORRELATOR NAME='x' TYPE='string'><VALUE/></CORRELATOR>"
                              "<METHODCALL NAME='x'/></SIMPLEREQ>")),
        "none");
}

TEST(Call, BadBodiesFailAsTheStandardSays) {
    EXPECT_EQ(refusalOfBody("<CIM"), "400 request-not-well-formed: line 1: unclosed token");
    EXPECT_EQ(refusalOfBody("<HTML/>"), "400 request-not-valid: element HTML where CIM belongs");
    EXPECT_EQ(refusalOfBody("<!DOCTYPE CIM><CIM/>"),
              "400 request-not-well-formed: line 1: a document type declaration is not accepted");
    EXPECT_EQ(refusalOfBody("<CIM CIMVERSION='3.0' DTDVERSION='2.0'/>"),
              "501 unsupported-cim-version: CIMVERSION 3.0");
    EXPECT_EQ(refusalOfBody("<CIM CIMVERSION='2.0' DTDVERSION='1.0'/>"),
              "501 unsupported-dtd-version: DTDVERSION 1.0");
    EXPECT_EQ(refusalOfBody("<CIM CIMVERSION='2.0' DTDVERSION='2.0'><MESSAGE ID='1' "
                            "PROTOCOLVERSION='2.0'/></CIM>"),
              "501 unsupported-protocol-version: PROTOCOLVERSION 2.0");
    EXPECT_EQ(refusalOfBody("<CIM CIMVERSION='2.' DTDVERSION='2.0'/>"),
              "501 unsupported-cim-version: CIMVERSION 2.");
    EXPECT_EQ(refusalOfBody(message("<MULTIREQ/>")),
              "501 multiple-requests-unsupported: several requests");
    EXPECT_EQ(refusalOfBody(message("")), "400 request-not-valid: the content of MESSAGE");
    EXPECT_EQ(refusalOfBody(message("<SIMPLEREQ/>")),
              "400 request-not-valid: the content of SIMPLEREQ");
    EXPECT_EQ(refusalOfBody(message("<SIMPLEREQ/><SIMPLEREQ/>")),
              "400 request-not-valid: the content of MESSAGE");
    EXPECT_EQ(refusalOfBody(message("<SIMPLEREQ><IMETHODCALL NAME='x'/></SIMPLEREQ>")),
              "400 request-not-valid: IMETHODCALL without LOCALNAMESPACEPATH");
    EXPECT_EQ(refusalOfBody(test::callXml("x", "<VALUE/>")),
              "400 request-not-valid: element VALUE where IPARAMVALUE belongs");
    EXPECT_EQ(refusalOfBody(test::callXml("x", test::parameter("p", "<VALUE/><VALUE/>"))),
              "400 request-not-valid: the content of IPARAMVALUE");
}

TEST(Call, WritesErrorsThatNameTheirStatus) {
    Call call;
    call.messageId = "<1>";
    call.method = "GetInstance";
    const std::string body = errorResponse(call, 6, "");
    const XmlElement cim = test::checked(body);
    EXPECT_EQ(*cim.children.at(0).attribute("ID"), "<1>");
    EXPECT_NE(body.find(R"(<ERROR CODE="6" DESCRIPTION="CIM_ERR_NOT_FOUND"/>)"), std::string::npos);
    EXPECT_NE(errorResponse(call, 21, "").find("CIM_ERR_INVALID_ENUMERATION_CONTEXT"),
              std::string::npos);
}

TEST(Errors, NamesTheStatusCodesOfTheStandard) {
    EXPECT_EQ(cimStatusName(1), "CIM_ERR_FAILED");
    EXPECT_EQ(cimStatusName(static_cast<unsigned>(CimStatus::notSupported)),
              "CIM_ERR_NOT_SUPPORTED");
    EXPECT_EQ(cimStatusName(17), "CIM_ERR_METHOD_NOT_FOUND");
    EXPECT_EQ(cimStatusName(20), "CIM_ERR_NAMESPACE_NOT_EMPTY");
    EXPECT_EQ(cimStatusName(static_cast<unsigned>(CimStatus::serverLimitsExceeded)),
              "CIM_ERR_SERVER_LIMITS_EXCEEDED");
    EXPECT_EQ(cimStatusName(29), "CIM_ERR_QUERY_FEATURE_NOT_SUPPORTED");
}

TEST(Errors, CallsUnknownCodesFailures) {
    for (const unsigned code : {0U, 18U, 19U, 30U, 4294967295U}) {
        EXPECT_EQ(cimStatusName(code), "CIM_ERR_FAILED");
    }
}

}  // namespace cimom::wbem
