#include "Lindows/DHCPCapabilities.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <optional>

#include "Elements.h"
#include "kit/Tree.h"

namespace {

using test::dhcpInterface;
using test::host;
using test::interface;
using test::Json;
using test::LogCapture;
using test::Numbers;
using test::serviceProcessor;
using test::staticInterface;
using test::text;
using Capabilities = ZR::DHCPClientProvider::DHCPCapabilities;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::MatchesRegex;

class DHCPCapabilitiesTest : public test::TreeTest {
  protected:
    static std::vector<std::string> walk(Capabilities& capabilities) {
        return test::walk(capabilities, &Capabilities::getInstanceID);
    }

    static Json withNameMaxLength(Json length) {
        return interface("eth0", {{"DHCPEnabled", true}, {"NameMaxLength", std::move(length)}});
    }
};

TEST_F(DHCPCapabilitiesTest, NoInterfaceNodesGiveNoRecords) {
    setTree({host({})});
    Capabilities capabilities;
    EXPECT_FALSE(capabilities.isOnRecord());
    EXPECT_FALSE(capabilities);
}

TEST_F(DHCPCapabilitiesTest, WalksTheDHCPInterfacesAlone) {
    setTree({host({staticInterface("eth0"), dhcpInterface("eth1"), interface("eth2"),
                   interface("eth3", {{"DHCPEnabled", 1}}), dhcpInterface("eth4")}),
             serviceProcessor({dhcpInterface("bmc0")})});
    Capabilities capabilities;
    EXPECT_THAT(walk(capabilities), ElementsAre("eth1", "eth4", "bmc0"));
}

TEST_F(DHCPCapabilitiesTest, StandsOnARecordWithoutRegardToTheDHCPFlag) {
    setTree({host({staticInterface("eth0")})});
    Capabilities capabilities;
    EXPECT_TRUE(capabilities.isOnRecord());
    EXPECT_FALSE(capabilities);
    EXPECT_FALSE(capabilities.isOnRecord());
}

TEST_F(DHCPCapabilitiesTest, InstanceIDIsTheBareInterfaceName) {
    setTree({host({dhcpInterface("eth0")}), serviceProcessor({dhcpInterface("bmc0")})});
    Capabilities capabilities;
    EXPECT_EQ(text(capabilities, &Capabilities::getInstanceID), "eth0");
    EXPECT_EQ(text(capabilities, &Capabilities::getElementName), "eth0");
    ++capabilities;
    EXPECT_EQ(text(capabilities, &Capabilities::getInstanceID), "bmc0");
}

TEST_F(DHCPCapabilitiesTest, UnreadableNameSucceedsWithoutAnOutput) {
    setTree({host({test::namelessInterface({{"DHCPEnabled", true}})})});
    const Capabilities capabilities;
    EXPECT_EQ(text(capabilities, &Capabilities::getInstanceID), test::untouched);
    EXPECT_EQ(text(capabilities, &Capabilities::getElementName), test::untouched);
}

TEST_F(DHCPCapabilitiesTest, FilterSelectsTheOneInterface) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1"), dhcpInterface("eth11"),
                   dhcpInterface("ETH1")})});
    Capabilities capabilities;
    capabilities.setFilter(Capabilities::FilterByInstanceID, "eth1");
    EXPECT_THAT(walk(capabilities), ElementsAre("eth1"));
}

TEST_F(DHCPCapabilitiesTest, FilteredStepsPassOverInterfacesOfOtherNames) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1"), dhcpInterface("eth2")}),
             serviceProcessor({dhcpInterface("eth0"), dhcpInterface("eth1")})});
    Capabilities capabilities;
    capabilities.setFilter(Capabilities::FilterByInstanceID, "eth1");
    EXPECT_THAT(walk(capabilities), ElementsAre("eth1", "eth1"));
}

TEST_F(DHCPCapabilitiesTest, FilterThatMatchesNothingLeavesTheCursorPastTheEnd) {
    setTree({host({dhcpInterface("eth0")})});
    Capabilities capabilities;
    capabilities.setFilter(Capabilities::FilterByInstanceID, "Computer%eth0");
    EXPECT_FALSE(capabilities.isOnRecord());
    EXPECT_FALSE(capabilities);
}

TEST_F(DHCPCapabilitiesTest, FilterOnANonDHCPInterfaceYieldsTheNextDHCPInterface) {
    setTree({host({staticInterface("eth0"), dhcpInterface("eth1"), dhcpInterface("eth2")})});
    Capabilities capabilities;
    capabilities.setFilter(Capabilities::FilterByInstanceID, "eth0");
    EXPECT_EQ(text(capabilities, &Capabilities::getInstanceID), "eth0");
    EXPECT_THAT(walk(capabilities), ElementsAre("eth1"));
}

TEST_F(DHCPCapabilitiesTest, SetFilterSearchesOnlyTheRemainingInterfaces) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1"), dhcpInterface("eth2")})});
    Capabilities behind;
    ++behind;
    behind.setFilter(Capabilities::FilterByInstanceID, "eth0");
    EXPECT_FALSE(behind);

    Capabilities ahead;
    ++ahead;
    ahead.setFilter(Capabilities::FilterByInstanceID, "eth2");
    EXPECT_THAT(walk(ahead), ElementsAre("eth2"));
}

TEST_F(DHCPCapabilitiesTest, FiltersAddUp) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")})});
    Capabilities capabilities;
    capabilities.setFilter(Capabilities::FilterByInstanceID, "eth0");
    EXPECT_TRUE(capabilities.evaluate());
    capabilities.setFilter(Capabilities::FilterByInstanceID, "eth1");
    EXPECT_FALSE(capabilities);
}

