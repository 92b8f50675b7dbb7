#include "zrclient/Instrumentation.h"

#include <gmock/gmock.h>

#include "kit/ZrclientSupport.h"

namespace ZR::Testing {
namespace {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;
using testing::ElementsAre;
using testing::IsEmpty;

constexpr const char* machineText = R"({ "nodes": [
  { "type": "ComputerSystem", "description": "Computer", "properties": { "Name": "${HOSTNAME}" },
    "children": [
      { "type": "Network", "description": "Network", "children": [
        { "type": "NetworkInterface", "description": "Ethernet interface",
          "properties": { "Name": "eth0", "NameMaxLength": 15, "DHCPEnabled": true,
                          "AddressSource": 4294967295, "InterfaceState": 4294967296,
                          "DHCPServerAddresses": ["192.0.2.1", "2001:db8::1"] },
          "readOnly": ["Name", "InterfaceState", "IPv4Address"],
          "children": [
            { "type": "NetworkInterface", "description": "VLAN", "properties": { "Name": "eth0.7" } }
          ] },
        { "type": "NetworkInterface", "description": "Broken interface",
          "properties": { "Name": "eth1", "NameMaxLength": -1, "DHCPEnabled": null,
                          "AddressSource": 1.5, "InterfaceState": {"is": 1},
                          "DHCPServerAddresses": ["192.0.2.1", 2] } } ] } ] },
  { "type": "ComputerSystem", "description": "BMC", "properties": { "Name": "BMC:-1" },
    "children": [ { "type": "NetworkInterface", "properties": { "Name": "bmc0" } } ] }
] })";

class InstrumentationTest : public SnapshotTreeTest {
  protected:
    void SetUp() override {
        SnapshotTreeTest::SetUp();
        show(machineText);
    }

    static std::string name(const Instrumentation& cursor) {
        std::string text = "-";
        cursor.getProperty(Properties::Name, text);
        return text;
    }

    static std::vector<std::string> walk(NodeType type) {
        std::vector<std::string> names;
        Instrumentation cursor;
        for (cursor.selectNode(type); cursor; ++cursor) {
            names.push_back(name(cursor));
        }
        return names;
    }

    static Instrumentation on(const std::string& path) {
        Instrumentation cursor;
        EXPECT_TRUE(cursor.selectNode(NodeType::ComputerSystem));
        EXPECT_TRUE(cursor.selectNode(path)) << path;
        return cursor;
    }
};

TEST_F(InstrumentationTest, WalksATypeInDocumentOrderDepthFirst) {
    EXPECT_THAT(walk(NodeType::NetworkInterface), ElementsAre("eth0", "eth0.7", "eth1", "bmc0"));
    EXPECT_THAT(walk(NodeType::ComputerSystem), ElementsAre("testhost", "BMC:-1"));
    EXPECT_THAT(walk(static_cast<NodeType>(30)), IsEmpty());
}

TEST_F(InstrumentationTest, ReadsEachKindOfProperty) {
    const Instrumentation cursor = on("/testhost/Network/eth0");
    std::string text;
    EXPECT_TRUE(cursor.getProperty(Properties::Name, text));
    EXPECT_EQ(text, "eth0");
    unsigned int number = 0;
    EXPECT_TRUE(cursor.getProperty(Properties::NameMaxLength, number));
    EXPECT_EQ(number, 15U);
    bool flag = false;
    EXPECT_TRUE(cursor.getProperty(Properties::DHCPEnabled, flag));
    EXPECT_TRUE(flag);
    std::vector<std::string> list{"replaced"};
    EXPECT_TRUE(cursor.getProperty(Properties::DHCPServerAddresses, list));
    EXPECT_THAT(list, ElementsAre("192.0.2.1", "2001:db8::1"));
}

