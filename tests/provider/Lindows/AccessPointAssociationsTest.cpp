// The records of associations with access points and computers.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "Builders.h"
#include "Elements.h"
#include "Lindows/DHCPRemoteAccessAvailableToElement.h"
#include "Lindows/DHCPRemoteHostedAccessPoint.h"
#include "Lindows/HostedAccessPoint.h"
#include "Lindows/SAPSAPDependency.h"
#include "kit/LogCapture.h"
#include "kit/Tree.h"

namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Pair;
using ZR::DHCPClientProvider::DHCPHostedAccessPoint;
using ZR::DHCPClientProvider::DHCPRemoteAccessAvailableToElement;
using ZR::DHCPClientProvider::DHCPRemoteHostedAccessPoint;
using ZR::DHCPClientProvider::SAPSAPDependency;
using namespace std::string_literals;
using test::build;
using test::computer;
using test::dhcpInterface;
using test::fails;
using test::host;
using test::Keys;
using test::LogCapture;
using test::serviceProcessor;
using test::staticInterface;

class HostedAccessPointTest : public test::TreeTest {};

constexpr auto toEndpoints = &DHCPHostedAccessPoint::getDHCPProtocolEndPointMoniker;
constexpr auto toComputer = &DHCPHostedAccessPoint::getSystemMoniker;

TEST_F(HostedAccessPointTest, ComputerWithoutNameKeyHasNoEndpoints) {
    for (const Keys& keys : {Keys{}, Keys{{"name", "host1"}}, Keys{{"CreationClassName", "x"}}}) {
        EXPECT_THAT(build(toEndpoints, keys),
                    fails("FrameworkException", "Could not find 'Name' key in Moniker"));
    }
}

TEST_F(HostedAccessPointTest, ComputerNameBecomesSystemNameWhetherOrNotItExists) {
    EXPECT_THAT(build(toEndpoints, {{"Name", "host1"}}), ElementsAre(Pair("SystemName", "host1")));
}

TEST_F(HostedAccessPointTest, EndpointLeadsToTheComputerOfItsSystemName) {
    setTree({host({}), serviceProcessor({})});
    EXPECT_THAT(build(toComputer, {{"SystemName", "BMC:-1"}}), ElementsAre(Pair("Name", "BMC:-1")));
    EXPECT_THAT(build(toComputer, {{"Name", "eth0"}, {"SystemName", hostName()}}),
                ElementsAre(Pair("Name", hostName())));
}

TEST_F(HostedAccessPointTest, EndpointOfAnUnknownComputerIsAnInstrumentationError) {
    setTree({host({})});
    EXPECT_THAT(build(toComputer, {{"SystemName", "elsewhere"}}),
                fails("InstrumentationException", "Concerned Computer Could Not Be Found."));
    EXPECT_THAT(build(toComputer, {}),
                fails("FrameworkException", "Could not find 'System Name' Key in Moniker"));
}

TEST_F(HostedAccessPointTest, UnreadableNameOfTheFirstComputerEndsTheSearch) {
    setTree({{{"type", "ComputerSystem"}, {"description", "Computer"}},
             computer("Computer", "second", {})});
    EXPECT_THAT(build(toComputer, {{"SystemName", "second"}}),
                fails("InstrumentationException", "Name Property on computer not available."));
}

TEST_F(HostedAccessPointTest, FirstOfTwoEqualKeysCountsForTheHostedAccessPoint) {
    setTree({host({}), serviceProcessor({})});
    EXPECT_THAT(build(toEndpoints, {{"Name", "a"}, {"Name", "b"}}),
                ElementsAre(Pair("SystemName", "a")));
    EXPECT_THAT(build(toComputer, {{"SystemName", "BMC:-1"}, {"SystemName", hostName()}}),
                ElementsAre(Pair("Name", "BMC:-1")));
}

TEST_F(HostedAccessPointTest, BuildersTraceArgumentAndKeysAndNoExitWhenTheyThrow) {
    setTree({host({})});
    DHCPHostedAccessPoint record;
    const ZR::Testing::LogCapture log;
    build(record, toComputer, {{"SystemName", hostName()}});
    auto messages = log.logMessages();
    ASSERT_EQ(messages.size(), 3U);
    EXPECT_THAT(messages[0],
                ::testing::MatchesRegex(
                    "ENTERING: getSystemMoniker\\(\\) in Lindows/HostedAccessPoint "
                    "\\[Line: [0-9]+\\],Parameters List:  endPointMoniker=0x[0-9a-f]+"));
    EXPECT_THAT(messages[1],
                ::testing::StartsWith("VARIABLE: 'SystemName' has Value '" + hostName() + "'"));
    EXPECT_THAT(messages[2], ::testing::StartsWith("EXITING: getSystemMoniker()"));
    const std::size_t before = messages.size();
    build(record, toComputer, {{"SystemName", "elsewhere"}});
    messages = log.logMessages();
    ASSERT_EQ(messages.size(), before + 2);
    EXPECT_THAT(messages.back(), ::testing::StartsWith("VARIABLE"));
}

