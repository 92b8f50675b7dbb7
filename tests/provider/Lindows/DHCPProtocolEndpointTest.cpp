#include "Lindows/DHCPProtocolEndpoint.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <optional>

#include "Elements.h"
#include "kit/HostNameFake.h"
#include "kit/Tree.h"

namespace {

using test::computer;
using test::dhcpInterface;
using test::host;
using test::interface;
using test::Json;
using test::LogCapture;
using test::Numbers;
using test::serviceProcessor;
using test::staticInterface;
using test::text;
using Endpoint = ZR::DHCPClientProvider::DHCPProtocolEndpoint;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::MatchesRegex;

class DHCPProtocolEndpointTest : public test::TreeTest {
  protected:
    static std::vector<std::string> walk(Endpoint& endpoint) {
        return test::walk(endpoint, &Endpoint::getName);
    }
};

TEST_F(DHCPProtocolEndpointTest, NoInterfaceNodesGiveNoRecords) {
    setTree({host({})});
    Endpoint endpoint;
    EXPECT_FALSE(endpoint);
}

TEST_F(DHCPProtocolEndpointTest, DHCPFlagFalseOrUnreadableGivesNoRecords) {
    setTree({host({staticInterface("eth0"), interface("eth1"),
                   interface("eth2", {{"DHCPEnabled", "yes"}})})});
    Endpoint endpoint;
    EXPECT_FALSE(endpoint);
}

TEST_F(DHCPProtocolEndpointTest, WalksTheDHCPInterfacesInTheirOrder) {
    setTree({host({dhcpInterface("eth0"), staticInterface("eth1"), dhcpInterface("eth2")}),
             serviceProcessor({dhcpInterface("bmc0")})});
    Endpoint endpoint;
    EXPECT_THAT(walk(endpoint), ElementsAre("eth0", "eth2", "bmc0"));
}

TEST_F(DHCPProtocolEndpointTest, NameFilterThatMatchesNothingLeavesTheCursorPastTheEnd) {
    setTree({host({dhcpInterface("eth0")})});
    Endpoint endpoint;
    endpoint.setFilter(Endpoint::FilterByName, "eth9");
    EXPECT_FALSE(endpoint.isOnRecord());
    EXPECT_FALSE(endpoint);
}

TEST_F(DHCPProtocolEndpointTest, NameFilterSelectsTheOneInterface) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1"), dhcpInterface("eth2")})});
    Endpoint endpoint;
    endpoint.setFilter(Endpoint::FilterByName, "eth1");
    EXPECT_THAT(walk(endpoint), ElementsAre("eth1"));
}

TEST_F(DHCPProtocolEndpointTest, NameFilterComparesExactly) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("ETH0"), dhcpInterface("eth01")})});
    Endpoint endpoint;
    endpoint.setFilter(Endpoint::FilterByName, "eth0");
    EXPECT_THAT(walk(endpoint), ElementsAre("eth0"));
}

TEST_F(DHCPProtocolEndpointTest, NameFilterOnANonDHCPInterfaceYieldsTheNextDHCPInterface) {
    setTree({host({staticInterface("eth0"), dhcpInterface("eth1"), dhcpInterface("eth2")})});
    Endpoint endpoint;
    endpoint.setFilter(Endpoint::FilterByName, "eth0");
    EXPECT_THAT(walk(endpoint), ElementsAre("eth1"));
}

TEST_F(DHCPProtocolEndpointTest, OtherFilterTypesNeverReject) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")})});
    Endpoint endpoint;
    endpoint.setFilter(static_cast<Endpoint::FilterType>(2), "nothing");
    EXPECT_THAT(walk(endpoint), ElementsAre("eth0", "eth1"));
}

TEST_F(DHCPProtocolEndpointTest, SystemNameFilterTellsServiceProcessorFromHost) {
    setTree({host({dhcpInterface("eth0")}), serviceProcessor({dhcpInterface("bmc0")})});
    Endpoint ofServiceProcessor;
    ofServiceProcessor.setFilter(Endpoint::FilterBySystemName, "BMC:-1");
    EXPECT_THAT(walk(ofServiceProcessor), ElementsAre("bmc0"));

    Endpoint ofHost;
    ofHost.setFilter(Endpoint::FilterBySystemName, hostName());
    EXPECT_THAT(walk(ofHost), ElementsAre("eth0"));
}