TEST_F(InstrumentationTest, ReadsANumberUpToTheLargestThatFits) {
    const Instrumentation cursor = on("/testhost/Network/eth0");
    unsigned int number = 0;
    EXPECT_TRUE(cursor.getProperty(Properties::AddressSource, number));
    EXPECT_EQ(number, 4'294'967'295U);
    number = 7;
    EXPECT_FALSE(cursor.getProperty(Properties::InterfaceState, number));
    EXPECT_EQ(number, 7U);
}

/// Every reader on every property that is not of its kind returns false and
/// leaves the output as it was.
void expectUnreadable(const Instrumentation& cursor, Properties id, bool asText, bool asNumber,
                      bool asFlag, bool asList) {
    SCOPED_TRACE(static_cast<int>(id));
    std::string text = "untouched";
    if (asText) {
        EXPECT_FALSE(cursor.getProperty(id, text));
        EXPECT_EQ(text, "untouched");
    }
    unsigned int number = 12345;
    if (asNumber) {
        EXPECT_FALSE(cursor.getProperty(id, number));
        EXPECT_EQ(number, 12345U);
    }
    for (const bool before : {false, true}) {
        bool flag = before;
        if (asFlag) {
            EXPECT_FALSE(cursor.getProperty(id, flag));
            EXPECT_EQ(flag, before);
        }
    }
    std::vector<std::string> list{"untouched"};
    if (asList) {
        EXPECT_FALSE(cursor.getProperty(id, list));
        EXPECT_THAT(list, ElementsAre("untouched"));
    }
}

TEST_F(InstrumentationTest, NeverReadsAPropertyOfAnotherKind) {
    const Instrumentation cursor = on("/testhost/Network/eth0");
    expectUnreadable(cursor, Properties::Name, false, true, true, true);
    expectUnreadable(cursor, Properties::NameMaxLength, true, false, true, true);
    expectUnreadable(cursor, Properties::DHCPEnabled, true, true, false, true);
    expectUnreadable(cursor, Properties::DHCPServerAddresses, true, true, true, false);
}

TEST_F(InstrumentationTest, NeverReadsAnAbsentProperty) {
    const Instrumentation cursor = on("/testhost/Network/eth0");
    expectUnreadable(cursor, Properties::IPv4Address, true, true, true, true);
    expectUnreadable(cursor, static_cast<Properties>(9999), true, true, true, true);
}

TEST_F(InstrumentationTest, NeverReadsAValueThatIsNoneOfTheKinds) {
    const Instrumentation cursor = on("/testhost/Network/eth1");
    for (const Properties id :
         {Properties::NameMaxLength, Properties::DHCPEnabled, Properties::AddressSource,
          Properties::InterfaceState, Properties::DHCPServerAddresses}) {
        expectUnreadable(cursor, id, true, true, true, true);
        bool readOnly = true;
        EXPECT_TRUE(cursor.isPropertyReadOnly(id, readOnly)) << "it is present all the same";
        EXPECT_FALSE(readOnly);
    }
}

TEST_F(InstrumentationTest, TellsWhichPropertiesAreReadOnly) {
    const Instrumentation cursor = on("/testhost/Network/eth0");
    bool readOnly = false;
    EXPECT_TRUE(cursor.isPropertyReadOnly(Properties::Name, readOnly));
    EXPECT_TRUE(readOnly);
    EXPECT_TRUE(cursor.isPropertyReadOnly(Properties::DHCPEnabled, readOnly));
    EXPECT_FALSE(readOnly);
    // Marked, but not there.
    for (const bool before : {false, true}) {
        readOnly = before;
        EXPECT_FALSE(cursor.isPropertyReadOnly(Properties::IPv4Address, readOnly));
        EXPECT_EQ(readOnly, before);
    }
}

TEST_F(InstrumentationTest, EverythingIsLegalOnNothing) {
    Instrumentation cursor;
    const auto expectNothing = [&] {
        EXPECT_FALSE(cursor);
        for (const auto& entry : NodeLexicon::properties) {
            expectUnreadable(cursor, entry.number, true, true, true, true);
        }
        bool readOnly = true;
        EXPECT_FALSE(cursor.isPropertyReadOnly(Properties::Name, readOnly));
        EXPECT_TRUE(readOnly);
        std::string description = "untouched";
        EXPECT_FALSE(cursor.getNodeDescription(description));
        EXPECT_EQ(description, "untouched");
        EXPECT_EQ(cursor.getPathToParentNode(), "");
        EXPECT_FALSE(++cursor);
    };
    expectNothing();
    EXPECT_FALSE(cursor.selectNode(static_cast<NodeType>(1)));
    expectNothing();
    EXPECT_FALSE(cursor.selectNode(std::string()));
    expectNothing();
    EXPECT_TRUE(cursor.selectNode(NodeType::ComputerSystem));
    EXPECT_FALSE(cursor.selectNode(std::string("/no/such/node")));
    expectNothing();
    EXPECT_TRUE(cursor.selectNode(NodeType::ComputerSystem));
    EXPECT_FALSE(++ ++cursor);
    expectNothing();
}

TEST_F(InstrumentationTest, ClimbsToParentAndGrandparent) {
    Instrumentation cursor;
    ASSERT_TRUE(cursor.selectNode(NodeType::NetworkInterface));
    EXPECT_EQ(cursor.getPathToParentNode(), "/testhost/Network");
    Instrumentation above;
    ASSERT_TRUE(above.selectNode(cursor.getPathToParentNode()));
    std::string description;
    ASSERT_TRUE(above.getNodeDescription(description));
    EXPECT_EQ(description, "Network");
    ASSERT_TRUE(above.selectNode(above.getPathToParentNode()));
    ASSERT_TRUE(above.getNodeDescription(description));
    EXPECT_EQ(description, "Computer");
    EXPECT_EQ(name(above), "testhost");
    EXPECT_EQ(above.getPathToParentNode(), "") << "a root has no parent";
    EXPECT_FALSE(above.selectNode(above.getPathToParentNode()));
    EXPECT_EQ(name(cursor), "eth0");
}

TEST_F(InstrumentationTest, ParentIsSelectedAsByItsPath) {
    for (const char* path : {"/testhost/Network/eth0", "/testhost/Network", "/BMC:-1/bmc0"}) {
        const Instrumentation cursor = on(path);
        Instrumentation above;
        Instrumentation byPath;
        EXPECT_EQ(above.selectParentOf(cursor), byPath.selectNode(cursor.getPathToParentNode()));
        std::string description = "none";
        std::string descriptionByPath = "none";
        above.getNodeDescription(description);
        byPath.getNodeDescription(descriptionByPath);
        EXPECT_EQ(description, descriptionByPath) << path;
        EXPECT_EQ(above.getPathToParentNode(), byPath.getPathToParentNode()) << path;
        EXPECT_FALSE(++above) << "as after any path";
    }
}

TEST_F(InstrumentationTest, RootAndNothingHaveNoParentToSelect) {
    Instrumentation cursor = on("/testhost");
    EXPECT_FALSE(cursor.selectParentOf(cursor));
    EXPECT_FALSE(cursor.selectParentOf(cursor)) << "it stands on nothing now";
    EXPECT_FALSE(cursor.selectParentOf(Instrumentation()));
}

TEST_F(InstrumentationTest, ParentIsSelectedInTheLatestSnapshot) {
    Instrumentation cursor;
    ASSERT_TRUE(cursor.selectNode(NodeType::NetworkInterface));
    show(R"({"nodes": [{"type": "ComputerSystem", "description": "x", "properties":
        {"Name": "testhost"}, "children": [{"type": "Network", "description": "Network",
        "children": []}, {"type": "Network", "description": "other"}]}]})");
    EXPECT_EQ(walk(NodeType::ComputerSystem), (std::vector<std::string>{"testhost"}));
    Instrumentation above;
    ASSERT_TRUE(above.selectParentOf(cursor));
    EXPECT_EQ(above.getPathToParentNode(), "/testhost");
    ASSERT_TRUE(above.selectParentOf(above));
    std::string description;
    EXPECT_TRUE(above.getNodeDescription(description));
    EXPECT_EQ(description, "x") << "of the new snapshot";
    show(R"({"nodes": []})");
    EXPECT_THAT(walk(NodeType::ComputerSystem), IsEmpty());
    EXPECT_FALSE(above.selectParentOf(cursor)) << "there is no such node any more";
}

