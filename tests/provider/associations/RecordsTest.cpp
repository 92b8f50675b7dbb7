// The association records: how the two ends of each association class belong together.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "Lindows/DHCPElementSettingData.h"
#include "Lindows/DHCPOrderedComponent.h"
#include "Lindows/DHCPRemoteAccessAvailableToElement.h"
#include "Lindows/DHCPRemoteHostedAccessPoint.h"
#include "Lindows/ElementCapabilities.h"
#include "Lindows/HostedAccessPoint.h"
#include "Lindows/SAPSAPDependency.h"
#include "Tree.h"
#include "include/Exceptions.h"
#include "support/LogCapture.h"

namespace {

using test::computer;
using test::dhcpInterface;
using test::host;
using test::Json;
using test::serviceProcessor;
using test::staticInterface;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Pair;
using ZR::Moniker;
using namespace ZR::DHCPClientProvider;  // NOLINT(google-build-using-namespace)

using Keys = std::vector<std::pair<std::string, std::string>>;

Moniker monikerOf(const Keys& keys) {
    Moniker moniker;
    for (const auto& [name, value] : keys) {
        moniker.addKey(name, value);
    }
    return moniker;
}

Keys keysOf(Moniker moniker) {
    Keys keys;
    for (std::size_t i = 0; i < moniker.getKeyCount(); ++i) {
        std::string name;
        std::string value;
        EXPECT_TRUE(moniker.selectKey(i) && moniker.getName(name) && moniker.getValue(value));
        keys.emplace_back(name, value);
    }
    return keys;
}

/// Runs a builder; its keys, or "CLASS: message" of what it threw as one pair.
template <typename Record>
Keys build(Record& record, Moniker (Record::*builder)(Moniker&), const Keys& known) {
    Moniker moniker = monikerOf(known);
    try {
        return keysOf((record.*builder)(moniker));
    } catch (const ZR::FrameworkException& exception) {
        return {{"FrameworkException", exception.what()}};
    } catch (const ZR::InstrumentationException& exception) {
        return {{"InstrumentationException", exception.what()}};
    }
}

template <typename Record>
Keys build(Moniker (Record::*builder)(Moniker&), const Keys& known) {
    Record record;
    return build(record, builder, known);
}

auto fails(const char* exception, const char* text) {
    return ElementsAre(Pair(std::string(exception), std::string(text)));
}

Json nameless() {
    return {{"type", "NetworkInterface"},
            {"description", "nameless"},
            {"properties", {{"DHCPEnabled", true}}}};
}

class RecordsTest : public test::TreeTest {};

// Computer system and endpoint.

constexpr auto toEndpoints = &DHCPHostedAccessPoint::getDHCPProtocolEndPointMoniker;
constexpr auto toComputer = &DHCPHostedAccessPoint::getSystemMoniker;

TEST_F(RecordsTest, ComputerWithoutNameKeyHasNoEndpoints) {
    for (const Keys& keys : {Keys{}, Keys{{"name", "host1"}}, Keys{{"CreationClassName", "x"}}}) {
        EXPECT_THAT(build(toEndpoints, keys),
                    fails("FrameworkException", "Could not find 'Name' key in Moniker"));
    }
}

TEST_F(RecordsTest, ComputerNameBecomesSystemNameWhetherOrNotItExists) {
    EXPECT_THAT(build(toEndpoints, {{"Name", "host1"}}), ElementsAre(Pair("SystemName", "host1")));
}

TEST_F(RecordsTest, EndpointLeadsToTheComputerOfItsSystemName) {
    setTree({host({}), serviceProcessor({})});
    EXPECT_THAT(build(toComputer, {{"SystemName", "BMC:-1"}}), ElementsAre(Pair("Name", "BMC:-1")));
    EXPECT_THAT(build(toComputer, {{"Name", "eth0"}, {"SystemName", hostName()}}),
                ElementsAre(Pair("Name", hostName())));
}

TEST_F(RecordsTest, EndpointOfAnUnknownComputerIsAnInstrumentationError) {
    setTree({host({})});
    EXPECT_THAT(build(toComputer, {{"SystemName", "elsewhere"}}),
                fails("InstrumentationException", "Concerned Computer Could Not Be Found."));
    EXPECT_THAT(build(toComputer, {}),
                fails("FrameworkException", "Could not find 'System Name' Key in Moniker"));
}

TEST_F(RecordsTest, UnreadableNameOfTheFirstComputerEndsTheSearch) {
    setTree({{{"type", "ComputerSystem"}, {"description", "Computer"}},
             computer("Computer", "second", {})});
    EXPECT_THAT(build(toComputer, {{"SystemName", "second"}}),
                fails("InstrumentationException", "Name Property on computer not available."));
}

TEST_F(RecordsTest, FirstOfTwoEqualKeysCountsForTheHostedAccessPoint) {
    setTree({host({}), serviceProcessor({})});
    EXPECT_THAT(build(toEndpoints, {{"Name", "a"}, {"Name", "b"}}),
                ElementsAre(Pair("SystemName", "a")));
    EXPECT_THAT(build(toComputer, {{"SystemName", "BMC:-1"}, {"SystemName", hostName()}}),
                ElementsAre(Pair("Name", "BMC:-1")));
}

TEST_F(RecordsTest, BuildersBeginTheirWalksAnew) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})}), serviceProcessor({})});
    DHCPHostedAccessPoint hosted;
    ElementCapabilities capabilities;
    DHCPOrderedComponent ordered;
    for (int i = 0; i < 2; ++i) {
        EXPECT_THAT(
            build(hosted, &DHCPHostedAccessPoint::getSystemMoniker, {{"SystemName", hostName()}}),
            ElementsAre(Pair("Name", hostName())));
        EXPECT_THAT(build(capabilities, &ElementCapabilities::getDHCPCapabilitiesMoniker,
                          {{"Name", "eth0"}}),
                    ElementsAre(Pair("InstanceID", "eth0")));
        EXPECT_THAT(build(ordered, &DHCPOrderedComponent::getGroupComponentMoniker,
                          {{"InstanceID", "Computer%eth0"}}),
                    ElementsAre(Pair("InstanceID", "Computer%eth0%dhcp")));
    }
}