TEST_F(DHCPProtocolEndpointTest, FiltersAddUpAndEachStartsFromTheFirstInterface) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")}),
             serviceProcessor({dhcpInterface("eth1")})});
    Endpoint endpoint;
    endpoint.setFilter(Endpoint::FilterBySystemName, "BMC:-1");
    endpoint.setFilter(Endpoint::FilterByName, "eth1");
    EXPECT_THAT(walk(endpoint), ElementsAre("eth1"));

    Endpoint backwards;
    backwards.setFilter(static_cast<Endpoint::FilterType>(9), "");
    ++backwards;
    backwards.setFilter(Endpoint::FilterByName, "eth0");
    EXPECT_THAT(walk(backwards), ElementsAre("eth0"));
}

TEST_F(DHCPProtocolEndpointTest, SystemNameFilterHoldsWhenTheHostNameCannotBeHad) {
    setTree({host({dhcpInterface("eth0")})});
    const ZR::Testing::HostNameFails failing;
    Endpoint endpoint;
    endpoint.setFilter(Endpoint::FilterBySystemName, "some other computer");
    EXPECT_THAT(walk(endpoint), ElementsAre("eth0"));
}

TEST_F(DHCPProtocolEndpointTest, SystemNameFailsWithAFailureLineWhenTheHostNameCannotBeHad) {
    setTree({host({dhcpInterface("eth0")})});
    Endpoint endpoint;
    ASSERT_TRUE(static_cast<bool>(endpoint));
    const ZR::Testing::HostNameFails failing;
    const LogCapture capture(6000, 6000);
    EXPECT_EQ(text(endpoint, &Endpoint::getSystemName), std::nullopt);
    for (const auto& records : {capture.log(), capture.trace()}) {
        ASSERT_EQ(records.size(), 1U);
        EXPECT_EQ(records[0].level, 6000);
        EXPECT_EQ(records[0].category, "Merrow.DHCPClientProvider");
        EXPECT_EQ(records[0].file, "Lindows/DHCPProtocolEndpoint");
        EXPECT_EQ(records[0].function, "getSystemName");
        EXPECT_THAT(records[0].message,
                    MatchesRegex("MESSAGE \\[File: Lindows/DHCPProtocolEndpoint, Line: "
                                 "[0-9]+\\]: gethostname Failed"));
    }
}

TEST_F(DHCPProtocolEndpointTest, KeysOfAHostInterface) {
    setTree({host({dhcpInterface("eth0")})});
    Endpoint endpoint;
    ASSERT_TRUE(static_cast<bool>(endpoint));
    EXPECT_EQ(text(endpoint, &Endpoint::getName), "eth0");
    EXPECT_EQ(text(endpoint, &Endpoint::getSystemName), hostName());
    EXPECT_EQ(text(endpoint, &Endpoint::getCreationClassName), "QVXZR_DHCPProtocolEndpoint");
    EXPECT_EQ(text(endpoint, &Endpoint::getSystemCreationClassName), "QVXZR_ComputerSystem");
}

TEST_F(DHCPProtocolEndpointTest, KeysOfAServiceProcessorInterface) {
    setTree({serviceProcessor({dhcpInterface("bmc0")})});
    Endpoint endpoint;
    ASSERT_TRUE(static_cast<bool>(endpoint));
    EXPECT_EQ(text(endpoint, &Endpoint::getSystemName), "BMC:-1");
    EXPECT_EQ(text(endpoint, &Endpoint::getSystemCreationClassName), "QVXZR_SPComputerSystem");
}

TEST_F(DHCPProtocolEndpointTest, ServiceProcessorDescriptionIsComparedExactly) {
    setTree({computer("bmc", "x", {dhcpInterface("eth0")}),
             computer("BMC ", "y", {dhcpInterface("eth1")})});
    Endpoint endpoint;
    for (; endpoint; ++endpoint) {
        EXPECT_EQ(text(endpoint, &Endpoint::getSystemName), hostName());
    }
}

TEST_F(DHCPProtocolEndpointTest, InterfaceWithoutAGrandparentBelongsToTheHost) {
    setTree({dhcpInterface("eth0")});
    Endpoint endpoint;
    ASSERT_TRUE(static_cast<bool>(endpoint));
    EXPECT_EQ(text(endpoint, &Endpoint::getSystemName), hostName());
    EXPECT_EQ(text(endpoint, &Endpoint::getSystemCreationClassName), "QVXZR_ComputerSystem");
}

TEST_F(DHCPProtocolEndpointTest, UnreadableNameSucceedsWithoutAnOutput) {
    setTree({host({test::namelessInterface({{"DHCPEnabled", true}})})});
    Endpoint endpoint;
    ASSERT_TRUE(static_cast<bool>(endpoint));
    EXPECT_EQ(text(endpoint, &Endpoint::getName), test::untouched);
    EXPECT_EQ(text(endpoint, &Endpoint::getElementName), std::nullopt);
}