TEST_F(HostedAccessPointTest, BuildersBeginTheirWalksAnew) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")}), serviceProcessor({})});
    DHCPHostedAccessPoint record;
    for (int i = 0; i < 2; ++i) {
        EXPECT_THAT(build(record, toComputer, {{"SystemName", hostName()}}),
                    ElementsAre(Pair("Name", hostName())));
    }
}

class DHCPRemoteHostedAccessPointTest : public test::TreeTest {};

constexpr auto toAccessPoints = &DHCPRemoteHostedAccessPoint::getRemoteSAPMoniker;
constexpr auto toItsComputer = &DHCPRemoteHostedAccessPoint::getSystemMoniker;

TEST_F(DHCPRemoteHostedAccessPointTest, ComputerLeadsToItsAccessPointsOnlyIfItHasAny) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})})});
    EXPECT_THAT(build(toAccessPoints, {{"Name", hostName()}}),
                ElementsAre(Pair("SystemName", hostName())));
    EXPECT_THAT(build(toAccessPoints, {{"Name", "elsewhere"}}),
                fails("FrameworkException",
                      "Could not match 'System Name' key with 'Name' key in Computer Moniker"));
    EXPECT_THAT(build(toAccessPoints, {}),
                fails("FrameworkException", "Could not find 'Name' key in Moniker"));
    setTree({host({dhcpInterface("eth0")})});
    EXPECT_THAT(build(toAccessPoints, {{"Name", hostName()}}),
                fails("FrameworkException",
                      "Could not match 'System Name' key with 'Name' key in Computer Moniker"));
}

TEST_F(DHCPRemoteHostedAccessPointTest, AccessPointLeadsToTheComputerOfItsSystemName) {
    setTree({{{"type", "ComputerSystem"}, {"description", "x"}}, host({})});
    EXPECT_THAT(build(toItsComputer, {{"SystemName", hostName()}}),
                fails("InstrumentationException", "Name Property on computer not available."));
    setTree({host({})});
    EXPECT_THAT(build(toItsComputer, {{"SystemName", hostName()}}),
                ElementsAre(Pair("Name", hostName())));
    EXPECT_THAT(build(toItsComputer, {{"SystemName", "elsewhere"}}),
                fails("InstrumentationException", "Concerned Computer Could Not Be Found."));
    EXPECT_THAT(build(toItsComputer, {{"Name", "x"}}),
                fails("FrameworkException", "Could not find 'System Name' Key in Moniker"));
}

class DHCPRemoteAccessAvailableToElementTest : public test::TreeTest {};

constexpr auto toAccessPoint =
    &DHCPRemoteAccessAvailableToElement::getRemoteServiceAccessPointMoniker;
constexpr auto toEndpoint = &DHCPRemoteAccessAvailableToElement::getDHCPProtocolEndpointMoniker;

TEST_F(DHCPRemoteAccessAvailableToElementTest,
       EndpointLeadsToTheFirstAccessPointOfItsInterfaceAndItsOrder) {
    setTree({host({dhcpInterface("eth1", {"192.0.2.9"}),
                   dhcpInterface("eth0", {"2001:db8::1", "192.0.2.1", "192.0.2.2"})})});
    DHCPRemoteAccessAvailableToElement record;
    unsigned short order = 77;
    EXPECT_TRUE(record.getOrderOfAccess(order));
    EXPECT_EQ(order, 1);
    EXPECT_THAT(build(record, toAccessPoint, {{"Name", "eth0"}}),
                ElementsAre(Pair("Name", "eth0_IPv6")));
    EXPECT_TRUE(record.getOrderOfAccess(order));
    EXPECT_EQ(order, 3);
}

TEST_F(DHCPRemoteAccessAvailableToElementTest, OnlyTheLastUnderscoreSplitsAnAccessPointName) {
    setTree({host({dhcpInterface("my_nic", {"192.0.2.1"})})});
    EXPECT_THAT(build(toAccessPoint, {{"Name", "my_nic"}}),
                ElementsAre(Pair("Name", "my_nic_IPv4")));
    EXPECT_THAT(build(toEndpoint, {{"Name", "my_nic_2"}}),
                ElementsAre(Pair("Name", "my_nic"), Pair("SystemName", ""),
                            Pair("SystemCreationClassName", ""),
                            Pair("CreationClassName", "QVXZR_DHCPProtocolEndpoint")));
}