TEST_F(DHCPCapabilitiesTest, OtherFilterTypesNeverReject) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")})});
    Capabilities capabilities;
    capabilities.setFilter(static_cast<Capabilities::FilterType>(1), "nothing");
    EXPECT_THAT(walk(capabilities), ElementsAre("eth0", "eth1"));
}

TEST_F(DHCPCapabilitiesTest, OptionsSupportedAreAppended) {
    setTree({host({dhcpInterface("eth0")})});
    const Capabilities capabilities;
    Numbers options{1};
    EXPECT_TRUE(capabilities.getOptionsSupported(options));
    EXPECT_TRUE(capabilities.getOptionsSupported(options));
    EXPECT_THAT(options, ElementsAre(1, 8, 14, 17, 8, 14, 17));
}

TEST_F(DHCPCapabilitiesTest, MaxElementNameLenIsTheLow16BitsOfTheLength) {
    setTree({host({withNameMaxLength(15)})});
    EXPECT_EQ(test::number(Capabilities(), &Capabilities::getMaxElementNameLen), 15);
    setTree({host({withNameMaxLength(0x12345)})});
    EXPECT_EQ(test::number(Capabilities(), &Capabilities::getMaxElementNameLen), 0x2345);
}

TEST_F(DHCPCapabilitiesTest, UnreadableMaxElementNameLenFailsAndWritesNothing) {
    setTree({host({interface("eth0")})});
    EXPECT_EQ(test::number(Capabilities(), &Capabilities::getMaxElementNameLen), std::nullopt);
    setTree({host({withNameMaxLength("15")})});
    EXPECT_EQ(test::number(Capabilities(), &Capabilities::getMaxElementNameLen), std::nullopt);
}

TEST_F(DHCPCapabilitiesTest, NameIsEditableUnlessItIsReadOnly) {
    Json readOnly = dhcpInterface("eth0");
    readOnly["readOnly"] = {"Name"};
    Json otherReadOnly = dhcpInterface("eth1");
    otherReadOnly["readOnly"] = {"NameMaxLength"};
    setTree({host({readOnly, otherReadOnly})});
    Capabilities capabilities;
    bool editable = true;
    EXPECT_TRUE(capabilities.getElementNameEditSupported(editable));
    EXPECT_FALSE(editable);
    ++capabilities;
    EXPECT_TRUE(capabilities.getElementNameEditSupported(editable));
    EXPECT_TRUE(editable);
}

TEST_F(DHCPCapabilitiesTest, NameThatTheNodeLacksTellsNotWhetherItIsEditable) {
    setTree({host({test::namelessInterface({{"DHCPEnabled", true}})})});
    const Capabilities capabilities;
    for (const bool before : {false, true}) {
        bool editable = before;
        EXPECT_FALSE(capabilities.getElementNameEditSupported(editable));
        EXPECT_EQ(editable, before);
    }
}

TEST_F(DHCPCapabilitiesTest, UnsupportedPropertiesAnswerFalseAndWriteNothing) {
    setTree({host({dhcpInterface("eth0")})});
    const Capabilities capabilities;
    for (const auto getter :
         {&Capabilities::getRequestedStatesSupported, &Capabilities::getStateAwareness}) {
        Numbers values;
        EXPECT_FALSE((capabilities.*getter)(values));
        EXPECT_THAT(values, IsEmpty());
    }
    EXPECT_EQ(text(capabilities, &Capabilities::getElementNameMask), std::nullopt);
}

TEST_F(DHCPCapabilitiesTest, SetFilterTracesItsParametersAndWhatIsCompared) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")})});
    Capabilities capabilities;
    const LogCapture capture;
    capabilities.setFilter(Capabilities::FilterByInstanceID, "eth1");
    const auto records = capture.log();
    ASSERT_GE(records.size(), 2U);
    EXPECT_EQ(records.front().level, 3000);
    EXPECT_THAT(records.front().message,
                MatchesRegex("ENTERING: setFilter\\(\\) in Lindows/DHCPCapabilities \\[Line: "
                             "[0-9]+\\],Parameters List:  filterType=0x[0-9a-f]+ reference=eth1"));
    EXPECT_THAT(records.back().message,
                MatchesRegex("EXITING: setFilter\\(\\) in Lindows/DHCPCapabilities \\[Line: "
                             "[0-9]+\\],Parameters List:  filterType=0x[0-9a-f]+ reference=eth1"));
    EXPECT_THAT(test::variables(records),
                ElementsAre("actualOutput=eth0", "iterator->reference=eth1", "actualOutput=eth1",
                            "iterator->reference=eth1"));
    EXPECT_EQ(test::variables(capture.trace()), test::variables(records));
}

TEST_F(DHCPCapabilitiesTest, WalkCostsGrowWithTheInterfacesAlone) {
    test::expectLinearWalk(1, 0, [](unsigned interfaces) {
        Capabilities capabilities;
        EXPECT_EQ(walk(capabilities).size(), interfaces);
    });
    test::expectLinearWalk(1, 0, [](unsigned interfaces) {
        Capabilities capabilities;
        capabilities.setFilter(Capabilities::FilterByInstanceID,
                               "eth" + std::to_string(interfaces - 1));
        EXPECT_EQ(walk(capabilities).size(), 1U);
    });
}

TEST_F(DHCPCapabilitiesTest, WithoutAFilterStepsCompareNothing) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")})});
    test::expectStepsToCompareNothing<Capabilities>();
}

}  // namespace