TEST_F(RecordsTest, BuildersTraceArgumentAndKeysAndNoExitWhenTheyThrow) {
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

// Computer system and access point.

constexpr auto toAccessPoints = &DHCPRemoteHostedAccessPoint::getRemoteSAPMoniker;
constexpr auto toItsComputer = &DHCPRemoteHostedAccessPoint::getSystemMoniker;

TEST_F(RecordsTest, ComputerLeadsToItsAccessPointsOnlyIfItHasAny) {
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

TEST_F(RecordsTest, AccessPointLeadsToTheComputerOfItsSystemName) {
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

// Access point and endpoint.

constexpr auto toAccessPoint =
    &DHCPRemoteAccessAvailableToElement::getRemoteServiceAccessPointMoniker;
constexpr auto toEndpoint = &DHCPRemoteAccessAvailableToElement::getDHCPProtocolEndpointMoniker;

TEST_F(RecordsTest, EndpointLeadsToTheFirstAccessPointOfItsInterfaceAndItsOrder) {
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

TEST_F(RecordsTest, OnlyTheLastUnderscoreSplitsAnAccessPointName) {
    setTree({host({dhcpInterface("my_nic", {"192.0.2.1"})})});
    EXPECT_THAT(build(toAccessPoint, {{"Name", "my_nic"}}),
                ElementsAre(Pair("Name", "my_nic_IPv4")));
    EXPECT_THAT(build(toEndpoint, {{"Name", "my_nic_2"}}),
                ElementsAre(Pair("Name", "my_nic"), Pair("SystemName", ""),
                            Pair("SystemCreationClassName", ""),
                            Pair("CreationClassName", "QVXZR_DHCPProtocolEndpoint")));
}

TEST_F(RecordsTest, AccessPointNameWithoutUnderscoreIsRefusedBeforeAnyNodeIsRead) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})})});
    DHCPRemoteAccessAvailableToElement record;
    const auto visits = ZR::Instrumentation::nodeVisits();
    EXPECT_THAT(build(record, toEndpoint, {{"Name", "eth0"}}),
                fails("FrameworkException", "Name Key is not correct."));
    EXPECT_EQ(ZR::Instrumentation::nodeVisits(), visits);
}

