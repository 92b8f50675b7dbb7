#include "commands/Graph.h"

#include <gtest/gtest.h>

#include <memory>

#include "cimom/Instance.h"

namespace {

using cimdhcp::connect;
using cimdhcp::Graph;
using cimdhcp::GraphEdge;
using cimdhcp::graphvizText;
using cimom::ObjectPath;
using cimom::Value;

ObjectPath capabilities(const std::string& id) {
    return {"", "root/cimv2", "QVXZR_DHCPCapabilities", {{"InstanceID", Value::ofString(id)}}};
}

ObjectPath endpoint(const std::string& name) {
    return {"",
            "root/cimv2",
            "QVXZR_DHCPProtocolEndpoint",
            {{"SystemName", Value::ofString("host")}, {"Name", Value::ofString(name)}}};
}

Value referenceTo(const ObjectPath& path) {
    Value value = Value::null(cimom::Type::reference, false);
    value.content = cimom::Scalar(std::make_shared<const ObjectPath>(path));
    return value;
}

ObjectPath association(const ObjectPath& element, const ObjectPath& capability) {
    return {"",
            "root/cimv2",
            "QVXZR_DHCPElementCapabilities",
            {{"Capabilities", referenceTo(capability)}, {"ManagedElement", referenceTo(element)}}};
}

TEST(Graph, ArrowGoesFromTheElementToItsCapabilities) {
    const Graph expected{{{capabilities("eth0"), true}, {endpoint("eth0"), true}},
                         {{"QVXZR_DHCPElementCapabilities", 1, 0}}};
    EXPECT_EQ(connect({capabilities("eth0"), endpoint("eth0")},
                      {association(endpoint("eth0"), capabilities("eth0"))}),
              expected);
}

TEST(Graph, ReferenceWithFewerKeysMeansTheSameInstance) {
    ObjectPath fewer = endpoint("eth1");
    fewer.keys.erase(fewer.keys.begin());
    const Graph graph = connect({endpoint("eth0"), endpoint("eth1"), capabilities("eth1")},
                                {association(fewer, capabilities("eth1"))});
    EXPECT_EQ(graph.nodes.size(), 3U);
    EXPECT_EQ(graph.edges, (std::vector<GraphEdge>{{"QVXZR_DHCPElementCapabilities", 1, 2}}));
}

TEST(Graph, ReferenceThatNamesNoInstanceMeansTheFirst) {
    ObjectPath any = endpoint("");
    any.keys.pop_back();
    const Graph graph = connect({capabilities("eth1"), endpoint("eth0"), endpoint("eth1")},
                                {association(any, capabilities("eth1"))});
    EXPECT_EQ(graph.nodes.size(), 3U);
    EXPECT_EQ(graph.edges, (std::vector<GraphEdge>{{"QVXZR_DHCPElementCapabilities", 1, 0}}));
}

TEST(Graph, ManyInstancesFindTheirOwn) {
    std::vector<ObjectPath> elements;
    std::vector<ObjectPath> associations;
    std::vector<GraphEdge> edges;
    constexpr std::size_t count = 2'000;
    for (std::size_t i = 0; i < count; ++i) {
        const std::string name = "eth" + std::to_string(i);
        elements.push_back(endpoint(name));
        associations.push_back(association(endpoint(name), capabilities(name)));
        edges.push_back({"QVXZR_DHCPElementCapabilities", i, 2 * count - 1 - i});
    }
    for (std::size_t i = count; i-- > 0;) {
        elements.push_back(capabilities("eth" + std::to_string(i)));
    }
    EXPECT_EQ(connect(elements, associations).edges, edges);
}

TEST(Graph, ReferenceToNothingServedGetsANodeOnce) {
    const Graph expected{
        {{endpoint("eth0"), true}, {endpoint("eth1"), true}, {capabilities("gone"), false}},
        {{"QVXZR_DHCPElementCapabilities", 0, 2}, {"QVXZR_DHCPElementCapabilities", 1, 2}}};
    EXPECT_EQ(connect({endpoint("eth0"), endpoint("eth1")},
                      {association(endpoint("eth0"), capabilities("gone")),
                       association(endpoint("eth1"), capabilities("gone"))}),
              expected);
}

TEST(Graph, AssociationWithoutTwoReferencesIsLeftOut) {
    ObjectPath half = association(endpoint("eth0"), capabilities("eth0"));
    half.keys.pop_back();
    EXPECT_EQ(connect({endpoint("eth0")}, {half}), (Graph{{{endpoint("eth0"), true}}, {}}));
}

TEST(Graph, TextNamesNodesAndAssociations) {
    EXPECT_EQ(
        graphvizText(
            connect({endpoint("eth0")}, {association(endpoint("eth0"), capabilities("gone"))})),
        "digraph machine {\n"
        "  rankdir=LR;\n"
        "  ranksep=1.2;\n"
        "  nodesep=0.15;\n"
        "  node [shape=box, style=\"rounded,filled\", fontname=\"Helvetica\", fontsize=11];\n"
        "  edge [color=\"#607d8b\", fontname=\"Helvetica\", fontsize=8, fontcolor=\"#455a64\"];\n"
        "  n0 [label=\"eth0\\nDHCPProtocolEndpoint\", fillcolor=\"#a5d6a7\"];\n"
        "  n1 [label=\"gone\\nDHCPCapabilities\", fillcolor=\"#b39ddb\", "
        "style=\"rounded,filled,dashed\"];\n"
        "  n0 -> n1 [label=\"DHCPElementCapabilities\"];\n"
        "}\n");
}

TEST(Graph, NamesCannotLeaveTheirQuotes) {
    EXPECT_NE(graphvizText(connect({endpoint("a\"b\\c\n")}, {}))
                  .find(R"([label="a\"b\\c\\x0A\nDHCPProtocolEndpoint")"),
              std::string::npos);
}

}  // namespace
