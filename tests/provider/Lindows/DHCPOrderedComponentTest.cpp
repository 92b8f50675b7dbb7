#include "Lindows/DHCPOrderedComponent.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "Builders.h"
#include "kit/Tree.h"

namespace {

using test::build;
using test::dhcpInterface;
using test::fails;
using test::host;
using test::nameless;
using test::serviceProcessor;
using test::staticInterface;
using ::testing::ElementsAre;
using ::testing::Pair;
using ZR::DHCPClientProvider::DHCPOrderedComponent;

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

}  // namespace
