#include "cimxml/Call.h"

#include <gtest/gtest.h>

#include "cimxml/Errors.h"
#include "kit/WireSupport.h"

namespace cimom::wbem {

std::string failureOf(const std::string& body) {
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
        failureOf(message("<SIMPLEREQ><CORRELATOR NAME='x' TYPE='string'><VALUE/></CORRELATOR>"
                          "<METHODCALL NAME='x'/></SIMPLEREQ>")),
        "none");
}

TEST(Call, BadBodiesFailAsTheStandardSays) {
    EXPECT_EQ(failureOf("<CIM"), "400 request-not-well-formed: line 1: unclosed token");
    EXPECT_EQ(failureOf("<HTML/>"), "400 request-not-valid: element HTML where CIM belongs");
    EXPECT_EQ(failureOf("<!DOCTYPE CIM><CIM/>"),
              "400 request-not-well-formed: line 1: a document type declaration is not accepted");
    EXPECT_EQ(failureOf("<CIM CIMVERSION='3.0' DTDVERSION='2.0'/>"),
              "501 unsupported-cim-version: CIMVERSION 3.0");
    EXPECT_EQ(failureOf("<CIM CIMVERSION='2.0' DTDVERSION='1.0'/>"),
              "501 unsupported-dtd-version: DTDVERSION 1.0");
    EXPECT_EQ(failureOf("<CIM CIMVERSION='2.0' DTDVERSION='2.0'><MESSAGE ID='1' "
                        "PROTOCOLVERSION='2.0'/></CIM>"),
              "501 unsupported-protocol-version: PROTOCOLVERSION 2.0");
    EXPECT_EQ(failureOf("<CIM CIMVERSION='2.' DTDVERSION='2.0'/>"),
              "501 unsupported-cim-version: CIMVERSION 2.");
    EXPECT_EQ(failureOf(message("<MULTIREQ/>")),
              "501 multiple-requests-unsupported: several requests");
    EXPECT_EQ(failureOf(message("")), "400 request-not-valid: the content of MESSAGE");
    EXPECT_EQ(failureOf(message("<SIMPLEREQ/>")),
              "400 request-not-valid: the content of SIMPLEREQ");
    EXPECT_EQ(failureOf(message("<SIMPLEREQ/><SIMPLEREQ/>")),
              "400 request-not-valid: the content of MESSAGE");
    EXPECT_EQ(failureOf(message("<SIMPLEREQ><IMETHODCALL NAME='x'/></SIMPLEREQ>")),
              "400 request-not-valid: IMETHODCALL without LOCALNAMESPACEPATH");
    EXPECT_EQ(failureOf(test::callXml("x", "<VALUE/>")),
              "400 request-not-valid: element VALUE where IPARAMVALUE belongs");
    EXPECT_EQ(failureOf(test::callXml("x", test::parameter("p", "<VALUE/><VALUE/>"))),
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

}  // namespace cimom::wbem
