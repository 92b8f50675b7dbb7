#include "sources/JsonTree.h"

#include <gmock/gmock.h>

#include <cstdint>
#include <random>

#include "kit/ZrclientSupport.h"

namespace ZR::Testing {
namespace {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;
using testing::ElementsAre;
using testing::HasSubstr;

std::string fault(const std::string& text) {
    const JsonTree tree = parseJsonTree(text, "testhost");
    const auto* found = std::get_if<JsonTreeFault>(&tree);
    return found == nullptr ? "none"
                            : std::to_string(found->line) + ":" + std::to_string(found->column) +
                                  ": " + found->reason;
}

std::string nested(unsigned levels) {
    std::string text = R"({"nodes": [)";
    for (unsigned level = 1; level < levels; ++level) {
        text += R"({"type": "T", "children": [)";
    }
    text += R"({"type": "NetworkInterface"})";
    for (unsigned level = 1; level < levels; ++level) {
        text += "]}";
    }
    return text + "]}";
}

std::string withProperty(const std::string& value) {
    return R"({"nodes": [{"type": "NetworkInterface", "properties": {"IPv4Address": )" + value +
           "}}]}";
}

TEST(JsonTree, ReadsNodesInDocumentOrderDepthFirst) {
    const auto snapshot = parsed(R"({"nodes": [
        {"type": "ComputerSystem", "description": "a", "children": [
            {"type": "Network", "description": "b", "children": [
                {"type": "NetworkInterface", "description": "c"}]},
            {"type": "Network", "description": "d"}]},
        {"type": "ComputerSystem", "description": "e"}]})");
    std::vector<std::string> paths;
    for (Snapshot::Index index = 0; index < snapshot->nodes().size(); ++index) {
        paths.push_back(snapshot->path(index));
    }
    EXPECT_THAT(paths, ElementsAre("/a", "/a/b", "/a/b/c", "/a/d", "/e"));
}

TEST(JsonTree, TheOrderOfKeysInANodeDoesNotMatter) {
    const auto snapshot = parsed(R"({"nodes": [
        {"children": [{"readOnly": ["Name"], "properties": {"Name": "x"}, "type": "Fan"}],
         "properties": {"Name": "host"}, "description": "Computer", "type": "ComputerSystem"}]})");
    ASSERT_EQ(snapshot->nodes().size(), 2U);
    EXPECT_EQ(snapshot->node(0).type, "ComputerSystem");
    EXPECT_EQ(snapshot->node(0).description, "Computer");
    EXPECT_EQ(snapshot->path(1), "/host/x");
    EXPECT_TRUE(snapshot->find(1, Properties::Name)->readOnly);
    EXPECT_FALSE(snapshot->find(0, Properties::Name)->readOnly);
}

struct ValueCase {
    const char* json;
    PropertyValue value;
};

TEST(JsonTree, TakesValuesByTheirKind) {
    using Texts = std::vector<std::string>;
    const std::vector<ValueCase> cases{
        {R"("192.0.2.17")", std::string("192.0.2.17")},
        {R"("")", std::string()},
        {R"("a\"\\\/\n\u00e4\ud83d\ude00\u0000b")",
         std::string("a\"\\/\n\xc3\xa4\xf0\x9f\x98\x80\0b", 13)},
        {"true", true},
        {"false", false},
        {"0", std::uint64_t{0}},
        {"18446744073709551615", UINT64_MAX},
        {"[]", Texts{}},
        {R"(["a", "", "${HOSTNAME}"])", Texts{"a", "", "testhost"}},
        {"18446744073709551616", {}},
        {"-1", {}},
        {"-0", {}},
        {"1.0", {}},
        {"1e3", {}},
        {"null", {}},
        {"{}", {}},
        {R"({"Name": "x", "deep": [{"nodes": []}]})", {}},
        {R"(["a", 1])", {}},
        {R"([1, "a"])", {}},
        {R"([null])", {}},
        {R"([true, false])", {}},
        {R"(["a", ["b", ["c"]], "d"])", {}},
        {R"(["a", {"b": ["c"]}])", {}},
    };
    for (const ValueCase& each : cases) {
        const auto snapshot = parsed(withProperty(each.json));
        const SnapshotProperty* property = snapshot->find(0, Properties::IPv4Address);
        ASSERT_NE(property, nullptr) << each.json;
        EXPECT_TRUE(property->value == each.value) << each.json;
        EXPECT_EQ(snapshot->properties(0).size(), 1U) << each.json;
    }
}

