#include "Lindows/DHCPRemoteAccessAvailableToElement.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "Builders.h"
#include "Elements.h"
#include "kit/Tree.h"

namespace {

using test::build;
using test::dhcpInterface;
using test::fails;
using test::host;
using test::staticInterface;
using ::testing::ElementsAre;
using ::testing::Pair;
using ZR::DHCPClientProvider::DHCPRemoteAccessAvailableToElement;

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

}  // namespace
