#include "Lindows/DHCPRemoteServiceAccessPoint.h"

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
using test::serviceProcessor;
using test::text;
using AccessPoint = ZR::DHCPClientProvider::DHCPRemoteServiceAccessPoint;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::MatchesRegex;

class DHCPRemoteServiceAccessPointTest : public test::TreeTest {
  protected:
    /// "NAME ADDRESS" of each record.
    static std::vector<std::string> walk(AccessPoint& point) {
        std::vector<std::string> records;
        for (; point; ++point) {
            records.push_back(text(point, &AccessPoint::getName).value_or("(false)") + " " +
                              text(point, &AccessPoint::getAccessInfo).value_or("(false)"));
        }
        return records;
    }

    /// Whether the filters, set in their order, leave the cursor on the one interface.
    static bool stands(const std::vector<AccessPoint::Filter>& filters) {
        AccessPoint point;
        for (const AccessPoint::Filter& filter : filters) {
            point.setFilter(filter.type, filter.reference);
        }
        const bool onInterface =
            text(point, &AccessPoint::getSystemCreationClassName) == "QVXZR_SPComputerSystem";
        if (onInterface) {
            EXPECT_TRUE(point.evaluate()) << "an evaluation leaves nothing for the next one";
            EXPECT_TRUE(point.evaluate());
        }
        return onInterface;
    }
    static bool acceptsNode(const Json& interface,
                            const std::vector<AccessPoint::Filter>& filters) {
        setTree({serviceProcessor({interface})});
        return stands(filters);
    }
    static bool accepts(const std::string& interfaceName,
                        const std::vector<AccessPoint::Filter>& filters) {
        return acceptsNode(dhcpInterface(interfaceName, {"192.0.2.1"}), filters);
    }
};

TEST_F(DHCPRemoteServiceAccessPointTest, NoInterfaceNodesGiveNoRecords) {
    setTree({host({})});
    AccessPoint point;
    EXPECT_FALSE(point.isOnRecord());
    EXPECT_FALSE(point);
    EXPECT_EQ(point.getOrderOfAccess(), 0U);
}

TEST_F(DHCPRemoteServiceAccessPointTest, NoServerAddressGivesNoRecords) {
    setTree({host({dhcpInterface("eth0", {}), interface("eth1"),
                   interface("eth2", {{"DHCPServerAddresses", "192.0.2.1"}}),
                   interface("eth3", {{"DHCPServerAddresses", Json::array({"192.0.2.1", 2})}})})});
    AccessPoint point;
    EXPECT_FALSE(point);
    EXPECT_EQ(text(point, &AccessPoint::getAccessInfo), std::nullopt);
}

TEST_F(DHCPRemoteServiceAccessPointTest, IPv4AndIPv6AddressesOfOneInterfaceAreTwoRecords) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1", "2001:db8::1"})})});
    AccessPoint point;
    ASSERT_TRUE(point);
    EXPECT_EQ(text(point, &AccessPoint::getName), "eth0_IPv4");
    EXPECT_EQ(text(point, &AccessPoint::getAccessInfo), "192.0.2.1");
    EXPECT_EQ(test::number(point, &AccessPoint::getInfoFormat), 3);
    EXPECT_EQ(point.getOrderOfAccess(), 2U);
    ++point;
    ASSERT_TRUE(point);
    EXPECT_EQ(text(point, &AccessPoint::getName), "eth0_IPv6");
    EXPECT_EQ(text(point, &AccessPoint::getAccessInfo), "2001:db8::1");
    EXPECT_EQ(test::number(point, &AccessPoint::getInfoFormat), 4);
    EXPECT_EQ(point.getOrderOfAccess(), 2U);
    ++point;
    EXPECT_FALSE(point);
}

TEST_F(DHCPRemoteServiceAccessPointTest, WalksAddressesWithinInterfacesInTheirOrder) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.9", "192.0.2.1"}), dhcpInterface("eth1"),
                   interface("eth2"), dhcpInterface("eth3", {"2001:db8::3"})}),
             serviceProcessor({dhcpInterface("bmc0", {"192.0.2.4"})})});
    AccessPoint point;
    EXPECT_THAT(walk(point), ElementsAre("eth0_IPv4 192.0.2.9", "eth0_IPv4 192.0.2.1",
                                         "eth3_IPv6 2001:db8::3", "bmc0_IPv4 192.0.2.4"));
}

