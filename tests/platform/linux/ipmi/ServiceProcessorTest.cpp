#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <memory>

#include "LinuxSupport.h"
#include "LiveMachine.h"
#include "ScriptedProcessor.h"
#include "ScriptedTransport.h"
#include "ipmi/ServiceProcessor.h"

namespace ZR::Live {
namespace {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;
using namespace std::chrono_literals;
using testing::ElementsAre;
using testing::IsEmpty;

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

// The service processor in the tree of the whole machine.

class ServiceProcessorMachineTest : public testing::Test {
  protected:
    /// A machine with one link, eth1, as often as it is read.
    ServiceProcessorMachineTest() {
        std::deque<std::vector<Step>> responses;
        const Message end{NLMSG_DONE, NLM_F_MULTI, std::int32_t{0}};
        for (int i = 0; i < 10; ++i) {
            responses.push_back({Step{{linkMessage(2, "eth1", 0x11043), end}}});
            responses.push_back({Step{{addressMessage(2, {192, 0, 2, 1}), end}}});
        }
        std::filesystem::create_directories(root_.path("/proc/thread-self/ns"));
        surroundings_.roots = {.files = root_.path(), .proc = root_.path("/proc")};
        surroundings_.transport = std::make_unique<ScriptedTransport>(std::move(responses));
        surroundings_.realProcesses = false;
        surroundings_.uptime = [this] { return uptime_; };
        surroundings_.report = [this](std::string_view text) { diagnostics_.emplace_back(text); };
    }

    LiveMachine& withProcessor() {
        surroundings_.ipmi = std::make_unique<ScriptedIpmi>(processor_);
        return open();
    }
    LiveMachine& open() {
        machine_ = std::make_unique<LiveMachine>(std::move(surroundings_));
        return *machine_;
    }

    TemporaryDirectory root_;
    ScriptedProcessor processor_ = ScriptedProcessor::withLan(1, 2, leased);
    std::chrono::steady_clock::time_point uptime_{1000h};
    std::vector<std::string> diagnostics_;
    Surroundings surroundings_;
    std::unique_ptr<LiveMachine> machine_;
};

std::vector<std::string> computers(const Snapshot& tree) {
    std::vector<std::string> descriptions;
    for (auto node = tree.first(NodeType::ComputerSystem); node != Snapshot::none;
         node = tree.node(node).nextOfType) {
        descriptions.push_back(tree.node(node).description);
    }
    return descriptions;
}

TEST_F(ServiceProcessorMachineTest, StandsBesideTheComputerWithItsInterface) {
    LiveMachine& machine = withProcessor();
    static_cast<void>(machine.read());
    ASSERT_TRUE(machine.changed());
    const auto tree = machine.read();
    EXPECT_THAT(computers(*tree), ElementsAre("Computer", "BMC"));
    EXPECT_THAT(interfaceNames(*tree), ElementsAre("eth1", "bmc-lan1"));
    const auto node = interfaceNode(*tree, "bmc-lan1");
    const auto computer = tree->node(tree->node(node).parent).parent;
    EXPECT_EQ(tree->node(computer).description, "BMC");
    EXPECT_EQ(tree->find(computer, Properties::Name)->value, PropertyValue{"BMC:-1"});
    EXPECT_EQ(tree->path(node), "/BMC:-1/Network/bmc-lan1");
    EXPECT_TRUE(tree->find(node, Properties::Name)->readOnly);
    EXPECT_EQ(valueOf(*tree, "bmc-lan1", Properties::DHCPEnabled), PropertyValue{true});
    EXPECT_EQ(valueOf(*tree, "bmc-lan1", Properties::AddressSource), number(1));
    EXPECT_EQ(valueOf(*tree, "bmc-lan1", Properties::IPv4Address), PropertyValue{"198.51.100.77"});
    EXPECT_EQ(valueOf(*tree, "bmc-lan1", Properties::DHCPServerAddresses),
              PropertyValue{std::vector<std::string>{}});
    EXPECT_FALSE(machine.changed());
    EXPECT_THAT(diagnostics_, IsEmpty());
}

TEST_F(ServiceProcessorMachineTest, IsAskedWithoutAReading) {
    LiveMachine& machine = withProcessor();
    EXPECT_TRUE(machine.awaiting());
    EXPECT_FALSE(machine.awaiting()) << "the response came meanwhile";
    EXPECT_THAT(interfaceNames(*machine.read()), ElementsAre("eth1", "bmc-lan1"));
}

TEST_F(ServiceProcessorMachineTest, NoReadingWaitsForIt) {
    processor_.silent = true;
    LiveMachine& machine = withProcessor();
    const auto tree = machine.read();
    EXPECT_THAT(computers(*tree), ElementsAre("Computer", "BMC"));
    EXPECT_THAT(interfaceNames(*tree), ElementsAre("eth1"));
    EXPECT_FALSE(machine.changed());
    EXPECT_LE(processor_.received, 2) << "one look per call";
}

TEST_F(ServiceProcessorMachineTest, IsAskedAtMostOnceAMinute) {
    LiveMachine& machine = withProcessor();
    static_cast<void>(machine.read());
    ASSERT_TRUE(machine.changed());
    static_cast<void>(machine.read());
    processor_.parameter(1, 4, {1});
    const auto asked = processor_.asked.size();
    for (int second = 0; second < 59; ++second) {
        uptime_ += 1s;
        EXPECT_FALSE(machine.changed());
    }
    EXPECT_EQ(processor_.asked.size(), asked);
    uptime_ += 1s;
    EXPECT_FALSE(machine.changed());
    EXPECT_TRUE(machine.changed());
    EXPECT_EQ(valueOf(*machine.read(), "bmc-lan1", Properties::AddressSource), number(3));
    EXPECT_EQ(processor_.asked.size(), 2 * asked);
}

TEST_F(ServiceProcessorMachineTest, ItsSilenceIsOneLine) {
    processor_.silent = true;
    LiveMachine& machine = withProcessor();
    static_cast<void>(machine.read());
    for (int minute = 0; minute < 3; ++minute) {
        uptime_ += 2s;
        if (machine.changed()) {
            static_cast<void>(machine.read());
        }
        uptime_ += 1min;
        EXPECT_FALSE(machine.changed());
    }
    EXPECT_THAT(diagnostics_, ElementsAre("service processor: no response within one second"));
}

TEST_F(ServiceProcessorMachineTest, WithoutItsDeviceThereIsTheComputerAlone) {
    EXPECT_THAT(computers(*open().read()), ElementsAre("Computer"));
    EXPECT_THAT(diagnostics_, IsEmpty());
}

TEST_F(ServiceProcessorMachineTest, ItsDeviceIsLookedForAmongTheMachinesFiles) {
    root_.write("/dev/ipmi0", "no device");
    EXPECT_THAT(computers(*open().read()), ElementsAre("Computer", "BMC"));
    EXPECT_THAT(diagnostics_,
                ElementsAre("service processor: cannot ask: Inappropriate ioctl for device"));
}

}  // namespace
}  // namespace ZR::Live
