#include <gtest/gtest.h>
#include <sys/stat.h>
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

TEST_F(AssociationCommands, AnInstanceThatIsNotThereIsAnError) {
    const std::string gone = "QVXZR_DHCPCapabilities.InstanceID=\"eth7\"";
    for (const char* command : {"associators", "references"}) {
        EXPECT_EQ(run({command, "--names", gone}),
                  (Ended{1, "",
                         "cimdhcp: CIM_ERR_NOT_FOUND: there is no " + gone +
                             "; \"cimdhcp names QVXZR_DHCPCapabilities\" lists what there is\n"}));
    }
}

TEST_F(AssociationCommands, WhatNoAssociationHasIsAnError) {
    const auto refusal = [this](const std::vector<std::string>& filter) {
        std::vector<std::string> arguments{"associators", capabilities};
        arguments.insert(arguments.end(), filter.begin(), filter.end());
        const Ended ended = run(arguments);
        EXPECT_EQ(ended.status, 1);
        EXPECT_EQ(ended.out, "");
        return ended.err;
    };
    const std::string invalid = "cimdhcp: CIM_ERR_INVALID_PARAMETER: ";
    EXPECT_EQ(refusal({"--role", "Capabilties"}),
              invalid +
                  "no association has a reference \"Capabilties\"; did you mean "
                  "Capabilities?\n");
    EXPECT_EQ(
        refusal({"--result-role", "Nothing", "--assoc-class", "QVXZR_DHCPElementCapabilities"}),
        invalid + "QVXZR_DHCPElementCapabilities has no reference \"Nothing\"\n");
    EXPECT_EQ(refusal({"--result-class", "QVXZR_DHCPCapabilites"}),
              invalid +
                  "there is no class \"QVXZR_DHCPCapabilites\"; did you mean "
                  "QVXZR_DHCPCapabilities?\n");
    // Of another class than the result, and of what does not lead there: nothing.
    EXPECT_EQ(run({"references", "--names", capabilities, "--role", "dependent"}), nothing_);
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

class GraphCommand : public test::ProgramTest {
  protected:
    GraphCommand() {
        setTree(R"({"type": "ComputerSystem", "description": "Computer",
            "properties": {"Name": "${HOSTNAME}"}, "children": [
              {"type": "Network", "description": "Network", "children": [
                {"type": "NetworkInterface", "description": "Ethernet interface", "properties": {
                  "Name": "eth0", "DHCPEnabled": true, "AddressSource": 1, "InterfaceState": 1,
                  "DHCPServerAddresses": ["192.0.2.1"], "IPv4Address": "192.0.2.17"}}]}]})");
    }
};

TEST_F(GraphCommand, ShowsEveryInstanceAndAssociation) {
    EXPECT_EQ(
        run({"graph"}),
        (Ended{
            0,
            "digraph machine {\n"
            "  rankdir=LR;\n"
            "  ranksep=1.2;\n"
            "  nodesep=0.15;\n"
            "  node [shape=box, style=\"rounded,filled\", fontname=\"Helvetica\", fontsize=11];\n"
            "  edge [color=\"#607d8b\", fontname=\"Helvetica\", fontsize=8, "
            "fontcolor=\"#455a64\"];\n"
            "  n0 [label=\"" +
                hostName() +
                "\\nComputerSystem\", fillcolor=\"#cfd8dc\"];\n"
                "  n1 [label=\"eth0\\nIPProtocolEndpoint\", fillcolor=\"#c5e1a5\"];\n"
                "  n2 [label=\"Computer%eth0%dhcp\\nIPAssignmentSettingData\", "
                "fillcolor=\"#90caf9\"];\n"
                "  n3 [label=\"eth0\\nDHCPProtocolEndpoint\", fillcolor=\"#a5d6a7\"];\n"
                "  n4 [label=\"eth0\\nDHCPCapabilities\", fillcolor=\"#b39ddb\"];\n"
                "  n5 [label=\"eth0_IPv4\\nDHCPRemoteServiceAccessPoint\", "
                "fillcolor=\"#ffcc80\"];\n"
                "  n6 [label=\"Computer%eth0\\nDHCPSettingData\", fillcolor=\"#90caf9\"];\n"
                "  n3 -> n4 [label=\"DHCPElementCapabilities\"];\n"
                "  n1 -> n3 [label=\"SAPSAPDependency\"];\n"
                "  n0 -> n3 [label=\"HostedDHCPPoint\"];\n"
                "  n5 -> n3 [label=\"DHCPRemoteAccessAvailableToElement\"];\n"
                "  n0 -> n5 [label=\"DHCPRemoteHostedAccessPoint\"];\n"
                "  n3 -> n6 [label=\"DHCPElementSettingData\"];\n"
                "  n2 -> n6 [label=\"DHCPOrderedComponent\"];\n"
                "}\n",
            ""}));
}

TEST_F(GraphCommand, IsDrawnByGraphviz) {
    const Ended ended = run({"graph", "--svg"});
    EXPECT_EQ(ended.status, 0) << ended.err;
    EXPECT_TRUE(ended.out.starts_with("<?xml")) << ended.out;
    EXPECT_TRUE(ended.out.ends_with("</svg>\n")) << ended.out;
    EXPECT_NE(ended.out.find(">HostedDHCPPoint</text>"), std::string::npos);
}

TEST_F(GraphCommand, NamesThePackageWhenGraphvizIsMissing) {
    EXPECT_EQ(run({"graph", "--svg"}, {{"PATH", directory() / "none"}}),
              (Ended{3, "",
                     "cimdhcp: drawing needs the program \"dot\": install the package graphviz, "
                     "or draw the output of \"cimdhcp graph\" elsewhere\n"}));
}

TEST_F(GraphCommand, TellsThatDrawingFailed) {
    const std::string dot = directory() / "dot";
    ZR::Testing::writeFile(dot, "#!/bin/sh\nexit 1\n");
    ASSERT_EQ(::chmod(dot.c_str(), 0755), 0);
    EXPECT_EQ(run({"graph", "--svg"}, {{"PATH", directory().path()}}),
              (Ended{3, "", "cimdhcp: the program \"dot\" failed to draw the graph\n"}));
}

TEST_F(GraphCommand, HasNoOtherForms) {
    EXPECT_EQ(run({"--format", "json", "graph"}),
              (Ended{2, "",
                     "cimdhcp: a graph has no JSON output; it is in Graphviz' language, or with "
                     "--svg drawn\n"}));
    EXPECT_EQ(run({"--format", "mof", "graph"}).status, 2);
}

}  // namespace