TEST_F(DHCPRemoteServiceAccessPointTest, StartsOnTheFirstInterfaceWithAddresses) {
    setTree(
        {host({interface("eth0"), dhcpInterface("eth1"), dhcpInterface("eth2", {"192.0.2.2"})})});
    AccessPoint point;
    EXPECT_THAT(walk(point), ElementsAre("eth2_IPv4 192.0.2.2"));
}

TEST_F(DHCPRemoteServiceAccessPointTest, DHCPFlagDoesNotMatter) {
    setTree({host(
        {interface("eth0", {{"DHCPServerAddresses", {"192.0.2.1"}}}),
         interface("eth1", {{"DHCPEnabled", false}, {"DHCPServerAddresses", {"192.0.2.2"}}})})});
    AccessPoint point;
    EXPECT_THAT(walk(point), ElementsAre("eth0_IPv4 192.0.2.1", "eth1_IPv4 192.0.2.2"));
}

TEST_F(DHCPRemoteServiceAccessPointTest, EqualAddressesAreRecordsOfTheirOwn) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1", "192.0.2.1"})})});
    AccessPoint point;
    EXPECT_THAT(walk(point), ElementsAre("eth0_IPv4 192.0.2.1", "eth0_IPv4 192.0.2.1"));
}

TEST_F(DHCPRemoteServiceAccessPointTest, OrderOfAccessCountsTheAddressesOfTheInterface) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"}),
                   dhcpInterface("eth1", {"192.0.2.2", "192.0.2.3", "192.0.2.4"})})});
    AccessPoint point;
    std::vector<unsigned int> orders;
    for (; point; ++point) {
        orders.push_back(point.getOrderOfAccess());
    }
    EXPECT_THAT(orders, ElementsAre(1, 3, 3, 3));
}

TEST_F(DHCPRemoteServiceAccessPointTest, AfterTheLastAddressTheListIsEmpty) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})})});
    AccessPoint point;
    for (int step = 0; step < 3; ++step) {
        ++point;
        EXPECT_FALSE(point);
        EXPECT_FALSE(point.isOnRecord());
        EXPECT_EQ(point.getOrderOfAccess(), 0U);
        EXPECT_EQ(text(point, &AccessPoint::getAccessInfo), std::nullopt);
    }
}

TEST_F(DHCPRemoteServiceAccessPointTest, KeysOfAHostInterface) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})})});
    const AccessPoint point;
    EXPECT_EQ(text(point, &AccessPoint::getName), "eth0_IPv4");
    EXPECT_EQ(text(point, &AccessPoint::getSystemName), hostName());
    EXPECT_EQ(text(point, &AccessPoint::getCreationClassName),
              "QVXZR_DHCPRemoteServiceAccessPoint");
    EXPECT_EQ(text(point, &AccessPoint::getSystemCreationClassName), "QVXZR_ComputerSystem");
}

TEST_F(DHCPRemoteServiceAccessPointTest, ServiceProcessorInterfaceKeepsTheHostsSystemName) {
    setTree({serviceProcessor({dhcpInterface("bmc0", {"192.0.2.1"})})});
    const AccessPoint point;
    EXPECT_EQ(text(point, &AccessPoint::getSystemName), hostName());
    EXPECT_EQ(text(point, &AccessPoint::getSystemCreationClassName), "QVXZR_SPComputerSystem");
}

TEST_F(DHCPRemoteServiceAccessPointTest, ServiceProcessorDescriptionIsComparedExactly) {
    setTree({computer("bmc", "x", {dhcpInterface("eth0", {"192.0.2.1"})})});
    const AccessPoint point;
    EXPECT_EQ(text(point, &AccessPoint::getSystemCreationClassName), "QVXZR_ComputerSystem");
}

TEST_F(DHCPRemoteServiceAccessPointTest, UnreadableNameStillGetsItsSuffix) {
    setTree(
        {host({test::namelessInterface({{"DHCPServerAddresses", {"192.0.2.1", "2001:db8::1"}}})})});
    AccessPoint point;
    EXPECT_EQ(text(point, &AccessPoint::getName), std::string(test::untouched) + "_IPv4");
    ++point;
    EXPECT_EQ(text(point, &AccessPoint::getName), std::string(test::untouched) + "_IPv6");
}