TEST(JsonTree, AListHoldsTextsOrNumbers) {
    const auto listOf = [](const char* json) {
        return parsed(withProperty(json))->find(0, Properties::IPv4Address)->value;
    };
    EXPECT_EQ(listOf("[54, 1]"), PropertyValue(NumberList{{54, 1}}));
    EXPECT_EQ(listOf("[]"), PropertyValue(std::vector<std::string>{}));
    EXPECT_EQ(listOf(R"([54, "1"])"), PropertyValue());
    EXPECT_EQ(listOf(R"(["1", 54])"), PropertyValue());
    EXPECT_EQ(listOf("[-1]"), PropertyValue());
    EXPECT_EQ(listOf("[1.5]"), PropertyValue());
}

TEST(JsonTree, TheLastOfEqualPropertyNamesCounts) {
    const auto snapshot = parsed(R"({"nodes": [{"type": "NetworkInterface", "properties":
        {"Name": "a", "DHCPEnabled": true, "Name": "b", "DHCPEnabled": null}}]})");
    EXPECT_EQ(snapshot->path(0), "/b");
    EXPECT_EQ(snapshot->properties(0).size(), 2U);
    EXPECT_TRUE(snapshot->find(0, Properties::DHCPEnabled)->value == PropertyValue());
}

TEST(JsonTree, PassesOverWhatItDoesNotKnow) {
    const auto snapshot = parsed(R"({"comment": {"nodes": [1]}, "nodes": [
        {"type": "Fan", "colour": ["red", {"type": 3}], "properties":
            {"Speed": {"Name": "no"}, "name": "case matters", "Name": "fan"},
         "readOnly": ["Speed", "Name", "Name"]}], "version": -1.5e300})");
    ASSERT_EQ(snapshot->nodes().size(), 1U);
    ASSERT_EQ(snapshot->properties(0).size(), 1U);
    EXPECT_EQ(snapshot->properties(0)[0],
              (SnapshotProperty{Properties::Name, true, std::string("fan")}));
}

TEST(JsonTree, PutsTheHostNameIntoEveryText) {
    const auto snapshot = parsed(R"({"nodes": [{"type": "${HOSTNAME}", "description":
        "<${HOSTNAME}|${HOSTNAME}>$ {HOSTNAME}${hostname}${HOSTNAME", "properties":
        {"Name": "\u0024{HOSTNAME}.example"}}]})");
    EXPECT_EQ(snapshot->node(0).type, "testhost");
    EXPECT_EQ(snapshot->node(0).description,
              "<testhost|testhost>$ {HOSTNAME}${hostname}${HOSTNAME");
    EXPECT_EQ(snapshot->path(0), "/testhost.example");
}

TEST(JsonTree, WhatBearsTheNameOfANamelessMachineIsUnreadable) {
    const auto tree = parseJsonTree(R"({"nodes": [{"type": "Fan${HOSTNAME}", "description":
        "at <${HOSTNAME}>", "readOnly": ["Name"], "properties": {"Name": "${HOSTNAME}.example",
        "IPv4Address": "192.0.2.1", "DHCPServerAddresses": ["192.0.2.2", "${HOSTNAME}"]}}]})",
                                    "");
    const Snapshot& snapshot = *std::get<0>(tree);
    EXPECT_EQ(snapshot.node(0).type, "Fan");
    EXPECT_EQ(snapshot.node(0).description, "at <>");
    EXPECT_EQ(*snapshot.find(0, Properties::Name),
              (SnapshotProperty{Properties::Name, true, PropertyValue()}));
    EXPECT_EQ(snapshot.find(0, Properties::IPv4Address)->value, PropertyValue("192.0.2.1"));
    EXPECT_EQ(snapshot.find(0, Properties::DHCPServerAddresses)->value, PropertyValue());
}

TEST(JsonTree, AHostNameIsNotExpandedAgain) {
    const JsonTree tree = parseJsonTree(R"({"nodes": [{"type": "${HOSTNAME}"}]})", "${HOSTNAME}");
    EXPECT_EQ(std::get<0>(tree)->node(0).type, "${HOSTNAME}");
}

