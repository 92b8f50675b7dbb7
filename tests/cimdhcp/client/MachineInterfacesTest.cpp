#include "client/MachineInterfaces.h"

#include <gtest/gtest.h>

#include "cimom/ClassRepository.h"
#include "zrclient/Snapshot.h"

namespace cimdhcp {
namespace {

using cimom::Scalar;
using cimom::Type;
using cimom::Value;
using ZR::NodeLexicon::Properties;

constexpr const char* schema = R"(
Qualifier ValueMap : string[], Scope(property), Flavor(EnableOverride, ToSubclass);
Qualifier Values : string[], Scope(property), Flavor(EnableOverride, ToSubclass);
class Endpoint {
    [ValueMap {"0", "2", "3"}, Values {"Unknown", "Enabled", "Disabled"}] uint16 EnabledState;
    [ValueMap {"0", "6", "8"}, Values {"Unknown", "Init-Reboot", "Bound"}] uint16 ClientState;
};
)";

cimom::Instance endpoint(const std::string& systemClass, const std::string& name,
                         std::uint64_t enabled, std::uint64_t client) {
    cimom::Instance instance;
    instance.path.className = "Endpoint";
    instance.properties = {{"SystemCreationClassName", Value::ofString(systemClass)},
                           {"Name", Value::ofString(name)},
                           {"EnabledState", {Type::uint16, false, Scalar(enabled)}},
                           {"ClientState", {Type::uint16, false, Scalar(client)}}};
    return instance;
}

cimom::Instance accessPoint(const std::string& systemClass, const std::string& name,
                            const std::string& address) {
    cimom::Instance instance;
    instance.properties = {{"SystemCreationClassName", Value::ofString(systemClass)},
                           {"Name", Value::ofString(name)},
                           {"AccessInfo", Value::ofString(address)}};
    return instance;
}

cimom::Instance setting(const std::string& id, const std::string& configuration) {
    cimom::Instance instance;
    instance.properties = {{"InstanceID", Value::ofString(id)},
                           {"ConfigurationName", Value::ofString(configuration)}};
    return instance;
}

constexpr const char* host = "QVXZR_ComputerSystem";
constexpr const char* processor = "QVXZR_SPComputerSystem";

cimom::Instance ipEndpoint(const std::string& system, const std::string& name,
                           const std::string& address) {
    cimom::Instance instance;
    instance.properties = {{"SystemName", Value::ofString(system)},
                           {"Name", Value::ofString(name)},
                           {"IPv4Address", Value::ofString(address)}};
    return instance;
}

TEST(InterfaceIdText, IsSplitAtTheFirstSign) {
    EXPECT_EQ(readInterfaceId("Computer%eth%1"), (InterfaceId{"Computer", "eth%1"}));
    EXPECT_EQ(readInterfaceId("eth0"), std::nullopt);
}

TEST(InterfacesOfAnotherMachine, AreThoseThatHaveASetting) {
    EXPECT_EQ(interfacesOf({setting("Computer%eth0", "office"), setting("Computer%eth%1", ""),
                            setting("BMC%eth0", ""), setting("nothing", "")},
                           {ipEndpoint("host", "eth0", "192.0.2.17"),
                            ipEndpoint("BMC:-1", "eth0", "192.0.2.18"),
                            ipEndpoint("host", "eth9", "192.0.2.19")},
                           {"BMC:-1"}),
              (std::vector<InterfaceOverview>{
                  {"Computer", "eth0", std::nullopt, "", "192.0.2.17", {}, ""},
                  {"Computer", "eth%1", std::nullopt, "", "", {}, ""},
                  {"BMC", "eth0", std::nullopt, "", "192.0.2.18", {}, ""}}));
}

class MachineInterfacesServed : public ::testing::Test {
  protected:
    MachineInterfacesServed() { repository_.loadText(schema, "small.mof"); }

    std::vector<InterfaceOverview> with(const ServedInstances& served) const {
        auto interfaces = interfaces_;
        addServed(served, repository_, interfaces);
        return interfaces;
    }