TEST_F(DHCPProtocolEndpointTest, UnreadableNameIsComparedAsAnEmptyOne) {
    setTree({host({test::namelessInterface({{"DHCPEnabled", true}})})});
    Endpoint empty;
    empty.setFilter(Endpoint::FilterByName, "");
    EXPECT_TRUE(static_cast<bool>(empty));
    Endpoint named;
    named.setFilter(Endpoint::FilterByName, "eth0");
    EXPECT_FALSE(named);
}

TEST_F(DHCPProtocolEndpointTest, GettersPastTheEndReadNothing) {
    setTree({host({})});
    const Endpoint endpoint;
    EXPECT_FALSE(endpoint.isOnRecord());
    EXPECT_EQ(text(endpoint, &Endpoint::getName), test::untouched);
    EXPECT_EQ(text(endpoint, &Endpoint::getElementName), std::nullopt);
    EXPECT_EQ(text(endpoint, &Endpoint::getDescription), test::untouched);
    EXPECT_EQ(text(endpoint, &Endpoint::getSystemName), hostName());
    EXPECT_EQ(test::number(endpoint, &Endpoint::getRequestedState), 3);
    EXPECT_EQ(test::number(endpoint, &Endpoint::getEnabledState), 3);
}

TEST_F(DHCPProtocolEndpointTest, SteppingOnPastTheEndStaysThere) {
    setTree({host({dhcpInterface("eth0")})});
    Endpoint endpoint;
    ++endpoint;
    ++endpoint;
    EXPECT_FALSE(endpoint.isOnRecord());
    EXPECT_FALSE(endpoint);
}

TEST_F(DHCPProtocolEndpointTest, StandsOnARecordWithoutRegardToTheDHCPFlag) {
    setTree({host({staticInterface("eth0"), dhcpInterface("eth1")})});
    Endpoint endpoint;
    EXPECT_TRUE(endpoint.isOnRecord());
    EXPECT_EQ(text(endpoint, &Endpoint::getName), "eth0");
    EXPECT_TRUE(static_cast<bool>(endpoint));
    EXPECT_EQ(text(endpoint, &Endpoint::getName), "eth1");
}

TEST_F(DHCPProtocolEndpointTest, EvaluatesTheInterfaceOnWhichItStands) {
    setTree({host({staticInterface("eth0"), dhcpInterface("eth1")})});
    Endpoint endpoint;
    EXPECT_TRUE(endpoint.evaluate());
    endpoint.setFilter(Endpoint::FilterByName, "eth0");
    EXPECT_TRUE(endpoint.evaluate());
    EXPECT_TRUE(static_cast<bool>(endpoint));
    EXPECT_FALSE(endpoint.evaluate());
}

TEST_F(DHCPProtocolEndpointTest, FilteredStepsPassOverInterfacesOfOtherNames) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")}),
             serviceProcessor({dhcpInterface("eth0"), dhcpInterface("eth1")})});
    Endpoint endpoint;
    endpoint.setFilter(Endpoint::FilterByName, "eth1");
    EXPECT_EQ(text(endpoint, &Endpoint::getSystemName), hostName());
    ++endpoint;
    EXPECT_EQ(text(endpoint, &Endpoint::getSystemName), "BMC:-1");
    EXPECT_EQ(text(endpoint, &Endpoint::getName), "eth1");
    ++endpoint;
    EXPECT_FALSE(endpoint);
}

TEST_F(DHCPProtocolEndpointTest, FixedAndDescribingProperties) {
    setTree({host({dhcpInterface("eth0")})});
    Endpoint endpoint;
    ASSERT_TRUE(static_cast<bool>(endpoint));
    EXPECT_EQ(text(endpoint, &Endpoint::getElementName), "eth0");
    EXPECT_EQ(text(endpoint, &Endpoint::getDescription), "Ethernet interface eth0");
    EXPECT_EQ(text(endpoint, &Endpoint::getNameFormat), "NICName");
    EXPECT_EQ(text(endpoint, &Endpoint::getOtherTypeDescription), "DHCP");
    EXPECT_EQ(test::number(endpoint, &Endpoint::getProtocolIFType), 1);
}

TEST_F(DHCPProtocolEndpointTest, OptionsReceivedAreAppended) {
    setTree({host({dhcpInterface("eth0")})});
    const Endpoint endpoint;
    Numbers options;
    EXPECT_TRUE(endpoint.getOptionsReceived(options));
    EXPECT_TRUE(endpoint.getOptionsReceived(options));
    EXPECT_THAT(options, ElementsAre(8, 14, 17, 8, 14, 17));
}