TEST_F(DHCPRemoteServiceAccessPointTest, FixedAndUnsupportedProperties) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})})});
    const AccessPoint point;
    EXPECT_EQ(text(point, &AccessPoint::getElementName), "DHCP Server");
    EXPECT_EQ(test::number(point, &AccessPoint::getAccessContext), 7);
    EXPECT_EQ(text(point, &AccessPoint::getOtherAccessContext), std::nullopt);
}

TEST_F(DHCPRemoteServiceAccessPointTest, SystemNameFailsWithAFailureLineWhenItCannotBeHad) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})})});
    const AccessPoint point;
    const ZR::Testing::HostNameFails failing;
    const LogCapture capture(6000, 6000);
    EXPECT_EQ(text(point, &AccessPoint::getSystemName), std::nullopt);
    for (const auto& records : {capture.log(), capture.trace()}) {
        ASSERT_EQ(records.size(), 1U);
        EXPECT_EQ(records[0].level, 6000);
        EXPECT_EQ(records[0].function, "getSystemName");
        EXPECT_THAT(records[0].message,
                    MatchesRegex("MESSAGE \\[File: Lindows/DHCPRemoteServiceAccessPoint, Line: "
                                 "[0-9]+\\]: gethostname Failed"));
    }
}

TEST_F(DHCPRemoteServiceAccessPointTest, SystemNameFilterComparesWithTheNameThatThePlatformKnows) {
    EXPECT_TRUE(accepts("eth0", {{AccessPoint::FilterBySystemName, hostName()}}));
    EXPECT_FALSE(accepts("eth0", {{AccessPoint::FilterBySystemName, hostName() + "x"}}));
    EXPECT_FALSE(accepts("eth0", {{AccessPoint::FilterBySystemName, ""}}));
    // The platform's name is then empty, while the record has none at all.
    const ZR::Testing::HostNameFails failing;
    EXPECT_TRUE(stands({{AccessPoint::FilterBySystemName, ""}}));
    EXPECT_FALSE(stands({{AccessPoint::FilterBySystemName, "some computer"}}));
}

TEST_F(DHCPRemoteServiceAccessPointTest, SystemNameFilterKnowsNoServiceProcessor) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})}),
             serviceProcessor({dhcpInterface("bmc0", {"192.0.2.2"})})});
    AccessPoint ofHost;
    ofHost.setFilter(AccessPoint::FilterBySystemName, hostName());
    EXPECT_THAT(walk(ofHost), ElementsAre("eth0_IPv4 192.0.2.1", "bmc0_IPv4 192.0.2.2"));
    EXPECT_FALSE(accepts("bmc0", {{AccessPoint::FilterBySystemName, "BMC:-1"}}));
}

TEST_F(DHCPRemoteServiceAccessPointTest, NameFilterHoldsForEveryNameWithoutAnUnderscore) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"}), dhcpInterface("eth1", {"192.0.2.2"})})});
    AccessPoint point;
    point.setFilter(AccessPoint::FilterByName, "eth1_IPv4");
    EXPECT_THAT(walk(point), ElementsAre("eth0_IPv4 192.0.2.1", "eth1_IPv4 192.0.2.2"));
}

TEST_F(DHCPRemoteServiceAccessPointTest, NameFilterWithoutAnUnderscoreHolds) {
    EXPECT_TRUE(accepts("br_lan", {{AccessPoint::FilterByName, "br"}}));
    EXPECT_TRUE(accepts("br_lan", {{AccessPoint::FilterByName, ""}}));
}

TEST_F(DHCPRemoteServiceAccessPointTest, NameFilterHoldsForAnUnreadableName) {
    EXPECT_TRUE(acceptsNode(test::namelessInterface({{"DHCPServerAddresses", {"192.0.2.1"}}}),
                            {{AccessPoint::FilterByName, "br_lan_IPv4"}}));
}

TEST_F(DHCPRemoteServiceAccessPointTest, NameFilterAloneComparesWithAnEmptyText) {
    EXPECT_FALSE(accepts("br_lan", {{AccessPoint::FilterByName, "br_lan_IPv4"}}));
    EXPECT_FALSE(accepts("br_lan", {{AccessPoint::FilterByName, "br_IPv4"}}));
    EXPECT_TRUE(accepts("br_lan", {{AccessPoint::FilterByName, "_IPv4"}}));
}

