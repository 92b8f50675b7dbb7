#include "Lindows/AssociationRecord.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <string>
#include <string_view>
#include <vector>

#include "Builders.h"
#include "Elements.h"
#include "Lindows/DHCPProtocolEndpoint.h"
#include "kit/Tree.h"

namespace {

using test::LogCapture;
using ::testing::ElementsAre;
using ZR::Instrumentation;
using ZR::Moniker;
using ZR::TracePoint;
using ZR::TraceSource;
using ZR::DHCPClientProvider::DHCPProtocolEndpoint;
using ZR::DHCPClientProvider::findKey;
using ZR::DHCPClientProvider::findKeys;
using ZR::DHCPClientProvider::requireKey;
using ZR::DHCPClientProvider::visitKeys;

const std::string logger = ZR::loggerCategory;
const TraceSource source{"Lindows/AssociationRecordTest", logger};

class AssociationRecordTest : public test::TreeTest {
  protected:
    Moniker moniker_ = test::monikerOf({{"Name", "a"}, {"name", "b"}, {"Name", "c"}, {"Key", ""}});
};

TEST_F(AssociationRecordTest, KeysAreVisitedInTheirOrderUntilTheVisitorHasEnough) {
    std::vector<std::string> seen;
    const auto visit = [&](std::size_t enough) {
        seen.clear();
        visitKeys(moniker_, [&](std::size_t position, const std::string& name) {
            std::string value;
            EXPECT_TRUE(moniker_.getValue(value));
            seen.push_back(std::to_string(position) + name + '=' + value);
            return seen.size() == enough;
        });
    };
    visit(0);
    EXPECT_THAT(seen, ElementsAre("0Name=a", "1name=b", "2Name=c", "3Key="));
    visit(2);
    EXPECT_THAT(seen, ElementsAre("0Name=a", "1name=b"));
}

TEST_F(AssociationRecordTest, FirstOfEqualKeysIsFoundAndTracedAlone) {
    const LogCapture log;
    EXPECT_EQ(findKey(moniker_, "Name", ZR_HERE), "a");
    EXPECT_EQ(findKey(moniker_, "Key", ZR_HERE), "") << "there, and empty";
    EXPECT_EQ(findKey(moniker_, "key", ZR_HERE), std::nullopt);
    EXPECT_THAT(test::variables(log.log()), ElementsAre("Name=a", "Key="));
}

TEST_F(AssociationRecordTest, LastOfEqualKeysCountsWhereSeveralAreFoundAndEachIsTracedInItsPlace) {
    const LogCapture log;
    constexpr std::array<std::string_view, 3> names{"Key", "NAME", "Name"};
    EXPECT_THAT(findKeys(moniker_, names, ZR_HERE), ElementsAre("", std::nullopt, "c"));
    EXPECT_THAT(test::variables(log.log()), ElementsAre("Name=a", "Name=c", "Key="));
}

TEST_F(AssociationRecordTest, RequiredKeyThatIsMissingIsThrownWithTheMessage) {
    EXPECT_EQ(requireKey(moniker_, "Name", "no name", ZR_HERE), "a");
    try {
        requireKey(moniker_, "InstanceID", "no id", ZR_HERE);
        FAIL() << "it is missing";
    } catch (const ZR::FrameworkException& exception) {
        EXPECT_STREQ(exception.what(), "no id");
    }
}

TEST_F(AssociationRecordTest, WalksEndAtTheFirstMatchOrRunOut) {
    setTree({test::host({test::staticInterface("eth0"), test::dhcpInterface("eth1")})});
    const auto hasName = [](const char* wanted) {
        return [wanted](const Instrumentation& node) {
            std::string name;
            return node.getProperty(ZR::NodeLexicon::Properties::Name, name) && name == wanted;
        };
    };
    constexpr auto interfaces = ZR::NodeLexicon::NodeType::NetworkInterface;
    using ZR::DHCPClientProvider::walkTo;
    Instrumentation cursor;
    EXPECT_TRUE(walkTo(cursor, interfaces, hasName("eth1")));
    EXPECT_TRUE(walkTo(cursor, interfaces, hasName("eth0"))) << "from the first node again";
    EXPECT_FALSE(walkTo(cursor, interfaces, hasName("eth9")));
    EXPECT_FALSE(cursor);
    DHCPProtocolEndpoint endpoint;
    EXPECT_FALSE(walkTo(endpoint, [](const auto& element) {
        return has(element, &DHCPProtocolEndpoint::getName, "eth0");
    })) << "it has no DHCP";
}

TEST_F(AssociationRecordTest, InterfaceOfAnAccessPointIsWhatStandsBeforeTheLastUnderscore) {
    using ZR::DHCPClientProvider::interfaceOfAccessPoint;
    EXPECT_EQ(interfaceOfAccessPoint("eth0_IPv4", ZR_HERE), "eth0");
    EXPECT_EQ(interfaceOfAccessPoint("my_nic_2", ZR_HERE), "my_nic");
    EXPECT_EQ(interfaceOfAccessPoint("_", ZR_HERE), "");
    EXPECT_THROW(interfaceOfAccessPoint("eth0", ZR_HERE), ZR::FrameworkException);
    EXPECT_THROW(interfaceOfAccessPoint("", ZR_HERE), ZR::FrameworkException);
}

}  // namespace
