#include "Lindows/DHCPRemoteHostedAccessPoint.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "Builders.h"
#include "kit/Tree.h"

namespace {

using test::build;
using test::computer;
using test::dhcpInterface;
using test::fails;
using test::host;
using ::testing::ElementsAre;
using ::testing::Pair;
using ZR::DHCPClientProvider::DHCPRemoteHostedAccessPoint;

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

}  // namespace
