#include "Lindows/HostedAccessPoint.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "Builders.h"
#include "kit/LogCapture.h"
#include "kit/Tree.h"

namespace {

using test::build;
using test::computer;
using test::dhcpInterface;
using test::fails;
using test::host;
using test::Keys;
using test::serviceProcessor;
using ::testing::ElementsAre;
using ::testing::Pair;
using ZR::DHCPClientProvider::DHCPHostedAccessPoint;

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

}  // namespace