TEST_F(DHCPRemoteAccessAvailableToElementTest,
       AccessPointNameWithoutUnderscoreIsRefusedBeforeAnyNodeIsRead) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})})});
    DHCPRemoteAccessAvailableToElement record;
    const auto visits = ZR::Instrumentation::nodeVisits();
    EXPECT_THAT(build(record, toEndpoint, {{"Name", "eth0"}}),
                fails("FrameworkException", "Name Key is not correct."));
    EXPECT_EQ(ZR::Instrumentation::nodeVisits(), visits);
}

TEST_F(DHCPRemoteAccessAvailableToElementTest,
       MissingAccessPointNamesTheEndpointAndMissingEndpointTheIPEndpoint) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})})});
    EXPECT_THAT(
        build(toAccessPoint, {{"Name", "eth9"}}),
        fails("InstrumentationException", "Concerned DHCP Protocol Endpoint Could Not Be Found."));
    EXPECT_THAT(
        build(toEndpoint, {{"Name", "eth9_IPv4"}}),
        fails("InstrumentationException", "Concerned IP Protocol Endpoint Could Not Be Found."));
    for (const auto builder : {toAccessPoint, toEndpoint}) {
        EXPECT_THAT(build(builder, {{"SystemName", "x"}}),
                    fails("FrameworkException", "Could not find 'Name' Key in Moniker"));
    }
}

TEST_F(DHCPRemoteAccessAvailableToElementTest, AccessPointLeadsToItsEndpointWithTheLastOfItsKeys) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})})});
    EXPECT_THAT(build(toEndpoint, {{"Name", "eth9_IPv4"},
                                   {"SystemName", "first"},
                                   {"Name", "eth0_IPv4"},
                                   {"SystemName", "last"},
                                   {"SystemCreationClassName", "Class"}}),
                ElementsAre(Pair("Name", "eth0"), Pair("SystemName", "last"),
                            Pair("SystemCreationClassName", "Class"),
                            Pair("CreationClassName", "QVXZR_DHCPProtocolEndpoint")));
}

TEST_F(DHCPRemoteAccessAvailableToElementTest,
       OrderOfAccessBecomesZeroForAnInterfaceWithSeveralServersAndStays) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1", "192.0.2.2"}),
                   dhcpInterface("eth1", {"192.0.2.1"})})});
    DHCPRemoteAccessAvailableToElement record;
    unsigned short order = 77;
    build(record, toEndpoint, {{"Name", "eth1_IPv4"}});
    EXPECT_TRUE(record.getOrderOfAccess(order));
    EXPECT_EQ(order, 1);
    build(record, toEndpoint, {{"Name", "eth0_IPv4"}});
    EXPECT_TRUE(record.getOrderOfAccess(order));
    EXPECT_EQ(order, 0);
    build(record, toEndpoint, {{"Name", "eth1_IPv4"}});
    EXPECT_TRUE(record.getOrderOfAccess(order));
    EXPECT_EQ(order, 0);
}

TEST_F(DHCPRemoteAccessAvailableToElementTest, InterfaceWhoseServersCannotBeReadIsSkipped) {
    setTree({host({staticInterface("eth0"), dhcpInterface("eth0", {})})});
    EXPECT_THAT(build(toEndpoint, {{"Name", "eth0_IPv4"}}), ::testing::SizeIs(4));
    setTree({host({staticInterface("eth0")})});
    EXPECT_THAT(
        build(toEndpoint, {{"Name", "eth0_IPv4"}}),
        fails("InstrumentationException", "Concerned IP Protocol Endpoint Could Not Be Found."));
}

TEST_F(DHCPRemoteAccessAvailableToElementTest, LastOfEqualKeysCountsAndAllAreReadInTheirOrder) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})})});
    const test::LogCapture capture;
    EXPECT_THAT(build(toEndpoint, {{"SystemName", "first"},
                                   {"Name", "eth9_IPv4"},
                                   {"SystemCreationClassName", "Class"},
                                   {"SystemName", "last"},
                                   {"Name", "eth0_IPv4"}}),
                ElementsAre(Pair("Name", "eth0"), Pair("SystemName", "last"),
                            Pair("SystemCreationClassName", "Class"),
                            Pair("CreationClassName", "QVXZR_DHCPProtocolEndpoint")));
    EXPECT_THAT(test::variables(capture.log()),
                ElementsAre("SystemName=first", "Name=eth9_IPv4", "SystemCreationClassName=Class",
                            "SystemName=last", "Name=eth0_IPv4", "nameKey=eth0"));
}