    cimom::ClassRepository repository_;
    const std::vector<InterfaceOverview> interfaces_{
        {"Computer", "eth0", std::nullopt, "active", "192.0.2.17", {}, ""},
        {"Computer", "eth0_1", std::nullopt, "inactive", "", {}, ""},
        {"BMC", "eth0", std::nullopt, "active", "", {}, ""}};
};

TEST(InterfacesOfATree, AreThoseOfItsNetworks) {
    ZR::SnapshotBuilder builder;
    const auto computer = builder.add(ZR::Snapshot::none, "ComputerSystem", "Computer");
    const auto network = builder.add(computer, "Network", "Network");
    builder.add(network, "NetworkInterface", "Ethernet");
    builder.property(Properties::Name, std::string("eth0"));
    builder.property(Properties::IPv4Address, std::string("192.0.2.17"));
    builder.property(Properties::InterfaceState, std::uint64_t{1});
    builder.add(network, "NetworkInterface", "Ethernet");
    builder.property(Properties::Name, std::string("eth1"));
    builder.property(Properties::InterfaceState, std::uint64_t{0});
    builder.add(network, "NetworkInterface", "nameless");
    const auto bmc = builder.add(ZR::Snapshot::none, "ComputerSystem", "BMC");
    builder.add(builder.add(bmc, "Network", "Network"), "NetworkInterface", "Ethernet");
    builder.property(Properties::Name, std::string("eth0"));
    builder.add(ZR::Snapshot::none, "NetworkInterface", "alone");
    EXPECT_EQ(interfacesOf(*builder.build()),
              (std::vector<InterfaceOverview>{
                  {"Computer", "eth0", std::nullopt, "active", "192.0.2.17", {}, ""},
                  {"Computer", "eth1", std::nullopt, "inactive", "", {}, ""},
                  {"Computer", "", std::nullopt, "", "", {}, ""},
                  {"BMC", "eth0", std::nullopt, "", "", {}, ""},
                  {"Computer", "", std::nullopt, "", "", {}, ""}}));
}

TEST_F(MachineInterfacesServed, StaysAsItIsWhenNothingIsServed) {
    EXPECT_EQ(with({}), interfaces_);
}

TEST_F(MachineInterfacesServed, HasDhcpOffWithoutAnEndpoint) {
    ServedInstances served;
    served.endpoints.emplace();
    for (const InterfaceOverview& each : with(served)) {
        EXPECT_EQ(each.dhcp, false);
    }
    EXPECT_EQ(with(served)[0].state, "active");
}

TEST_F(MachineInterfacesServed, TakesTheStateOfTheClient) {
    ServedInstances served;
    served.endpoints = {endpoint(host, "eth0", 2, 8), endpoint(host, "eth0_1", 3, 0),
                        endpoint(processor, "eth0", 2, 99)};
    const auto interfaces = with(served);
    EXPECT_EQ(interfaces[0].dhcp, true);
    EXPECT_EQ(interfaces[0].state, "bound");
    EXPECT_EQ(interfaces[1].state, "disabled");
    EXPECT_EQ(interfaces[2].state, "99");
}

TEST_F(MachineInterfacesServed, TellsInterfacesOfOneNameApartByTheirSystem) {
    ServedInstances served;
    served.endpoints = {endpoint(processor, "eth0", 2, 8)};
    served.accessPoints = {accessPoint(processor, "eth0_IPv4", "192.0.2.1")};
    served.settings = {setting("BMC%eth0", "management"), setting("Computer%eth0", "office")};
    const auto interfaces = with(served);
    EXPECT_EQ(interfaces[0],
              (InterfaceOverview{"Computer", "eth0", false, "active", "192.0.2.17", {}, "office"}));
    EXPECT_EQ(interfaces[2],
              (InterfaceOverview{"BMC", "eth0", true, "bound", "", {"192.0.2.1"}, "management"}));
}

TEST_F(MachineInterfacesServed, FindsServersByTheWholeNameOfTheInterface) {
    ServedInstances served;
    served.accessPoints = {accessPoint(host, "eth0_IPv4", "192.0.2.1"),
                           accessPoint(host, "eth0_IPv6", "2001:db8::1"),
                           accessPoint(host, "eth0_1_IPv4", "192.0.2.9")};
    const auto interfaces = with(served);
    EXPECT_EQ(interfaces[0].servers, (std::vector<std::string>{"192.0.2.1", "2001:db8::1"}));
    EXPECT_EQ(interfaces[1].servers, (std::vector<std::string>{"192.0.2.9"}));
    EXPECT_TRUE(interfaces[2].servers.empty());
}

}  // namespace
}  // namespace cimdhcp
