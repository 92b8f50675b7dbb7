#include "Lindows/AssociationRecord.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "Builders.h"
#include "Lindows/DHCPProtocolEndpoint.h"
#include "kit/LogCapture.h"
#include "kit/Tree.h"

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ZR::Instrumentation;
using ZR::Moniker;
using ZR::TracePoint;
using ZR::TraceSource;
using ZR::DHCPClientProvider::DHCPProtocolEndpoint;
using ZR::DHCPClientProvider::Occurrence;
using ZR::DHCPClientProvider::requireKey;

const std::string logger = ZR::loggerCategory;
const TraceSource source{"Lindows/AssociationRecordTest", logger};

class AssociationRecordTest : public test::TreeTest {
  protected:
    Moniker moniker_ = test::monikerOf({{"Name", "a"}, {"name", "b"}, {"Name", "c"}, {"Key", ""}});
};

TEST_F(AssociationRecordTest, KeysAreVisitedInTheirOrderUntilTheVisitorHasEnough) {
    std::vector<std::string> seen;
    const auto visit = [&](bool enough) {
        seen.clear();
        ZR::DHCPClientProvider::visitKeys(moniker_, "Name",
                                          [&](std::size_t position, const std::string& value) {
                                              seen.push_back(std::to_string(position) + value);
                                              return enough;
                                          });
    };
    visit(false);
    EXPECT_THAT(seen, ElementsAre("0a", "2c"));
    visit(true);
    EXPECT_THAT(seen, ElementsAre("0a"));
}

TEST_F(AssociationRecordTest, FirstOrLastOfEqualKeysIsFoundAndEveryOneReadIsTraced) {
    const ZR::Testing::LogCapture log;
    EXPECT_EQ(findKey(moniker_, "Name", Occurrence::first, ZR_HERE), "a");
    EXPECT_EQ(log.log().size(), 1U);
    EXPECT_EQ(findKey(moniker_, "Name", Occurrence::last, ZR_HERE), "c");
    EXPECT_EQ(log.log().size(), 3U);
    EXPECT_EQ(findKey(moniker_, "Key", Occurrence::first, ZR_HERE), "") << "there, and empty";
    EXPECT_EQ(findKey(moniker_, "key", Occurrence::first, ZR_HERE), std::nullopt);
    EXPECT_EQ(log.log().size(), 4U);
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