TEST_F(RecordsTest, MissingAccessPointNamesTheEndpointAndMissingEndpointTheIPEndpoint) {
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

TEST_F(RecordsTest, AccessPointLeadsToItsEndpointWithTheLastOfItsKeys) {
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

TEST_F(RecordsTest, OrderOfAccessBecomesZeroForAnInterfaceWithSeveralServersAndStays) {
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

TEST_F(RecordsTest, InterfaceWhoseServersCannotBeReadIsSkipped) {
    setTree({host({staticInterface("eth0"), dhcpInterface("eth0", {})})});
    EXPECT_THAT(build(toEndpoint, {{"Name", "eth0_IPv4"}}), ::testing::SizeIs(4));
    setTree({host({staticInterface("eth0")})});
    EXPECT_THAT(
        build(toEndpoint, {{"Name", "eth0_IPv4"}}),
        fails("InstrumentationException", "Concerned IP Protocol Endpoint Could Not Be Found."));
}

// IP endpoint and DHCP endpoint.

constexpr auto toIPEndpoint = &SAPSAPDependency::getIPSAPMoniker;
constexpr auto toDHCPEndpoint = &SAPSAPDependency::getDHCPSAPMoniker;

TEST_F(RecordsTest, IPEndpointIsMadeFromWhateverOfTheTwoKeysIsThere) {
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

TEST_F(RecordsTest, DHCPEndpointMustHaveBothKeys) {
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

TEST_F(RecordsTest, AddressOriginFollowsTheAddressSourceOfTheRecordsOwnNode) {
    const std::vector<std::pair<int, unsigned short>> origins{{0, 0}, {1, 4}, {2, 5}, {3, 3},
                                                              {4, 6}, {5, 1}, {6, 0}};
    for (const auto& [addressSource, origin] : origins) {
        setTree({host({test::interface("eth0", {{"AddressSource", addressSource}})})});
        SAPSAPDependency record;
        unsigned short value = 77;
        EXPECT_TRUE(record.getAddressOrigin(value));
        EXPECT_EQ(value, 0) << "a record that stands on nothing";
        record.selectNode(ZR::NodeLexicon::NodeType::NetworkInterface);
        EXPECT_TRUE(record.getAddressOrigin(value));
        EXPECT_EQ(value, origin) << addressSource;
    }
}

// Endpoint and setting data.

constexpr auto toSetting = &DHCPElementSettingData::getDHCPSettingDataMoniker;
constexpr auto toElement = &DHCPElementSettingData::getManagedElementMoniker;

TEST_F(RecordsTest, EndpointAndSettingLeadToEachOther) {
    setTree({host({dhcpInterface("eth1"), dhcpInterface("eth0")})});
    EXPECT_THAT(build(toSetting, {{"Name", "eth0"}}),
                ElementsAre(Pair("InstanceID", "Computer%eth0")));
    EXPECT_THAT(build(toElement, {{"InstanceID", "Computer%eth0"}}),
                ElementsAre(Pair("SystemCreationClassName", "QVXZR_ComputerSystem"),
                            Pair("SystemName", hostName()), Pair("Name", "eth0")));
}

TEST_F(RecordsTest, SettingDataFailuresKeepTheirTexts) {
    setTree({host({staticInterface("eth0")})});
    EXPECT_THAT(build(toSetting, {}),
                fails("FrameworkException", "Could not find 'Name' key in Moniker"));
    EXPECT_THAT(build(toSetting, {{"Name", "eth9"}}),
                fails("FrameworkException", "Could not get 'Instance ID' key"));
    EXPECT_THAT(build(toElement, {}),
                fails("FrameworkException", "Could not find 'Name' key in Moniker"));
    EXPECT_THAT(build(toElement, {{"InstanceID", "eth0"}}),
                fails("FrameworkException", "Instance ID Property value is not correct"));
    EXPECT_THAT(build(toElement, {{"InstanceID", "Computer%eth0"}}),
                fails("FrameworkException", "Could not get 'System Name' and  'Name' key"));
}

TEST_F(RecordsTest, CurrentIsAlwaysOne) {
    unsigned short current = 77;
    EXPECT_TRUE(DHCPElementSettingData().getIsCurrent(current));
    EXPECT_EQ(current, 1);
}

// Assignment setting data and DHCP setting data.

constexpr auto toGroup = &DHCPOrderedComponent::getGroupComponentMoniker;
constexpr auto toPart = &DHCPOrderedComponent::getPartComponentMoniker;

TEST_F(RecordsTest, SettingAndAssignmentLeadToEachOther) {
    setTree({host({staticInterface("eth1"), staticInterface("eth0")})});
    EXPECT_THAT(build(toGroup, {{"InstanceID", "Computer%eth0"}}),
                ElementsAre(Pair("InstanceID", "Computer%eth0%dhcp")));
    EXPECT_THAT(build(toPart, {{"InstanceID", "Computer%eth0%dhcp"}}),
                ElementsAre(Pair("InstanceID", "Computer%eth0")));
}

TEST_F(RecordsTest, AssignmentMustEndInExactlyDhcp) {
    setTree({host({staticInterface("eth0")})});
    for (const char* id : {"Computer%eth0%static", "Computer%eth0%DHCP", "Computer%eth0", "x"}) {
        EXPECT_THAT(build(toPart, {{"InstanceID", id}}),
                    fails("FrameworkException", "AssignmentSetting data is not dhcp"));
    }
    // Without a "%", the text before it is the whole, too.
    EXPECT_THAT(build(toPart, {{"InstanceID", "dhcp"}}),
                fails("FrameworkException", "Could not get InstanceID"));
    EXPECT_THAT(build(toPart, {{"InstanceID", "Computer%eth9%dhcp"}}),
                fails("FrameworkException", "Could not get InstanceID"));
    EXPECT_THAT(build(toPart, {}),
                fails("FrameworkException", "Could not find 'Name' key in Moniker"));
}

TEST_F(RecordsTest, SettingWithoutAnInterfacePieceMatchesNoInterface) {
    setTree({host({staticInterface(""), staticInterface("eth0")})});
    for (const char* id : {"eth0", "%", "", "Computer%", "Computer%eth9"}) {
        EXPECT_THAT(build(toGroup, {{"InstanceID", id}}),
                    fails("FrameworkException", "Could not get 'Instance ID' key"));
    }
    EXPECT_THAT(build(toGroup, {}),
                fails("FrameworkException", "Could not find 'InstanceID' property"));
}

TEST_F(RecordsTest, InterfaceWithAnUnreadableNameIsSkippedBySettings) {
    setTree({host({nameless(), dhcpInterface("eth0")})});
    EXPECT_THAT(build(toGroup, {{"InstanceID", "Computer%eth0"}}),
                ElementsAre(Pair("InstanceID", "Computer%eth0%dhcp")));
}

TEST_F(RecordsTest, SequenceIsAlwaysOne) {
    unsigned long long sequence = 77;
    EXPECT_TRUE(DHCPOrderedComponent().getAssignedSequence(sequence));
    EXPECT_EQ(sequence, 1U);
}

// Endpoint and capabilities.

constexpr auto toCapabilities = &ElementCapabilities::getDHCPCapabilitiesMoniker;
constexpr auto toItsEndpoint = &ElementCapabilities::getDHCPEndpointMoniker;

TEST_F(RecordsTest, EndpointAndCapabilitiesLeadToEachOther) {
    setTree({host({dhcpInterface("eth1"), dhcpInterface("eth0"), dhcpInterface("eth2")})});
    EXPECT_THAT(build(toCapabilities, {{"Name", "eth0"}}), ElementsAre(Pair("InstanceID", "eth0")));
    EXPECT_THAT(build(toItsEndpoint, {{"InstanceID", "eth0"}}), ElementsAre(Pair("Name", "eth0")));
}

TEST_F(RecordsTest, CapabilitiesOfAnUnknownInterfaceAreNamedAfterTheLastOne) {
    setTree({host({dhcpInterface("eth0"), staticInterface("eth1")})});
    EXPECT_THAT(build(toCapabilities, {{"Name", "eth9"}}), ElementsAre(Pair("InstanceID", "eth1")));
    setTree({host({})});
    EXPECT_THAT(build(toCapabilities, {{"Name", "eth9"}}), ElementsAre(Pair("InstanceID", "")));
}

TEST_F(RecordsTest, CapabilitiesFailuresKeepTheirTexts) {
    setTree({host({nameless(), dhcpInterface("eth0")})});
    EXPECT_THAT(build(toCapabilities, {}),
                fails("FrameworkException", "Could not find 'Name' Key in Moniker"));
    EXPECT_THAT(
        build(toCapabilities, {{"Name", "eth0"}}),
        fails("InstrumentationException", "Name Property on NetworkIPConfig Node not available."));
    EXPECT_THAT(build(toItsEndpoint, {}),
                fails("FrameworkException", "Could not find 'InstanceID' Key in Moniker"));
    EXPECT_THAT(build(toItsEndpoint, {{"InstanceID", "eth9"}}),
                fails("FrameworkException", "Could not match 'InstanceID' Key with DHCP instance"));
}

TEST_F(RecordsTest, CapabilitiesLookupTracesKeyPlaceAndCount) {
    setTree({host({dhcpInterface("eth0")})});
    const ZR::Testing::LogCapture log;
    build(toItsEndpoint, {{"x", "y"}, {"InstanceID", "eth0"}, {"InstanceID", "eth1"}});
    std::vector<std::string> own;
    for (const auto& line : log.log()) {
        if (line.file == "Lindows/ElementCapabilities" && line.message.starts_with("VARIABLE")) {
            own.push_back(line.message.substr(0, line.message.find(" at line")));
        }
    }
    EXPECT_THAT(own,
                ElementsAre("VARIABLE: 'InstanceID' has Value 'eth0'",
                            "VARIABLE: 'KeyID' has Value '1'", "VARIABLE: 'count' has Value '3'"));
}

TEST_F(RecordsTest, CharacteristicsAreNeverTold) {
    std::vector<unsigned short> characteristics{1};
    EXPECT_FALSE(ElementCapabilities().getCharacteristics(characteristics));
    EXPECT_THAT(characteristics, ElementsAre(1));
}

}  // namespace
