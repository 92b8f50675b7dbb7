#include <gtest/gtest.h>
#include <sys/stat.h>

#include "ProgramRun.h"

namespace {

using test::Ended;

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