struct StateCase {
    const char* name;
    Json properties;
    unsigned short requested;
    unsigned short enabled;  // 77: left as it was
    unsigned short client;
};

class EndpointStates : public test::TreeTest, public ::testing::WithParamInterface<StateCase> {};

TEST_P(EndpointStates, FollowFlagSourceAndInterfaceState) {
    setTree({host({interface("eth0", GetParam().properties)})});
    const Endpoint endpoint;
    EXPECT_EQ(test::number(endpoint, &Endpoint::getRequestedState), GetParam().requested);
    EXPECT_EQ(test::number(endpoint, &Endpoint::getEnabledState), GetParam().enabled);
    EXPECT_EQ(test::number(endpoint, &Endpoint::getClientState), GetParam().client);
}

INSTANTIATE_TEST_SUITE_P(
    All, EndpointStates,
    ::testing::Values(
        StateCase{
            "Bound", {{"DHCPEnabled", true}, {"AddressSource", 1}, {"InterfaceState", 1}}, 2, 2, 8},
        StateCase{"InterfaceDown",
                  {{"DHCPEnabled", true}, {"AddressSource", 1}, {"InterfaceState", 0}},
                  2,
                  3,
                  0},
        StateCase{"InterfaceStateOfAnotherKind",
                  {{"DHCPEnabled", true}, {"AddressSource", 1}, {"InterfaceState", 6}},
                  2,
                  3,
                  0},
        StateCase{"UnreadableInterfaceStateWritesNothing",
                  {{"DHCPEnabled", true}, {"AddressSource", 1}},
                  2,
                  77,
                  77},
        StateCase{"StaticAddress",
                  {{"DHCPEnabled", true}, {"AddressSource", 3}, {"InterfaceState", 1}},
                  2,
                  3,
                  0},
        StateCase{
            "UnreadableSourceIsNotDHCP", {{"DHCPEnabled", true}, {"InterfaceState", 1}}, 2, 3, 0},
        StateCase{"NoDHCP",
                  {{"DHCPEnabled", false}, {"AddressSource", 1}, {"InterfaceState", 1}},
                  3,
                  2,
                  8},
        StateCase{"UnreadableFlag", {{"AddressSource", 1}, {"InterfaceState", 1}}, 3, 2, 8}),
    [](const auto& parameter) { return parameter.param.name; });

TEST_F(DHCPProtocolEndpointTest, UnsupportedPropertiesAnswerFalseAndWriteNothing) {
    setTree({host({dhcpInterface("eth0")})});
    const Endpoint endpoint;
    for (const auto getter : {&Endpoint::getCaption, &Endpoint::getInstallDate,
                              &Endpoint::getOtherEnabledState, &Endpoint::getTimeOfLastStateChange,
                              &Endpoint::getLeaseObtained, &Endpoint::getLeaseExpires}) {
        EXPECT_EQ(text(endpoint, getter), std::nullopt);
    }
    for (const auto getter :
         {&Endpoint::getHealthState, &Endpoint::getPrimaryStatus, &Endpoint::getDetailedStatus,
          &Endpoint::getOperatingStatus, &Endpoint::getCommunicationStatus,
          &Endpoint::getEnabledDefault, &Endpoint::getTransitioningToState}) {
        EXPECT_EQ(test::number(endpoint, getter), std::nullopt);
    }
    for (const auto getter :
         {&Endpoint::getRenewalTime, &Endpoint::getRebindingTime, &Endpoint::getLeaseTime}) {
        EXPECT_EQ(test::number(endpoint, getter), std::nullopt);
    }
    for (const auto getter :
         {&Endpoint::getAvailableRequestedStates, &Endpoint::getOperationalStatus}) {
        Numbers value;
        EXPECT_FALSE((endpoint.*getter)(value));
        EXPECT_THAT(value, IsEmpty());
    }
    std::vector<std::string> descriptions;
    EXPECT_FALSE(endpoint.getStatusDescriptions(descriptions));
    EXPECT_THAT(descriptions, IsEmpty());
    bool broadcast = true;
    EXPECT_FALSE(endpoint.getBroadcastResetSupported(broadcast));
    EXPECT_TRUE(broadcast);
}

