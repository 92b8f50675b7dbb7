#include "Lindows/DHCPElementSettingData.h"

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
using test::staticInterface;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::Pair;
using ZR::DHCPClientProvider::DHCPElementSettingData;

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

}  // namespace
