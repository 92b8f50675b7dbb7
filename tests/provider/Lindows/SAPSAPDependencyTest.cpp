#include "Lindows/SAPSAPDependency.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "Builders.h"
#include "Elements.h"
#include "kit/Tree.h"

namespace {

using namespace std::string_literals;
using test::build;
using test::dhcpInterface;
using test::fails;
using test::host;
using test::Keys;
using test::LogCapture;
using test::serviceProcessor;
using test::staticInterface;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Pair;
using ZR::DHCPClientProvider::SAPSAPDependency;

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
