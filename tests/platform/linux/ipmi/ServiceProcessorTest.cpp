#include "ipmi/ServiceProcessor.h"

#include <gtest/gtest.h>

#include "LinuxSupport.h"

namespace ZR::Live {
namespace {

using NodeLexicon::Properties;

std::shared_ptr<const Snapshot> treeOf(const ServiceProcessor& processor) {
    SnapshotBuilder builder;
    addServiceProcessor(processor, builder);
    return builder.build();
}

TEST(ServiceProcessor, IsAComputerWithANetworkAndAnInterface) {
    SnapshotBuilder expected;
    const auto computer = expected.add(Snapshot::none, "ComputerSystem", "BMC");
    expected.property(Properties::Name, "BMC:-1");
    const auto network = expected.add(computer, "Network", "Network");
    expected.add(network, "NetworkInterface", "Ethernet interface");
    expected.property(Properties::Name, "bmc-lan1", true);
    expected.property(Properties::NameMaxLength, number(15));
    expected.property(Properties::IPv4Address, "198.51.100.77");
    expected.property(Properties::DHCPEnabled, true);
    expected.property(Properties::AddressSource, number(1));
    expected.property(Properties::DHCPServerAddresses, std::vector<std::string>{});
    EXPECT_EQ(*treeOf({.lan = LanChannel{1, std::uint8_t{2}, "198.51.100.77"_ip}}),
              *expected.build());
}

TEST(ServiceProcessor, WithoutALanChannelIsAComputerAlone) {
    SnapshotBuilder expected;
    expected.add(Snapshot::none, "ComputerSystem", "BMC");
    expected.property(Properties::Name, "BMC:-1");
    EXPECT_EQ(*treeOf({}), *expected.build());
}

TEST(ServiceProcessor, EverySourceOfAnAddressHasItsNumber) {
    const std::array<unsigned, 16> sources{0, 3, 1, 5, 5};  // reserved numbers are unknown
    for (std::uint8_t code = 0; code < sources.size(); ++code) {
        const auto tree = treeOf({.lan = LanChannel{1, code, "192.0.2.1"_ip}});
        EXPECT_EQ(valueOf(*tree, "bmc-lan1", Properties::AddressSource), number(sources.at(code)))
            << +code;
        EXPECT_EQ(valueOf(*tree, "bmc-lan1", Properties::DHCPEnabled), PropertyValue{code == 2})
            << +code;
    }
}

TEST(ServiceProcessor, DhcpWithoutALeaseHasNoAddress) {
    const auto tree = treeOf({.lan = LanChannel{8, std::uint8_t{2}, std::nullopt}});
    const auto node = interfaceNode(*tree, "bmc-lan8");
    ASSERT_NE(node, Snapshot::none);
    EXPECT_EQ(tree->find(node, Properties::IPv4Address), nullptr);
    EXPECT_EQ(valueOf(*tree, "bmc-lan8", Properties::DHCPEnabled), PropertyValue{true});
}

TEST(ServiceProcessor, ASourceThatWasNotToldIsUnknownAndSaysNothingOfDhcp) {
    const auto tree = treeOf({.lan = LanChannel{1, std::nullopt, "192.0.2.1"_ip}});
    const auto node = interfaceNode(*tree, "bmc-lan1");
    ASSERT_NE(node, Snapshot::none);
    EXPECT_EQ(tree->find(node, Properties::DHCPEnabled), nullptr);
    EXPECT_EQ(valueOf(*tree, "bmc-lan1", Properties::AddressSource), number(0));
}

}  // namespace
}  // namespace ZR::Live