TEST(JsonTree, AnEmptyArrayOfNodesIsAnEmptyTree) {
    EXPECT_TRUE(parsed(R"({"nodes": []})")->nodes().empty());
    EXPECT_TRUE(parsed("\xEF\xBB\xBF {\"nodes\":[]}\n")->nodes().empty());
}

struct FaultCase {
    const char* text;
    const char* fault;
};

TEST(JsonTree, TellsWhereTheStructureIsWrong) {
    const std::vector<FaultCase> cases{
        {"[]", "1:1: the file must hold an object"},
        {"\n  7", "2:3: the file must hold an object"},
        {"\n \"nodes\" ", "2:2: the file must hold an object"},
        {"\xEF\xBB\xBF null", "1:5: the file must hold an object"},
        {" {}", "1:2: \"nodes\" is missing"},
        {"{\"Nodes\": []}", "1:1: \"nodes\" is missing"},
        {"{\"nodes\" : {}}", "1:12: \"nodes\" must be an array"},
        {"{\"nodes\":\n\n  null}", "3:3: \"nodes\" must be an array"},
        {"{\"x\": 1, \"nodes\": 12 }", "1:19: \"nodes\" must be an array"},
        {"{\"nodes\": [],\n \"nodes\": []}", "2:2: \"nodes\" is given twice"},
        {"{\"nodes\": [[]]}", "1:12: a node must be an object"},
        {"{\"nodes\": [\n{\"type\": \"T\"},\n \"x\"]}", "3:2: a node must be an object"},
        {"{\"nodes\": [{\"type\": \"T\"}, 1]}", "1:27: a node must be an object"},
        {"{\"nodes\": [ {} ]}", "1:13: a node must have a \"type\""},
        {"{\"nodes\": [\n\t{\"description\": \"T\",\n\"children\": []}]}",
         "2:2: a node must have a \"type\""},
        {"{\"nodes\": [{\"type\": 40}]}", "1:21: \"type\" must be a text"},
        {"{\"nodes\": [{\"type\": [\"T\"]}]}", "1:21: \"type\" must be a text"},
        {"{\"nodes\": [{\"type\": null}]}", "1:21: \"type\" must be a text"},
        {"{\"nodes\": [{\"type\": \"T\", \"type\": \"T\"}]}", "1:26: \"type\" is given twice"},
        {"{\"nodes\": [{\"type\": \"T\", \"description\": 1}]}",
         "1:41: \"description\" must be a text"},
        {"{\"nodes\": [{\"type\": \"T\", \"children\": {}}]}",
         "1:38: \"children\" must be an array"},
        {"{\"nodes\": [{\"type\": \"T\", \"children\": [\n{\"type\": \"T\"},\n3]}]}",
         "3:1: a node must be an object"},
        {"{\"nodes\": [{\"type\": \"T\", \"children\": \"none\"}]}",
         "1:38: \"children\" must be an array"},
        {"{\"nodes\": [{\"type\": \"T\", \"properties\": []}]}",
         "1:40: \"properties\" must be an object"},
        {"{\"nodes\": [{\"type\": \"T\", \"properties\": 1.5}]}",
         "1:40: \"properties\" must be an object"},
        {"{\"nodes\": [{\"type\": \"T\", \"properties\": {}, \"properties\": {}}]}",
         "1:44: \"properties\" is given twice"},
        {"{\"nodes\": [{\"type\": \"T\", \"readOnly\": \"Name\"}]}",
         "1:38: \"readOnly\" must be an array of texts"},
        {"{\"nodes\": [{\"type\": \"T\", \"readOnly\": {\"Name\": true}}]}",
         "1:38: \"readOnly\" must be an array of texts"},
        {"{\"nodes\": [{\"type\": \"T\", \"readOnly\": [\"Name\", 108]}]}",
         "1:47: \"readOnly\" must hold texts only"},
        {"{\"nodes\": [{\"type\": \"T\", \"readOnly\": [[\"Name\"]]}]}",
         "1:39: \"readOnly\" must hold texts only"},
        {"{\"nodes\": [{\"type\": \"T\", \"properties\": {\"Name\": 1e999}}]}",
         "1:49: the number is too large"},
        {"{\"nodes\": [{\"type\": \"T\", \"properties\": {\"Name\": [7, 8.5 ,\n -9], \"X\": 5},"
         "\"children\": true}]}",
         "2:27: \"children\" must be an array"},
    };
    for (const FaultCase& each : cases) {
        EXPECT_EQ(fault(each.text), each.fault) << each.text;
    }
}