TEST_F(InstrumentationTest, SelectingAParentIsOneVisit) {
    const Instrumentation cursor = on("/testhost/Network/eth0");
    Instrumentation above;
    const std::uint64_t before = Instrumentation::nodeVisits();
    EXPECT_TRUE(above.selectParentOf(cursor));
    EXPECT_EQ(Instrumentation::nodeVisits(), before + 1);
}

TEST_F(InstrumentationTest, AnAbsentDescriptionIsEmpty) {
    std::string description = "full";
    EXPECT_TRUE(on("/BMC:-1/bmc0").getNodeDescription(description));
    EXPECT_EQ(description, "");
}

TEST_F(InstrumentationTest, FromASelectedPathThereIsNoNextNode) {
    Instrumentation cursor = on("/testhost/Network/eth0");
    EXPECT_FALSE(++cursor);
}

TEST_F(InstrumentationTest, ANewSelectionDecidesHowTheCursorWalks) {
    Instrumentation cursor = on("/testhost/Network/eth0");
    ASSERT_TRUE(cursor.selectNode(NodeType::NetworkInterface));
    EXPECT_TRUE(++cursor);
    EXPECT_EQ(name(cursor), "eth0.7");
}

TEST_F(InstrumentationTest, ACopyGoesItsOwnWay) {
    Instrumentation cursor;
    ASSERT_TRUE(cursor.selectNode(NodeType::NetworkInterface));
    Instrumentation copy = cursor;
    ++copy;
    EXPECT_EQ(name(cursor), "eth0");
    EXPECT_EQ(name(copy), "eth0.7");
    cursor = copy;
    EXPECT_EQ(name(cursor), "eth0.7");
}