class SAPSAPDependencyTest : public test::TreeTest {};

constexpr auto toIPEndpoint = &SAPSAPDependency::getIPSAPMoniker;
constexpr auto toDHCPEndpoint = &SAPSAPDependency::getDHCPSAPMoniker;

TEST_F(SAPSAPDependencyTest, IPEndpointIsMadeFromWhateverOfTheTwoKeysIsThere) {
    EXPECT_THAT(build(toIPEndpoint, {{"SystemName", "host"}}),
                ElementsAre(Pair("Name", ""), Pair("SystemName", "host"),
                            Pair("CreationClassName", "QVXZR_IPProtocolEndpoint"),
                            Pair("SystemCreationClassName", "QVXZR_ComputerSystem")));
    EXPECT_THAT(build(toIPEndpoint, {{"Name", "a"}, {"Name", "eth0"}}),
                ElementsAre(Pair("Name", "eth0"), Pair("SystemName", ""),
                            Pair("CreationClassName", "QVXZR_IPProtocolEndpoint"),
                            Pair("SystemCreationClassName", "QVXZR_ComputerSystem")));
    for (const auto builder : {toIPEndpoint, toDHCPEndpoint}) {
        EXPECT_THAT(
            build(builder, {{"CreationClassName", "x"}}),
            fails("FrameworkException", "Could not find 'Name' and 'System Name' Key in Moniker"));
    }
}

TEST_F(SAPSAPDependencyTest, LastOfEqualKeysCountsAndAllAreReadInTheirOrder) {
    setTree({host({dhcpInterface("eth0")})});
    const Keys keys{{"SystemName", "a"},
                    {"Name", "b"},
                    {"Other", "c"},
                    {"Name", "eth0"},
                    {"SystemName", hostName()}};
    for (const auto builder : {toIPEndpoint, toDHCPEndpoint}) {
        const LogCapture capture;
        const Keys made = build(builder, keys);
        ASSERT_GE(made.size(), 2U);
        EXPECT_EQ(made[0], std::pair("Name"s, "eth0"s));
        EXPECT_EQ(made[1], std::pair("SystemName"s, hostName()));
        auto read = test::variables(capture.log());
        read.resize(4);
        EXPECT_THAT(read,
                    ElementsAre("SystemName=a", "Name=b", "Name=eth0", "SystemName=" + hostName()));
    }
}

TEST_F(SAPSAPDependencyTest, DHCPEndpointMustHaveBothKeys) {
    setTree({host({dhcpInterface("eth0"), staticInterface("eth1")}),
             serviceProcessor({dhcpInterface("eth0")})});
    EXPECT_THAT(build(toDHCPEndpoint, {{"SystemName", "BMC:-1"}, {"Name", "eth0"}}),
                ElementsAre(Pair("Name", "eth0"), Pair("SystemName", "BMC:-1")));
    for (const Keys& keys : {Keys{{"Name", "eth0"}}, Keys{{"SystemName", "BMC:-1"}},
                             Keys{{"Name", "eth1"}, {"SystemName", hostName()}}}) {
        EXPECT_THAT(
            build(toDHCPEndpoint, keys),
            fails("FrameworkException", "Could not match the key property for DHCP in Moniker"));
    }
}

TEST_F(SAPSAPDependencyTest, AddressOriginFollowsTheAddressSourceOfTheRecordsOwnNode) {
    const std::vector<std::pair<int, unsigned short>> origins{{0, 0}, {1, 4}, {2, 5}, {3, 3},
                                                              {4, 6}, {5, 1}, {6, 0}};
    for (const auto& [addressSource, origin] : origins) {
        setTree({host({test::interface("eth0", {{"AddressSource", addressSource}})})});
        SAPSAPDependency record;
        unsigned short value = 77;
        EXPECT_TRUE(record.getAddressOrigin(value));
        EXPECT_EQ(value, 0) << "a record that stands on nothing";
        record.selectNode(ZR::NodeLexicon::NodeType::NetworkInterface);
        const LogCapture capture;
        EXPECT_TRUE(record.getAddressOrigin(value));
        EXPECT_THAT(test::variables(capture.log()),
                    ElementsAre("IPOrigin in IP Protocol=" + std::to_string(addressSource)));
        EXPECT_THAT(capture.logMessages().front(), HasSubstr(" origin=0x"));
        EXPECT_EQ(value, origin) << addressSource;
    }
}

}  // namespace
