#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "kit/Diagnostics.h"
#include "sources/JsonTree.h"
#include "sources/TokenTracker.h"
#include "sources/TreeSlips.h"

namespace ZR::Testing {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

std::vector<std::string> slipsOf(const std::string& text, const std::string& hostName = "here") {
    const JsonTree tree = parseJsonTree(text, hostName, "tree");
    const auto* const snapshot = std::get_if<std::shared_ptr<const Snapshot>>(&tree);
    if (snapshot == nullptr) {
        return {"a fault"};
    }
    return textsOf((*snapshot)->diagnostics());
}

/// An interface in its network and computer, in line 4 from column 1.
std::string machine(const std::string& interfaces) {
    return R"({"nodes": [{"type": "ComputerSystem", "description": "Computer",
"properties": {"Name": "${HOSTNAME}"},
"children": [{"type": "Network", "description": "Network", "children": [
)" + interfaces +
           "]}]}]}";
}

std::string withProperties(const std::string& properties) {
    return machine(R"({"type": "NetworkInterface", "properties": {)" + properties + "}}");
}

std::string told(const std::string& properties) {
    const auto slips = slipsOf(withProperties(properties));
    return slips.empty() ? "nothing" : slips.front() + (slips.size() > 1 ? " ..." : "");
}

TEST(TreeSlips, AGoodTreeHasNone) {
    EXPECT_THAT(slipsOf(withProperties(R"("Name": "eth0", "NameMaxLength": 15, "DHCPEnabled": true,
        "AddressSource": 1, "InterfaceState": 1, "IPv4Address": "192.0.2.17", "Speed": "any",
        "DHCPServerAddresses": ["192.0.2.1", "2001:db8::1", "fe80::1%eth0"])")),
                IsEmpty());
    EXPECT_THAT(slipsOf(R"({"nodes": [{"type": "Fan", "children": [{"type": "Blade"}]}]})"),
                IsEmpty())
        << "a node of a type that nothing selects may stand anywhere else";
}

TEST(TreeSlips, AValueOfTheWrongKindIsToldWithItsPlace) {
    EXPECT_EQ(told(R"("DHCPEnabled": "yes")"), "tree:4:60: \"DHCPEnabled\" must be true or false");
    EXPECT_EQ(told(R"("DHCPEnabled": 1)"), "tree:4:60: \"DHCPEnabled\" must be true or false");
    for (const char* value :
         {"\"1\"", "-1", "1.5", "true", "[1]", "{}", "4294967296", "18446744073709551616"}) {
        EXPECT_EQ(told(R"("InterfaceState": )" + std::string(value)),
                  "tree:4:63: \"InterfaceState\" must be a number from 0 to 4294967295")
            << value;
    }
    EXPECT_EQ(told(R"("Name": 7)"), "tree:4:53: \"Name\" must be a text");
    EXPECT_EQ(told(R"("DHCPServerAddresses": "192.0.2.1")"),
              "tree:4:68: \"DHCPServerAddresses\" must be a list of texts");
    EXPECT_EQ(told(R"("DHCPServerAddresses": ["192.0.2.1", 7])"),
              "tree:4:82: the list must hold texts only");
    EXPECT_EQ(told(R"("DHCPServerAddresses": [null])"), "tree:4:69: the list must hold texts only");
    EXPECT_EQ(told(R"("DHCPServerAddresses": [["192.0.2.1"]])"),
              "tree:4:69: the list must hold texts only");
}

TEST(TreeSlips, ANullIsWhatAnUnreadableValueIsWrittenAs) {
    EXPECT_EQ(told(R"("DHCPEnabled": null, "DHCPServerAddresses": null)"), "nothing");
}

TEST(TreeSlips, AnAddressThatIsNoneIsTold) {
    EXPECT_EQ(told(R"("IPv4Address": "192.0.2.256")"),
              "tree:4:60: \"192.0.2.256\" is not an IPv4 address");
    EXPECT_EQ(told(R"("IPv4Address": "2001:db8::1")"),
              "tree:4:60: \"2001:db8::1\" is not an IPv4 address");
    EXPECT_EQ(told(R"("IPv4Address": "")"), "tree:4:60: \"\" is not an IPv4 address");
    EXPECT_EQ(told(R"("IPv4Address": "192.0.2.1\u0000")"),
              std::string("tree:4:60: \"192.0.2.1\0\" is not an IPv4 address", 46));
    EXPECT_EQ(told(R"("DHCPServerAddresses": ["192.0.2.1", "server"])"),
              "tree:4:82: \"server\" is not an IP address");
}

TEST(TreeSlips, APropertyWrittenInAnotherCaseIsTold) {
    EXPECT_EQ(told(R"("dhcpEnabled": true)"),
              "tree:4:45: the property \"dhcpEnabled\" is not known, \"DHCPEnabled\" is");
}

TEST(TreeSlips, ATypeThatIsAlmostKnownIsTold) {
    EXPECT_THAT(slipsOf(R"({"nodes": [{"type": "computersystem"},
                                           {"children": [], "type": "NetworkInterfaces"}]})"),
                ElementsAre("tree:1:21: the type \"computersystem\" is not known, "
                            "\"ComputerSystem\" is",
                            "tree:2:69: the type \"NetworkInterfaces\" is not known, "
                            "\"NetworkInterface\" is"));
}

TEST(TreeSlips, AnUnknownTypeInANetworkIsTold) {
    EXPECT_THAT(slipsOf(machine(R"({"type": "Interface"})")),
                ElementsAre("tree:4:10: the type \"Interface\" is not known: the nodes of a "
                            "network are of the type \"NetworkInterface\""));
}

TEST(TreeSlips, TwoInterfacesOfOneNameAreTold) {
    const std::string eth0 = R"({"type": "NetworkInterface", "properties": {"Name": "eth0"}})";
    EXPECT_THAT(slipsOf(machine(eth0 + ",\n" + eth0)),
                ElementsAre("tree:5:53: there is an interface \"eth0\" already: the instances of "
                            "both have the same keys"));
    // The service processor's interfaces have keys of their own.
    const std::string both = machine(eth0);
    EXPECT_THAT(
        slipsOf(
            both.substr(0, both.size() - 2) +
            R"(, {"type": "ComputerSystem", "description": "BMC", "properties": {"Name": "BMC:-1"},
                   "children": [{"type": "Network", "children": [)" +
            eth0 + "]}]}]}"),
        IsEmpty());
}

TEST(TreeSlips, AComputerThatIsNotThisMachineIsTold) {
    const std::string tree = R"({"nodes": [{"type": "ComputerSystem",
"properties": {"Name": "there"}}]})";
    EXPECT_THAT(slipsOf(tree),
                ElementsAre("tree:2:24: the computer is called \"there\" and this machine "
                            "\"here\", which the instances of its interfaces name as their "
                            "system: QVXZR_HostedDHCPPoint and QVXZR_DHCPRemoteHostedAccessPoint "
                            "have no instance for it; \"${HOSTNAME}\" stands for the name of any "
                            "machine"));
    EXPECT_THAT(slipsOf(tree, "there"), IsEmpty());
    EXPECT_THAT(slipsOf(R"({"nodes": [{"type": "ComputerSystem", "description": "BMC",
                            "properties": {"Name": "BMC:-1"}}]})"),
                IsEmpty());
}

