#include "cimxml/ExportMessage.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <limits>
#include <memory>

#include "cimxml/Errors.h"
#include "kit/ElementTable.h"

namespace cimom::wbem {
namespace {

using testing::HasSubstr;

Value ofNumber(std::int64_t number) {
    return {Type::sint64, false, Scalar(number)};
}

Instance creation() {
    auto lease = std::make_shared<Instance>();
    lease->path.className = "A_Lease";
    lease->properties = {{"InstanceID", Value::ofString("a < \"b\"")}};
    Instance indication;
    indication.path = {"", "root/cimv2", "CIM_InstCreation", {}};
    indication.properties = {
        {"SourceInstance",
         {Type::instance, false, Scalar(std::shared_ptr<const Instance>(std::move(lease)))}},
        {"SequenceContext", Value::ofString("the provider's own")},
        {"SequenceNumber", ofNumber(77)}};
    return indication;
}

std::string message(const IndicationSequence& sequence = {"context", 0}) {
    return exportMessage("5", indicationText(creation(), "my & filter"), sequence);
}

/// What a listener responds to a body that it cannot take.
std::string exportRefusal(const std::string& body) {
    try {
        static_cast<void>(indicationOf(readExportCall(body, 16)));
        return "accepted";
    } catch (const HttpFailure& failure) {
        return std::to_string(failure.status) + ' ' + failure.cimError;
    } catch (const CimError& error) {
        return "CIM " + std::to_string(error.code);
    }
}

std::string replaced(std::string text, const std::string& from, const std::string& to) {
    const std::size_t at = text.find(from);
    EXPECT_NE(at, std::string::npos) << from;
    return at == std::string::npos ? text : text.replace(at, from.size(), to);
}

TEST(ExportMessage, IsOfTheStructureOfTheStandard) {
    EXPECT_EQ(test::violations(readXml(message(), 16)), std::vector<std::string>());
    const ExportCall call{"5", "ExportIndication", {}};
    EXPECT_EQ(test::violations(readXml(exportResponse(call, {}), 16)), std::vector<std::string>());
    EXPECT_EQ(test::violations(readXml(exportResponse(call, {1, "full <"}), 16)),
              std::vector<std::string>());
}

TEST(ExportMessage, BringsTheIndicationWithItsFilterAndItsSequenceAlone) {
    const ExportCall call =
        readExportCall(message({"c#1", std::numeric_limits<std::int64_t>::max()}), 16);
    EXPECT_EQ(call.messageId, "5");
    const Instance got = indicationOf(call);
    EXPECT_EQ(got.path.className, "CIM_InstCreation");
    ASSERT_EQ(got.properties.size(), 4U);
    EXPECT_EQ(*got.property("IndicationFilterName"), Value::ofString("my & filter"));
    EXPECT_EQ(*got.property("SequenceContext"), Value::ofString("c#1"));
    EXPECT_EQ(*got.property("SequenceNumber"), ofNumber(std::numeric_limits<std::int64_t>::max()));
    const auto lease =
        std::get<std::shared_ptr<const Instance>>(*got.property("SourceInstance")->scalar());
    EXPECT_EQ(*lease->property("InstanceID"), Value::ofString("a < \"b\""));
}

TEST(ExportMessage, ItsParameterHasNoAttributeButItsName) {
    EXPECT_THAT(message(), HasSubstr("<EXPPARAMVALUE NAME=\"NewIndication\"><INSTANCE "));
    EXPECT_THAT(message(), HasSubstr("<EXPMETHODCALL NAME=\"ExportIndication\"><EXPPARAMVALUE"));
}

TEST(ExportMessage, ResponsesAreReadAsTheyAreWritten) {
    const ExportCall call{"7", "ExportIndication", {}};
    for (const ExportResponse& response :
         {ExportResponse{}, ExportResponse{1, "full"}, ExportResponse{4, "not <this>"}}) {
        EXPECT_EQ(readExportResponse(exportResponse(call, response), 16), response);
    }
    EXPECT_EQ(readExportResponse(exportResponse(call, {7, ""}), 16),
              (ExportResponse{7, "CIM_ERR_NOT_SUPPORTED"}));
}

TEST(ExportMessage, OtherResponsesAreRefused) {
    const std::string good = exportResponse({"7", "ExportIndication", {}}, {1, "x"});
    EXPECT_THROW(static_cast<void>(readExportResponse("", 16)), XmlError);
    EXPECT_THROW(static_cast<void>(readExportResponse("<html/>", 16)), NotValid);
    for (const auto& [from, to] :
         {std::pair("CODE=\"1\"", "CODE=\"0\""), std::pair("CODE=\"1\"", "CODE=\"one\""),
          std::pair("\"ExportIndication\"", "\"Other\"")}) {
        EXPECT_THROW(static_cast<void>(readExportResponse(replaced(good, from, to), 16)), NotValid)
            << to;
    }
}

TEST(ExportMessage, AListenerTakesNothingElse) {
    EXPECT_EQ(exportRefusal(message()), "accepted");
    EXPECT_EQ(exportRefusal(""), "400 request-not-well-formed");
    EXPECT_EQ(exportRefusal("<CIM"), "400 request-not-well-formed");
    EXPECT_EQ(exportRefusal("<html/>"), "400 request-not-valid");
    EXPECT_EQ(exportRefusal(replaced(message(), "CIMVERSION=\"2.0\"", "CIMVERSION=\"3.0\"")),
              "501 unsupported-cim-version");
    EXPECT_EQ(exportRefusal(replaced(message(), "<SIMPLEEXPREQ>", "<SIMPLEEXPREQ>text")),
              "400 request-not-valid");
    EXPECT_EQ(exportRefusal("<CIM CIMVERSION='2.0' DTDVERSION='2.0'><MESSAGE ID='1' "
                            "PROTOCOLVERSION='1.0'><MULTIEXPREQ/></MESSAGE></CIM>"),
              "501 multiple-requests-unsupported");
    EXPECT_EQ(exportRefusal(replaced(message(), "\"ExportIndication\"", "\"Other\"")), "CIM 7");
    EXPECT_EQ(exportRefusal(replaced(message(), "\"NewIndication\"", "\"Other\"")), "CIM 4");
    EXPECT_EQ(exportRefusal("<CIM CIMVERSION='2.0' DTDVERSION='2.0'><MESSAGE ID='1' "
                            "PROTOCOLVERSION='1.0'><SIMPLEEXPREQ><EXPMETHODCALL "
                            "NAME='ExportIndication'/></SIMPLEEXPREQ></MESSAGE></CIM>"),
              "CIM 4");
}

}  // namespace
}  // namespace cimom::wbem
