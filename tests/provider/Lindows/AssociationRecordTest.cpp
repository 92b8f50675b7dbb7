// The records of associations between settings, capabilities and endpoints.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "Builders.h"
#include "Elements.h"
#include "Lindows/AssociationRecord.h"
#include "Lindows/DHCPElementSettingData.h"
#include "Lindows/DHCPOrderedComponent.h"
#include "Lindows/DHCPProtocolEndpoint.h"
#include "Lindows/ElementCapabilities.h"
#include "kit/LogCapture.h"
#include "kit/Tree.h"

namespace {

using test::build;
using test::dhcpInterface;
using test::fails;
using test::host;
using test::LogCapture;
using test::nameless;
using test::serviceProcessor;
using test::staticInterface;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::Pair;
using ZR::Instrumentation;
using ZR::Moniker;
using ZR::TracePoint;
using ZR::TraceSource;
using ZR::DHCPClientProvider::DHCPElementSettingData;
using ZR::DHCPClientProvider::DHCPOrderedComponent;
using ZR::DHCPClientProvider::DHCPProtocolEndpoint;
using ZR::DHCPClientProvider::ElementCapabilities;
using ZR::DHCPClientProvider::findKey;
using ZR::DHCPClientProvider::findKeys;
using ZR::DHCPClientProvider::requireKey;
using ZR::DHCPClientProvider::visitKeys;

const std::string logger = ZR::loggerCategory;
const TraceSource source{"Lindows/AssociationRecordTest", logger};

class AssociationRecordTest : public test::TreeTest {
  protected:
    Moniker moniker_ = test::monikerOf({{"Name", "a"}, {"name", "b"}, {"Name", "c"}, {"Key", ""}});
};

TEST_F(AssociationRecordTest, KeysAreVisitedInTheirOrderUntilTheVisitorHasEnough) {
    std::vector<std::string> seen;
    const auto visit = [&](std::size_t enough) {
        seen.clear();
        visitKeys(moniker_, [&](std::size_t position, const std::string& name) {
            std::string value;
            EXPECT_TRUE(moniker_.getValue(value));
            seen.push_back(std::to_string(position) + name + '=' + value);
            return seen.size() == enough;
        });
    };
    visit(0);
    EXPECT_THAT(seen, ElementsAre("0Name=a", "1name=b", "2Name=c", "3Key="));
    visit(2);
    EXPECT_THAT(seen, ElementsAre("0Name=a", "1name=b"));
}

TEST_F(AssociationRecordTest, FirstOfEqualKeysIsFoundAndTracedAlone) {
    const LogCapture log;
    EXPECT_EQ(findKey(moniker_, "Name", ZR_HERE), "a");
    EXPECT_EQ(findKey(moniker_, "Key", ZR_HERE), "") << "there, and empty";
    EXPECT_EQ(findKey(moniker_, "key", ZR_HERE), std::nullopt);
    EXPECT_THAT(test::variables(log.log()), ElementsAre("Name=a", "Key="));
}

TEST_F(AssociationRecordTest, LastOfEqualKeysCountsWhereSeveralAreFoundAndEachIsTracedInItsPlace) {
    const LogCapture log;
    constexpr std::array<std::string_view, 3> names{"Key", "NAME", "Name"};
    EXPECT_THAT(findKeys(moniker_, names, ZR_HERE), ElementsAre("", std::nullopt, "c"));
    EXPECT_THAT(test::variables(log.log()), ElementsAre("Name=a", "Name=c", "Key="));
}

TEST_F(AssociationRecordTest, RequiredKeyThatIsMissingIsThrownWithTheMessage) {
    EXPECT_EQ(requireKey(moniker_, "Name", "no name", ZR_HERE), "a");
    try {
        requireKey(moniker_, "InstanceID", "no id", ZR_HERE);
        FAIL() << "it is missing";
    } catch (const ZR::FrameworkException& exception) {
        EXPECT_STREQ(exception.what(), "no id");
    }
}

TEST_F(AssociationRecordTest, WalksEndAtTheFirstMatchOrRunOut) {
    setTree({test::host({test::staticInterface("eth0"), test::dhcpInterface("eth1")})});
    const auto hasName = [](const char* wanted) {
        return [wanted](const Instrumentation& node) {
            std::string name;
            return node.getProperty(ZR::NodeLexicon::Properties::Name, name) && name == wanted;
        };
    };
    constexpr auto interfaces = ZR::NodeLexicon::NodeType::NetworkInterface;
    using ZR::DHCPClientProvider::walkTo;
    Instrumentation cursor;
    EXPECT_TRUE(walkTo(cursor, interfaces, hasName("eth1")));
    EXPECT_TRUE(walkTo(cursor, interfaces, hasName("eth0"))) << "from the first node again";
    EXPECT_FALSE(walkTo(cursor, interfaces, hasName("eth9")));
    EXPECT_FALSE(cursor);
    DHCPProtocolEndpoint endpoint;
    EXPECT_FALSE(walkTo(endpoint, [](const auto& element) {
        return has(element, &DHCPProtocolEndpoint::getName, "eth0");
    })) << "it has no DHCP";
}

TEST_F(AssociationRecordTest, InterfaceOfAnAccessPointIsWhatStandsBeforeTheLastUnderscore) {
    using ZR::DHCPClientProvider::interfaceOfAccessPoint;
    EXPECT_EQ(interfaceOfAccessPoint("eth0_IPv4", ZR_HERE), "eth0");
    EXPECT_EQ(interfaceOfAccessPoint("my_nic_2", ZR_HERE), "my_nic");
    EXPECT_EQ(interfaceOfAccessPoint("_", ZR_HERE), "");
    EXPECT_THROW(interfaceOfAccessPoint("eth0", ZR_HERE), ZR::FrameworkException);
    EXPECT_THROW(interfaceOfAccessPoint("", ZR_HERE), ZR::FrameworkException);
}

class DHCPElementSettingDataTest : public test::TreeTest {};

constexpr auto toSetting = &DHCPElementSettingData::getDHCPSettingDataMoniker;
constexpr auto toElement = &DHCPElementSettingData::getManagedElementMoniker;

TEST_F(DHCPElementSettingDataTest, EndpointAndSettingLeadToEachOther) {
    setTree({host({dhcpInterface("eth1"), dhcpInterface("eth0")})});
    EXPECT_THAT(build(toSetting, {{"Name", "eth0"}}),
                ElementsAre(Pair("InstanceID", "Computer%eth0")));
    EXPECT_THAT(build(toElement, {{"InstanceID", "Computer%eth0"}}),
                ElementsAre(Pair("SystemCreationClassName", "QVXZR_ComputerSystem"),
                            Pair("SystemName", hostName()), Pair("Name", "eth0")));
}

TEST_F(DHCPElementSettingDataTest, OnlyAPercentSignSplitsAnInstanceID) {
    // All that the kernel takes in a name but the sign itself.
    const std::string odd = "a~b.c_d-e,f;g#1";
    setTree({host({dhcpInterface(odd)})});
    EXPECT_THAT(build(toSetting, {{"Name", odd}}),
                ElementsAre(Pair("InstanceID", "Computer%" + odd)));
    EXPECT_THAT(build(toElement, {{"InstanceID", "Computer%" + odd}}), Contains(Pair("Name", odd)));
}

TEST_F(DHCPElementSettingDataTest, SettingDataFailuresKeepTheirTexts) {
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

TEST_F(DHCPElementSettingDataTest, CurrentIsAlwaysOne) {
    unsigned short current = 77;
    EXPECT_TRUE(DHCPElementSettingData().getIsCurrent(current));
    EXPECT_EQ(current, 1);
}

class DHCPOrderedComponentTest : public test::TreeTest {};

constexpr auto toGroup = &DHCPOrderedComponent::getGroupComponentMoniker;
constexpr auto toPart = &DHCPOrderedComponent::getPartComponentMoniker;

TEST_F(DHCPOrderedComponentTest, SettingAndAssignmentLeadToEachOther) {
    setTree({host({staticInterface("eth1"), staticInterface("eth0")})});
    EXPECT_THAT(build(toGroup, {{"InstanceID", "Computer%eth0"}}),
                ElementsAre(Pair("InstanceID", "Computer%eth0%dhcp")));
    EXPECT_THAT(build(toPart, {{"InstanceID", "Computer%eth0%dhcp"}}),
                ElementsAre(Pair("InstanceID", "Computer%eth0")));
}

TEST_F(DHCPOrderedComponentTest, OnlyAPercentSignSplitsAnInstanceID) {
    const std::string odd = "a~b.c_d-e,f;g#1";
    setTree({host({dhcpInterface(odd)})});
    EXPECT_THAT(build(toGroup, {{"InstanceID", "Computer%" + odd}}),
                ElementsAre(Pair("InstanceID", "Computer%" + odd + "%dhcp")));
    EXPECT_THAT(build(toPart, {{"InstanceID", "Computer%" + odd + "%dhcp"}}),
                ElementsAre(Pair("InstanceID", "Computer%" + odd)));
}

TEST_F(DHCPOrderedComponentTest, AssignmentMustEndInExactlyDhcp) {
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

TEST_F(DHCPOrderedComponentTest, SettingWithoutAnInterfacePieceMatchesNoInterface) {
    setTree({host({staticInterface(""), staticInterface("eth0")})});
    for (const char* id : {"eth0", "%", "", "Computer%", "Computer%eth9"}) {
        EXPECT_THAT(build(toGroup, {{"InstanceID", id}}),
                    fails("FrameworkException", "Could not get 'Instance ID' key"));
    }
    EXPECT_THAT(build(toGroup, {}),
                fails("FrameworkException", "Could not find 'InstanceID' property"));
}

TEST_F(DHCPOrderedComponentTest, InterfaceWithAnUnreadableNameIsSkippedBySettings) {
    setTree({host({nameless(), dhcpInterface("eth0")})});
    EXPECT_THAT(build(toGroup, {{"InstanceID", "Computer%eth0"}}),
                ElementsAre(Pair("InstanceID", "Computer%eth0%dhcp")));
}

TEST_F(DHCPOrderedComponentTest, SequenceIsAlwaysOne) {
    unsigned long long sequence = 77;
    EXPECT_TRUE(DHCPOrderedComponent().getAssignedSequence(sequence));
    EXPECT_EQ(sequence, 1U);
}

TEST_F(DHCPOrderedComponentTest, BuildersBeginTheirWalksAnew) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")}), serviceProcessor({})});
    DHCPOrderedComponent record;
    for (int i = 0; i < 2; ++i) {
        EXPECT_THAT(build(record, toGroup, {{"InstanceID", "Computer%eth0"}}),
                    ElementsAre(Pair("InstanceID", "Computer%eth0%dhcp")));
    }
}

class ElementCapabilitiesTest : public test::TreeTest {};

constexpr auto toCapabilities = &ElementCapabilities::getDHCPCapabilitiesMoniker;
constexpr auto toItsEndpoint = &ElementCapabilities::getDHCPEndpointMoniker;

TEST_F(ElementCapabilitiesTest, EndpointAndCapabilitiesLeadToEachOther) {
    setTree({host({dhcpInterface("eth1"), dhcpInterface("eth0"), dhcpInterface("eth2")})});
    EXPECT_THAT(build(toCapabilities, {{"Name", "eth0"}}), ElementsAre(Pair("InstanceID", "eth0")));
    EXPECT_THAT(build(toItsEndpoint, {{"InstanceID", "eth0"}}), ElementsAre(Pair("Name", "eth0")));
}

TEST_F(ElementCapabilitiesTest, CapabilitiesOfAnUnknownInterfaceAreNamedAfterTheLastOne) {
    setTree({host({dhcpInterface("eth0"), staticInterface("eth1")})});
    EXPECT_THAT(build(toCapabilities, {{"Name", "eth9"}}), ElementsAre(Pair("InstanceID", "eth1")));
    setTree({host({})});
    EXPECT_THAT(build(toCapabilities, {{"Name", "eth9"}}), ElementsAre(Pair("InstanceID", "")));
}

TEST_F(ElementCapabilitiesTest, CapabilitiesFailuresKeepTheirTexts) {
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

TEST_F(ElementCapabilitiesTest, CapabilitiesLookupTracesKeyPlaceAndCount) {
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

TEST_F(ElementCapabilitiesTest, CharacteristicsAreNeverTold) {
    std::vector<unsigned short> characteristics{1};
    EXPECT_FALSE(ElementCapabilities().getCharacteristics(characteristics));
    EXPECT_THAT(characteristics, ElementsAre(1));
}

TEST_F(ElementCapabilitiesTest, BuildersBeginTheirWalksAnew) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")}), serviceProcessor({})});
    ElementCapabilities record;
    for (int i = 0; i < 2; ++i) {
        EXPECT_THAT(build(record, toCapabilities, {{"Name", "eth0"}}),
                    ElementsAre(Pair("InstanceID", "eth0")));
    }
}

}  // namespace
