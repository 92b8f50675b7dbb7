#include "Lindows/ElementCapabilities.h"

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
using test::dhcpInterface;
using test::fails;
using test::host;
using test::nameless;
using test::serviceProcessor;
using test::staticInterface;
using ::testing::ElementsAre;
using ::testing::Pair;
using ZR::DHCPClientProvider::ElementCapabilities;

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