TEST_F(DHCPRemoteServiceAccessPointTest, NameFilterBehindASystemNameFilterComparesWithItsStart) {
    const AccessPoint::Filter system{AccessPoint::FilterBySystemName, hostName()};
    // As many characters as stand before the interface name's last "_", here one.
    ASSERT_GE(hostName().size(), 2U);
    const std::string start = hostName().substr(0, 1);
    const auto name = [](const std::string& reference) {
        return AccessPoint::Filter{AccessPoint::FilterByName, reference};
    };
    EXPECT_TRUE(accepts("b_lan", {system, name(start + "_IPv4")}));
    EXPECT_FALSE(accepts("b_lan", {system, name(hostName() + "_IPv4")}));
    EXPECT_FALSE(accepts("b_lan", {system, name(hostName().substr(0, 2) + "_IPv4")}));
    EXPECT_FALSE(accepts("b_lan", {system, name("_IPv4")}));
    EXPECT_TRUE(accepts("b_", {system, name(start + "_")}));
    // The last "_" of either counts.
    EXPECT_TRUE(accepts("b__lan", {system, name(hostName().substr(0, 2) + "_IPv4")}));
    EXPECT_FALSE(accepts("b_lan", {system, name(start + "__IPv4")}));
    // An interface name longer than the system's takes all of it.
    const std::string longName = std::string(hostName().size() + 1, 'x') + "_lan";
    EXPECT_TRUE(accepts(longName, {system, name(hostName() + "_IPv4")}));
    // In the other order the text is still empty when the name is compared, every time.
    EXPECT_FALSE(accepts("b_lan", {name(start + "_IPv4"), system}));
    EXPECT_TRUE(accepts("b_lan", {name("_IPv4"), system}));
}

TEST_F(DHCPRemoteServiceAccessPointTest, OtherFilterTypesNeverReject) {
    EXPECT_TRUE(accepts("br_lan", {{static_cast<AccessPoint::FilterType>(2), "nothing_at all"}}));
    EXPECT_TRUE(AccessPoint().evaluate());
}

TEST_F(DHCPRemoteServiceAccessPointTest, KeepsAddressListAcrossSetFilter) {
    setTree({host({dhcpInterface("br_lan", {"192.0.2.1", "2001:db8::1"}),
                   dhcpInterface("eth1", {"192.0.2.2"}), dhcpInterface("eth2", {"192.0.2.3"})})});
    AccessPoint point;
    point.setFilter(AccessPoint::FilterByName, "eth1_IPv4");
    EXPECT_EQ(point.getOrderOfAccess(), 2U);
    // The first interface's addresses under the second one's name, and the second
    // one's own addresses never.
    EXPECT_THAT(walk(point),
                ElementsAre("eth1_IPv4 192.0.2.1", "eth1_IPv6 2001:db8::1", "eth2_IPv4 192.0.2.3"));
}

TEST_F(DHCPRemoteServiceAccessPointTest, KeepsAddressIndexAcrossSetFilter) {
    setTree({host({dhcpInterface("br_lan", {"192.0.2.1", "2001:db8::1"}), interface("eth1")})});
    AccessPoint point;
    ++point;
    point.setFilter(AccessPoint::FilterByName, "eth1_IPv4");
    EXPECT_THAT(walk(point), ElementsAre("eth1_IPv6 2001:db8::1"));
}

TEST_F(DHCPRemoteServiceAccessPointTest, RecordsRemainWhenSetFilterFindsNoInterface) {
    setTree({host({dhcpInterface("br_lan", {"192.0.2.1", "192.0.2.2"})})});
    AccessPoint point;
    point.setFilter(AccessPoint::FilterByName, "eth1_IPv4");
    ASSERT_TRUE(point);
    EXPECT_EQ(text(point, &AccessPoint::getName), std::string(test::untouched) + "_IPv4");
    EXPECT_EQ(text(point, &AccessPoint::getAccessInfo), "192.0.2.1");
    ++point;
    EXPECT_TRUE(point);
    EXPECT_EQ(text(point, &AccessPoint::getAccessInfo), "192.0.2.2");
    ++point;
    EXPECT_FALSE(point);
}