TEST(TreeSlips, AMachineWithoutANameIsToldWhereItsNameIsWanted) {
    EXPECT_THAT(slipsOf(machine(""), ""),
                ElementsAre("tree:2:24: this machine tells no name to put in"));
}

TEST(TreeSlips, AreToldInTheOrderOfTheText) {
    EXPECT_THAT(slipsOf(machine(R"({"properties": {"Name": 1}, "type": "Interface"})")),
                ElementsAre(testing::StartsWith("tree:4:25:"), testing::StartsWith("tree:4:37:")));
}

TEST(TreeSlips, OfManyTheFirstFewAreTold) {
    std::string addresses = R"("DHCPServerAddresses": ["x")";
    for (int i = 1; i < 40; ++i) {
        addresses += ", \"x\"";
    }
    const auto slips = slipsOf(withProperties(addresses + "]"));
    ASSERT_THAT(slips, SizeIs(17));
    EXPECT_EQ(slips.back(), "tree: 24 more like these");
}

TEST(TreeSlips, AreNotLookedForWithoutANameToTellThemUnder) {
    const JsonTree tree = parseJsonTree(R"({"nodes": [{"type": "computersystem"}]})", "here");
    EXPECT_THAT(std::get<0>(tree)->diagnostics(), IsEmpty());
}

}  // namespace
}  // namespace ZR::Testing

namespace ZR {
namespace {

/// Goes on to an offset, as the parser does.
void advance(TokenTracker::Iterator& at, std::size_t count) {
    for (; count > 0; --count) {
        ++at;
    }
}

TEST(PlaceOf, CountsLinesAndBytesFromOne) {
    EXPECT_EQ(placeOf(0, ""), (TextPlace{1, 1}));
    EXPECT_EQ(placeOf(2, "ab\ncd"), (TextPlace{1, 3}));
    EXPECT_EQ(placeOf(3, "ab\ncd"), (TextPlace{2, 1}));
    EXPECT_EQ(placeOf(4, "ab\ncd"), (TextPlace{2, 2}));
    EXPECT_EQ(placeOf(99, "ab\ncd"), (TextPlace{2, 3}));
    EXPECT_EQ(placeOf(2, "\n\n"), (TextPlace{3, 1}));
    EXPECT_EQ(placeOf(2, "\xc3\xa4x"), (TextPlace{1, 3}));
}

TEST(TokenTracker, FindsTheStartOfEachToken) {
    TokenTracker tokens(" [\"a\" , 17,\n{");
    TokenTracker::Iterator at = tokens.begin();
    advance(at, 2);
    EXPECT_EQ(tokens.start(), 1U);
    tokens.pass(0);
    advance(at, 3);
    EXPECT_EQ(tokens.start(), 2U);
    tokens.pass(0);
    advance(at, 6);  // the number and the comma that ends it
    EXPECT_EQ(tokens.start(), 8U);
    tokens.pass(1);
    advance(at, 2);
    EXPECT_EQ(tokens.start(), 12U);
    EXPECT_TRUE(at == tokens.end());
}

TEST(TokenTracker, BeginsBehindAByteOrderMark) {
    const TokenTracker tokens("\xEF\xBB\xBF {");
    EXPECT_EQ(tokens.start(), 4U);
}

TEST(TokenTracker, BehindTheLastTokenIsTheEnd) {
    TokenTracker tokens("[  ");
    TokenTracker::Iterator at = tokens.begin();
    advance(at, 1);
    tokens.pass(0);
    EXPECT_EQ(tokens.start(), 3U);
}

}  // namespace
}  // namespace ZR