TEST_F(DHCPProtocolEndpointTest, SetFilterTracesItsParametersAtEntryAndExit) {
    setTree({host({dhcpInterface("eth0")})});
    Endpoint endpoint;
    const LogCapture capture;
    endpoint.setFilter(Endpoint::FilterByName, "eth0");
    for (const auto& records : {capture.log(), capture.trace()}) {
        ASSERT_GE(records.size(), 2U);
        EXPECT_EQ(records.front().level, 3000);
        EXPECT_EQ(records.front().function, "setFilter");
        EXPECT_THAT(
            records.front().message,
            MatchesRegex("ENTERING: setFilter\\(\\) in Lindows/DHCPProtocolEndpoint \\[Line: "
                         "[0-9]+\\],Parameters List:  filterType=0x[0-9a-f]+ "
                         "reference=eth0"));
        EXPECT_EQ(records.back().level, 3000);
        EXPECT_THAT(
            records.back().message,
            MatchesRegex("EXITING: setFilter\\(\\) in Lindows/DHCPProtocolEndpoint \\[Line: "
                         "[0-9]+\\],Parameters List:  filterType=0x[0-9a-f]+ "
                         "reference=eth0"));
    }
}

TEST_F(DHCPProtocolEndpointTest, EvaluateTracesWhatItCompares) {
    setTree({serviceProcessor({dhcpInterface("bmc0")})});
    Endpoint endpoint;
    endpoint.setFilter(Endpoint::FilterBySystemName, "BMC:-1");
    endpoint.setFilter(Endpoint::FilterByName, "bmc0");
    const LogCapture capture;
    EXPECT_TRUE(endpoint.evaluate());
    EXPECT_THAT(test::variables(capture.log()),
                ElementsAre("nodeString=BMC", "actualOutput=BMC:-1", "iterator->reference=BMC:-1",
                            "actualOutput=bmc0", "iterator->reference=bmc0"));
    EXPECT_EQ(test::variables(capture.trace()), test::variables(capture.log()));
}

TEST_F(DHCPProtocolEndpointTest, SystemGettersTraceTheDescriptionThatDecides) {
    setTree({host({dhcpInterface("eth0")})});
    const Endpoint endpoint;
    const LogCapture capture;
    text(endpoint, &Endpoint::getSystemName);
    text(endpoint, &Endpoint::getSystemCreationClassName);
    EXPECT_THAT(test::variables(capture.log()),
                ElementsAre("nodeString=Computer", "nodeString=Computer"));
}

TEST_F(DHCPProtocolEndpointTest, EveryOperationTracesItsEntryAndItsExit) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")})});
    const LogCapture capture;
    {
        Endpoint endpoint;
        EXPECT_TRUE(static_cast<bool>(endpoint));
        ++endpoint;
        EXPECT_TRUE(endpoint.evaluate());
    }
    std::vector<std::string> lines;
    for (const auto& record : capture.log()) {
        EXPECT_EQ(record.level, 4000);
        EXPECT_EQ(record.file, "Lindows/DHCPProtocolEndpoint");
        lines.push_back(record.message.substr(0, record.message.find(" in ")));
    }
    EXPECT_THAT(lines, ElementsAre("ENTERING: DHCPProtocolEndpoint()",   //
                                   "EXITING: DHCPProtocolEndpoint()",    //
                                   "ENTERING: operator bool()",          //
                                   "EXITING: operator bool()",           //
                                   "ENTERING: operator++()",             //
                                   "EXITING: operator++()",              //
                                   "ENTERING: evaluate()",               //
                                   "EXITING: evaluate()",                //
                                   "ENTERING: ~DHCPProtocolEndpoint()",  //
                                   "EXITING: ~DHCPProtocolEndpoint()"));
}

TEST_F(DHCPProtocolEndpointTest, WalkCostsGrowWithTheInterfacesAlone) {
    test::expectLinearWalk(1, 0, [](unsigned interfaces) {
        Endpoint endpoint;
        EXPECT_EQ(walk(endpoint).size(), interfaces);
    });
    // The interface, and the two nodes above it.
    test::expectLinearWalk(3, 0, [](unsigned interfaces) {
        Endpoint endpoint;
        EXPECT_EQ(test::walk(endpoint, &Endpoint::getSystemName).size(), interfaces);
    });
    test::expectLinearWalk(3, 1, [](unsigned interfaces) {
        Endpoint endpoint;
        endpoint.setFilter(Endpoint::FilterBySystemName, hostName());
        EXPECT_EQ(walk(endpoint).size(), interfaces);
    });
    test::expectLinearWalk(1, 1, [](unsigned interfaces) {
        Endpoint endpoint;
        endpoint.setFilter(Endpoint::FilterByName, "eth" + std::to_string(interfaces - 1));
        EXPECT_EQ(walk(endpoint).size(), 1U);
    });
}

TEST_F(DHCPProtocolEndpointTest, WithoutAFilterStepsCompareNothing) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")})});
    test::expectStepsToCompareNothing<Endpoint>();
}

}  // namespace