TEST_F(InstrumentationTest, ACursorMovedFromStillStands) {
    Instrumentation cursor;
    ASSERT_TRUE(cursor.selectNode(NodeType::NetworkInterface));
    const Instrumentation taken = std::move(cursor);
    EXPECT_EQ(name(taken), "eth0");
    EXPECT_EQ(name(cursor), "eth0");  // NOLINT(bugprone-use-after-move): that is the point
    EXPECT_TRUE(++cursor);
}

TEST_F(InstrumentationTest, ACursorOnAReplacedSnapshotKeepsWorking) {
    Instrumentation old;
    ASSERT_TRUE(old.selectNode(NodeType::NetworkInterface));
    show(R"({"nodes": []})");
    EXPECT_THAT(walk(NodeType::NetworkInterface), IsEmpty());
    EXPECT_EQ(name(old), "eth0");
    EXPECT_EQ(old.getPathToParentNode(), "/testhost/Network");
    EXPECT_EQ(name(++old), "eth0.7");
    EXPECT_EQ(name(++old), "eth1");
    EXPECT_EQ(name(++old), "bmc0");
    EXPECT_FALSE(++old);
}

TEST_F(InstrumentationTest, ThePathOfAVanishedNodeSelectsNothing) {
    Instrumentation cursor;
    ASSERT_TRUE(cursor.selectNode(NodeType::NetworkInterface));
    const std::string path = cursor.getPathToParentNode();
    show(R"({"nodes": [{"type": "ComputerSystem", "description": "other"}]})");
    EXPECT_THAT(walk(NodeType::ComputerSystem), ElementsAre("-"));
    EXPECT_FALSE(cursor.selectNode(path));
    EXPECT_FALSE(cursor);
}

TEST_F(InstrumentationTest, SelectingAPathDoesNotLookAtTheMachine) {
    Instrumentation cursor;
    ASSERT_TRUE(cursor.selectNode(NodeType::NetworkInterface));
    const int polls = state_->polls;
    show(R"({"nodes": []})");
    EXPECT_TRUE(cursor.selectNode(std::string("/testhost")));
    EXPECT_EQ(state_->polls, polls);
    EXPECT_FALSE(cursor.selectNode(NodeType::NetworkInterface));
    EXPECT_EQ(state_->polls, polls + 1);
}

TEST_F(InstrumentationTest, CountsEachPlacementOfACursorOnce) {
    ASSERT_EQ(walk(NodeType::NetworkInterface).size(), 4U);
    const std::uint64_t before = Instrumentation::nodeVisits();
    walk(NodeType::NetworkInterface);
    EXPECT_EQ(Instrumentation::nodeVisits(), before + 4);
    Instrumentation cursor;
    cursor.selectNode(std::string("/testhost"));
    EXPECT_EQ(Instrumentation::nodeVisits(), before + 5);
    ++cursor;
    ++cursor;
    cursor.selectNode(std::string("/none"));
    cursor.selectNode(static_cast<NodeType>(1));
    EXPECT_EQ(Instrumentation::nodeVisits(), before + 5) << "nothing is not a node";
    cursor.selectNode(NodeType::ComputerSystem);
    const Instrumentation copy = cursor;
    EXPECT_TRUE(copy);
    EXPECT_EQ(Instrumentation::nodeVisits(), before + 6) << "a copy is not placed";
}

TEST_F(InstrumentationTest, AWalkVisitsTheNodesOfItsTypeAlone) {
    for (const unsigned count : {10U, 100U, 1000U}) {
        std::string text = R"({"nodes": [{"type": "ComputerSystem", "children": [)";
        for (unsigned number = 0; number < count; ++number) {
            text += R"({"type": "Fan"},{"type": "NetworkInterface"},)";
        }
        text += R"({"type": "Fan"}]}]})";
        show(text);
        const std::uint64_t before = Instrumentation::nodeVisits();
        EXPECT_EQ(walk(NodeType::NetworkInterface).size(), count);
        EXPECT_EQ(Instrumentation::nodeVisits() - before, count);
    }
}

}  // namespace
}  // namespace ZR::Testing
