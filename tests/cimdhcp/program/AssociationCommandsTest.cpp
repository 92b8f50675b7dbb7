#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "ProgramRun.h"

namespace {

using test::Ended;

const std::string capabilities = "QVXZR_DHCPCapabilities.InstanceID=\"eth0\"";

class AssociationCommands : public test::ProgramTest {
  protected:
    static std::string escaped(const std::string& text) {
        std::string result;
        for (const char letter : text) {
            result += letter == '"' ? "\\\"" : std::string(1, letter);
        }
        return result;
    }

    static std::string associationPath() {
        return "root/cimv2:QVXZR_DHCPElementCapabilities.ManagedElement=\"" +
               escaped(endpointPath("eth0")) +
               "\",Capabilities=\"root/cimv2:" + escaped(capabilities) + '"';
    }

    const Ended endpoint_{0, endpointPath("eth0") + '\n', ""};
    const Ended association_{0, associationPath() + '\n', ""};
    const Ended nothing_{0, "", ""};
};

TEST_F(AssociationCommands, AssociatorsFindsTheOtherEnd) {
    EXPECT_EQ(run({"associators", "--names", capabilities}), endpoint_);
    const Ended ended = run({"associators", capabilities});
    EXPECT_EQ(ended, run({"instances", "QVXZR_DHCPProtocolEndpoint"}));
}

TEST_F(AssociationCommands, AssociatorsAsJson) {
    const Ended ended = run({"--format", "json", "associators", "--names", capabilities});
    EXPECT_EQ(ended.status, 0);
    EXPECT_EQ(ended.err, "");
    const auto json = nlohmann::json::parse(ended.out);
    EXPECT_EQ(json["operation"], "AssociatorNames");
    EXPECT_EQ(json["paths"], nlohmann::json({endpointPath("eth0")}));
    EXPECT_EQ(nlohmann::json::parse(
                  run({"--format", "json", "associators", capabilities}).out)["operation"],
              "Associators");
}

TEST_F(AssociationCommands, AssociatorsFollowsItsFilters) {
    EXPECT_EQ(run({"associators", "--names", "--assoc-class", "QVXZR_DHCPElementCapabilities",
                   "--result-class", "QVXZR_DHCPProtocolEndpoint", "--role", "Capabilities",
                   "--result-role", "ManagedElement", capabilities}),
              endpoint_);
    const std::vector<std::pair<std::string, std::string>> excluding{
        {"--assoc-class", "QVXZR_DHCPElementSettingData"},
        {"--result-class", "QVXZR_DHCPSettingData"},
        {"--role", "ManagedElement"},
        {"--result-role", "Capabilities"}};
    for (const auto& [option, value] : excluding) {
        EXPECT_EQ(run({"associators", "--names", option, value, capabilities}), nothing_) << option;
    }
}

TEST_F(AssociationCommands, ReferencesFindsTheAssociation) {
    EXPECT_EQ(run({"references", "--names", capabilities}), association_);
    EXPECT_EQ(run({"references", capabilities}),
              (Ended{0,
                     associationPath() + "\n  ManagedElement = " + endpointPath("eth0") +
                         "\n  Capabilities   = root/cimv2:" + capabilities + '\n',
                     ""}));
}

TEST_F(AssociationCommands, ReferencesAsMof) {
    EXPECT_EQ(run({"--format", "mof", "references", capabilities}),
              (Ended{0,
                     "instance of QVXZR_DHCPElementCapabilities {\n"
                     "    ManagedElement = \"" +
                         escaped(endpointPath("eth0")) +
                         "\";\n"
                         "    Capabilities   = \"root/cimv2:" +
                         escaped(capabilities) + "\";\n};\n",
                     ""}));
}

TEST_F(AssociationCommands, ReferencesFollowsItsFilters) {
    EXPECT_EQ(run({"references", "--names", "--result-class", "CIM_ElementCapabilities", "--role",
                   "Capabilities", capabilities}),
              association_);
    EXPECT_EQ(run({"references", "--names", "--result-class", "QVXZR_DHCPElementSettingData",
                   capabilities}),
              nothing_);
    EXPECT_EQ(run({"references", "--names", "--role", "ManagedElement", capabilities}), nothing_);
}

TEST_F(AssociationCommands, AnInstanceThatIsNotThereHasNone) {
    EXPECT_EQ(run({"associators", "--names", "QVXZR_DHCPProtocolEndpoint.Name=\"eth7\"",
                   "--assoc-class", "QVXZR_DHCPElementCapabilities"})
                  .out,
              "");
}

TEST_F(AssociationCommands, AnUnknownClassIsAnError) {
    const Ended ended = run({"associators", "TEST_Unknown.Id=\"x\""});
    EXPECT_EQ(ended.status, 1);
    EXPECT_EQ(ended.out, "");
    EXPECT_EQ(
        ended.err,
        "cimdhcp: CIM_ERR_INVALID_CLASS: no class \"TEST_Unknown\"; \"cimdhcp classes\" lists "
        "what is\n");
}

}  // namespace