TEST(JsonTree, TellsWhereTheSyntaxIsWrong) {
    const std::vector<FaultCase> cases{
        {"", "1:1: "},
        {"\n\n ", "3:2: "},
        {"{\"nodes\": [", "1:12: "},
        {"{\"nodes\": [}", "1:12: "},
        {"{\"nodes\": []\n,}", "2:2: "},
        {"{\"nodes\": []}\n x", "2:2: "},
        {"{\"nodes\": []}{}", "1:14: "},
        {"{\"nodes\": [\n{'type': 1}]}", "2:2: "},
        {"{\"nodes\": [{\"type\": \"T\n\"}]}", "1:23: "},
        {"{\"nodes\": [{\"type\": tru}]}", "1:24: "},
        {"{\"nodes\": [{\"type\": \"\x80\"}]}", "1:22: "},
        {"{\"nodes\": [{\"type\": \"\\x\"}]}", "1:23: "},
        {"{\"nodes\": [{\"type\": \"T\" \"description\": 1}]}", "1:37: "},
        {"{\"nodes\": [], \"x\": 01}", "1:21: "},
        {"// none\n{\"nodes\": []}", "1:1: "},
    };
    for (const FaultCase& each : cases) {
        EXPECT_THAT(fault(each.text), testing::StartsWith(each.fault)) << each.text;
        EXPECT_THAT(fault(each.text), HasSubstr(": syntax error")) << each.text;
    }
}

TEST(JsonTree, QuotesOfALongTokenOnlyItsBeginning) {
    const std::string reason = fault(R"({"nodes": [{"type": ")" + std::string(100'000, 'x'));
    EXPECT_LT(reason.size(), 300U);
    EXPECT_THAT(reason, testing::EndsWith("..."));
}

TEST(JsonTree, NodesMayBeSixtyFourLevelsDeep) {
    EXPECT_EQ(parsed(nested(64))->nodes().size(), 64U);
    EXPECT_EQ(fault(nested(65)),
              "1:" + std::to_string(12 + 64 * 27) + ": nodes are nested deeper than 64 levels");
    EXPECT_THAT(fault(nested(100'000)), HasSubstr("nested deeper"));
}

TEST(JsonTree, ValuesThatNobodyReadsMayBeSixtyFourLevelsDeep) {
    const auto lists = [](std::size_t levels) {
        return std::string(levels, '[') + std::string(levels, ']');
    };
    EXPECT_EQ(fault(R"({"nodes": [], "x": )" + lists(64) + "}"), "none");
    EXPECT_EQ(fault(R"({"nodes": [], "x": )" + lists(65) + "}"),
              "1:84: values are nested deeper than 64 levels");
    EXPECT_THAT(fault(withProperty(lists(1'000'000))), HasSubstr("nested deeper"));
    EXPECT_THAT(fault(std::string(1'000'000, '[')), HasSubstr("1:1: the file must hold"));
}

TEST(JsonTree, AnyBytesGiveATreeOrAFault) {
    const std::string good = nested(5) + withProperty(R"(["a", 1, -1.5, {"b": null}])");
    std::mt19937 random(20'260);  // the same bytes in every run
    for (int round = 0; round < 3000; ++round) {
        std::string text = good.substr(random() % good.size());
        for (unsigned damage = random() % 8; damage > 0 && !text.empty(); --damage) {
            text[random() % text.size()] = static_cast<char>(random() % 256);
        }
        const JsonTree tree = parseJsonTree(text, "testhost");
        if (const auto* found = std::get_if<JsonTreeFault>(&tree)) {
            EXPECT_FALSE(found->reason.empty());
        } else {
            EXPECT_NE(std::get<0>(tree), nullptr);
        }
    }
}

TEST(JsonTree, NoBeginningOfATreeIsATree) {
    const std::string whole = withProperty(R"(["a", 1, -1.5, {"b": null}])");
    ASSERT_EQ(fault(whole), "none");
    for (std::size_t size = 0; size < whole.size(); ++size) {
        EXPECT_NE(fault(whole.substr(0, size)), "none") << size;
    }
}

}  // namespace
}  // namespace ZR::Testing