TEST_F(DHCPRemoteServiceAccessPointTest, SetFilterSearchesOnlyTheRemainingInterfaces) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"}), dhcpInterface("br_lan", {"192.0.2.2"}),
                   dhcpInterface("br_wan", {"192.0.2.3"})})});
    AccessPoint point;
    ++point;
    point.setFilter(AccessPoint::FilterByName, "eth0_IPv4");
    ++point;
    EXPECT_FALSE(point);
}

TEST_F(DHCPRemoteServiceAccessPointTest, FilteredStepsPassOverAllAddressesOfARejectedInterface) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"}),
                   dhcpInterface("br_lan", {"192.0.2.2", "192.0.2.3"}),
                   dhcpInterface("eth1", {"192.0.2.4"}), dhcpInterface("br_wan", {"192.0.2.5"})})});
    AccessPoint point;
    point.setFilter(AccessPoint::FilterByName, "eth0_IPv4");
    EXPECT_THAT(walk(point), ElementsAre("eth0_IPv4 192.0.2.1", "eth1_IPv4 192.0.2.4"));
    EXPECT_EQ(point.getOrderOfAccess(), 0U);
}

TEST_F(DHCPRemoteServiceAccessPointTest, SetFilterTracesItsParametersAtEntryAndExit) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})})});
    AccessPoint point;
    const LogCapture capture;
    point.setFilter(AccessPoint::FilterByName, "eth0_IPv4");
    const auto records = capture.log();
    ASSERT_GE(records.size(), 2U);
    for (const auto& [record, word] :
         {std::pair{records.front(), "ENTERING"}, std::pair{records.back(), "EXITING"}}) {
        EXPECT_EQ(record.level, 3000);
        EXPECT_THAT(record.message,
                    MatchesRegex(std::string(word) +
                                 ": setFilter\\(\\) in Lindows/DHCPRemoteServiceAccessPoint "
                                 "\\[Line: [0-9]+\\],Parameters List:  filterType=0x[0-9a-f]+ "
                                 "reference=eth0_IPv4"));
    }
    EXPECT_THAT(test::variables(records), IsEmpty());
}

TEST_F(DHCPRemoteServiceAccessPointTest, TracesWhatIsComparedAndFound) {
    setTree({serviceProcessor({dhcpInterface("br_lan", {"192.0.2.1"})})});
    AccessPoint point;
    const std::string start = hostName().substr(0, 2);
    point.setFilter(AccessPoint::FilterBySystemName, hostName());
    point.setFilter(AccessPoint::FilterByName, start + "_IPv4");
    const LogCapture capture;
    EXPECT_TRUE(point.evaluate());
    text(point, &AccessPoint::getSystemCreationClassName);
    const auto variables = test::variables(capture.log());
    EXPECT_THAT(variables,
                ElementsAre("actualOutput=" + hostName(), "iterator->reference=" + hostName(),
                            "filterName=" + start, "actualName=" + start, "nodeString=BMC",
                            " systemCreationClassName==QVXZR_SPComputerSystem"));
    EXPECT_EQ(test::variables(capture.trace()), variables);
}

TEST_F(DHCPRemoteServiceAccessPointTest, WalkCostsGrowWithTheInterfacesAlone) {
    test::expectLinearWalk(1, 0, [](unsigned interfaces) {
        AccessPoint point;
        EXPECT_EQ(walk(point).size(), interfaces);
    });
    // The interface, and the two nodes above it.
    test::expectLinearWalk(3, 0, [](unsigned interfaces) {
        AccessPoint point;
        EXPECT_EQ(test::walk(point, &AccessPoint::getSystemCreationClassName).size(), interfaces);
    });
    test::expectLinearWalk(1, 0, [](unsigned interfaces) {
        AccessPoint point;
        point.setFilter(AccessPoint::FilterBySystemName, hostName());
        point.setFilter(AccessPoint::FilterByName, "eth0_IPv4");
        EXPECT_EQ(walk(point).size(), interfaces);
    });
}

TEST_F(DHCPRemoteServiceAccessPointTest, WithoutAFilterStepsCompareNothing) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1", "192.0.2.2"})})});
    test::expectStepsToCompareNothing<AccessPoint>();
}

}  // namespace
