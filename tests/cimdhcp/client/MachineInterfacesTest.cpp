#include "client/MachineInterfaces.h"

#include <gtest/gtest.h>

#include "zrclient/Snapshot.h"

namespace cimdhcp {
namespace {

using cimom::Scalar;
using cimom::Type;
using cimom::Value;
using ZR::NodeLexicon::Properties;

cimom::Instance endpoint(const std::string& systemClass, const std::string& name,
                         std::uint64_t client) {
    cimom::Instance instance;
    instance.path.className = "Endpoint";
    instance.properties = {{"SystemCreationClassName", Value::ofString(systemClass)},
                           {"Name", Value::ofString(name)},
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

InterfaceOverview named(std::string_view system, const std::string& name) {
    InterfaceOverview interface;
    interface.system = system;
    interface.name = name;
    return interface;
}

TEST(InterfacesOfAnotherMachine, AreThoseThatHaveASetting) {
    const std::vector<cimom::Instance> settings{setting("Computer%eth0", "office"),
                                                setting("Computer%eth%1", ""),
                                                setting("BMC%eth0", ""), setting("nothing", "")};
    std::vector<InterfaceOverview> expected{named(hostSystem, "eth0"), named(hostSystem, "eth%1"),
                                            named(serviceProcessorSystem, "eth0")};
    // Nothing of them is known but what is served.
    EXPECT_EQ(interfacesOf(settings, std::nullopt, {}), expected);
    expected[0].address = "192.0.2.17";
    expected[1].address = "";
    expected[2].address = "192.0.2.18";
    EXPECT_EQ(interfacesOf(settings,
                           std::vector{ipEndpoint("host", "eth0", "192.0.2.17"),
                                       ipEndpoint("BMC:-1", "eth0", "192.0.2.18"),
                                       ipEndpoint("host", "eth9", "192.0.2.19")},
                           {"BMC:-1"}),
              expected);
}

TEST(InterfacesOfATree, AreThoseOfItsNetworks) {
    ZR::SnapshotBuilder builder;
    const auto computer = builder.add(ZR::Snapshot::none, "ComputerSystem", "Computer");
    const auto network = builder.add(computer, "Network", "Network");
    builder.add(network, "NetworkInterface", "Ethernet");
    builder.property(Properties::Name, std::string("eth0"));
    builder.property(Properties::DHCPEnabled, true);
    builder.property(Properties::AddressSource, std::uint64_t{1});
    builder.property(Properties::IPv4Address, std::string("192.0.2.17"));
    builder.property(Properties::InterfaceState, std::uint64_t{1});
    builder.add(network, "NetworkInterface", "Ethernet");
    builder.property(Properties::Name, std::string("eth1"));
    builder.property(Properties::DHCPEnabled, false);
    builder.property(Properties::InterfaceState, std::uint64_t{0});
    builder.add(network, "NetworkInterface", "nameless");
    const auto bmc = builder.add(ZR::Snapshot::none, "ComputerSystem", "BMC");
    builder.add(builder.add(bmc, "Network", "Network"), "NetworkInterface", "Ethernet");
    builder.property(Properties::Name, std::string("eth0"));
    builder.add(ZR::Snapshot::none, "NetworkInterface", "alone");

    std::vector<InterfaceOverview> expected{
        named(hostSystem, "eth0"), named(hostSystem, "eth1"), named(hostSystem, ""),
        named(serviceProcessorSystem, "eth0"), named(hostSystem, "")};
    for (InterfaceOverview& each : expected) {
        each.address = "";
        each.leases.emplace();
    }
    expected[0].dhcp = true;
    expected[0].active = true;
    expected[0].addressSource = 1;
    expected[0].address = "192.0.2.17";
    expected[1].dhcp = false;
    expected[1].active = false;
    EXPECT_EQ(interfacesOf(*builder.build()), expected);
}

cimom::NamedValue textProperty(const std::string& name, const std::string& value) {
    return {name, Value::ofString(value)};
}

cimom::NamedValue momentProperty(const std::string& name, const std::string& value) {
    return {name, {Type::datetime, false, Scalar(value)}};
}

TEST(InterfacesThatAreServed, HaveWhatTheirInstancesTell) {
    cimom::Instance eth0;
    eth0.properties = {textProperty("InstanceID", "Computer%eth0"),
                       {"DHCPEnabled", {Type::boolean, false, Scalar(true)}},
                       {"LinkUp", {Type::boolean, false, Scalar(false)}},
                       textProperty("IPv4Address", "192.0.2.17"),
                       {"AddressOrigin", {Type::uint16, false, Scalar(std::uint64_t{4})}}};
    cimom::Instance processors;
    processors.properties = {textProperty("InstanceID", "BMC%eth0"),
                             {"AddressOrigin", {Type::uint16, false, Scalar(std::uint64_t{7})}}};
    cimom::Instance nameless;
    nameless.properties = {textProperty("InstanceID", "eth0")};
    std::vector<InterfaceOverview> expected{named(hostSystem, "eth0"),
                                            named(serviceProcessorSystem, "eth0")};
    expected[0].dhcp = true;
    expected[0].active = false;
    expected[0].address = "192.0.2.17";
    expected[0].addressSource = 1;
    expected[1].address = "";
    expected[1].addressSource = 0;
    const std::vector served{eth0, processors, nameless};
    EXPECT_EQ(interfacesOf(served, std::nullopt), expected) << "leases are not served";

    cimom::Instance lease;
    lease.properties = {
        textProperty("InterfaceID", "Computer%eth0"),
        textProperty("Family", "IPv4"),
        {"ClientState", {Type::uint16, false, Scalar(std::uint64_t{8})}},
        textProperty("Address", "192.0.2.17"),
        textProperty("ServerAddress", "192.0.2.1"),
        momentProperty("LeaseObtained", "20231114221320.000000+000"),
        momentProperty("RenewalTime", "20231114234320.000000+060"),
        momentProperty("RebindingTime", "not a moment"),
        momentProperty("LeaseExpires", "99991231235959.000000+000"),
        {"OptionsReceived",
         {Type::uint16, true, cimom::Array{std::uint64_t{1}, Scalar(), std::uint64_t{51}}}},
        textProperty("ClientIdentifier", "01:02"),
        textProperty("ClientName", "dhclient"),
        {"Process", {Type::uint32, false, Scalar(std::uint64_t{412})}},
        {"ClientRuns", {Type::boolean, false, Scalar(true)}},
        textProperty("Source", "/leases")};
    cimom::Instance elsewhere;
    elsewhere.properties = {textProperty("InterfaceID", "Computer%eth9")};
    LeaseOverview known;
    known.family = "IPv4";
    known.clientState = 8;
    known.address = "192.0.2.17";
    known.server = "192.0.2.1";
    known.obtained = 1'700'000'000;
    known.renews = 1'700'001'800;
    known.expires = static_cast<std::int64_t>(ZR::NodeLexicon::never);
    known.options = {1, 51};
    known.clientIdentifier = "01:02";
    known.client = "dhclient";
    known.process = 412;
    known.source = "/leases";
    known.clientRuns = true;
    expected[0].leases = {known};
    expected[1].leases.emplace();
    EXPECT_EQ(interfacesOf(served, std::vector{lease, elsewhere}), expected);
}

TEST(DiagnosticsThatAreServed, AreThoseOfKnownKinds) {
    const auto diagnostic = [](std::uint64_t kind) {
        cimom::Instance instance;
        instance.properties = {textProperty("Description", "eth0: a lease has ended"),
                               {"Kind", {Type::uint16, false, Scalar(kind)}}};
        return instance;
    };
    EXPECT_EQ(
        diagnosticsOf({diagnostic(5), diagnostic(8), cimom::Instance{}}),
        std::vector{ZR::Diagnostic("eth0: a lease has ended", ZR::Diagnostic::Kind::LeaseEnded)});
}

/// A tree with interfaces eth0 and eth1, the second with leases.
class LeasesOfATree : public ::testing::Test {
  protected:
    LeasesOfATree() {
        const auto network = builder_.add(ZR::Snapshot::none, "Network", "Network");
        builder_.add(network, "NetworkInterface", "Ethernet");
        builder_.property(Properties::Name, std::string("eth0"));
        interface_ = builder_.add(network, "NetworkInterface", "Ethernet");
        builder_.property(Properties::Name, std::string("eth1"));
    }
    void addLease() { builder_.add(interface_, "DHCPLease", "DHCP lease"); }
    std::vector<LeaseOverview> leases() {
        auto interfaces = interfacesOf(*builder_.build());
        EXPECT_TRUE(interfaces[0].leases->empty());
        return *std::move(interfaces[1].leases);
    }

    ZR::SnapshotBuilder builder_;
    ZR::Snapshot::Index interface_ = ZR::Snapshot::none;
};

TEST_F(LeasesOfATree, HaveAllThatTheirNodesHave) {
    addLease();
    builder_.property(Properties::Family, std::string("IPv6"));
    builder_.property(Properties::ClientState, std::uint64_t{8});
    builder_.property(Properties::Address, std::string("2001:db8::17"));
    builder_.property(Properties::ServerAddress, std::string("fe80::1"));
    builder_.property(Properties::LeaseObtained, std::uint64_t{100});
    builder_.property(Properties::RenewalTime, std::uint64_t{200});
    builder_.property(Properties::RebindingTime, std::uint64_t{300});
    builder_.property(Properties::LeaseExpires, std::uint64_t{400});
    builder_.property(Properties::OptionsReceived, ZR::NumberList{{23, 24}});
    builder_.property(Properties::ClientIdentifier, std::string("00:01"));
    builder_.property(Properties::Client, std::string("dhclient"));
    builder_.property(Properties::Process, std::uint64_t{17});
    builder_.property(Properties::Source, std::string("/var/lib/dhcp/dhclient6.leases"));
    addLease();
    LeaseOverview full;
    full.family = "IPv6";
    full.clientState = 8;
    full.address = "2001:db8::17";
    full.server = "fe80::1";
    full.obtained = 100;
    full.renews = 200;
    full.rebinds = 300;
    full.expires = 400;
    full.options = {23, 24};
    full.clientIdentifier = "00:01";
    full.client = "dhclient";
    full.process = 17;
    full.source = "/var/lib/dhcp/dhclient6.leases";
    EXPECT_EQ(leases(), (std::vector<LeaseOverview>{full, LeaseOverview{}}));
}

TEST_F(LeasesOfATree, HaveNoTimesBeyondTheLast) {
    addLease();
    builder_.property(Properties::LeaseExpires, std::uint64_t{UINT64_MAX});
    EXPECT_EQ(leases()[0].expires, static_cast<std::int64_t>(ZR::NodeLexicon::never));
}

TEST_F(LeasesOfATree, KnowWhetherTheirClientRuns) {
    addLease();
    builder_.property(Properties::ClientRuns, true);
    addLease();
    builder_.property(Properties::ClientRuns, false);
    addLease();
    const auto found = leases();
    EXPECT_EQ(found[0].clientRuns, true);
    EXPECT_EQ(found[1].clientRuns, false);
    EXPECT_EQ(found[2].clientRuns, std::nullopt);
}

class MachineInterfacesServed : public ::testing::Test {
  protected:
    MachineInterfacesServed() {
        interfaces_[0].address = "192.0.2.17";
        interfaces_[1].address = "";
    }

    std::vector<InterfaceOverview> with(const ServedInstances& served) const {
        auto interfaces = interfaces_;
        addServed(served, interfaces);
        return interfaces;
    }

    std::vector<InterfaceOverview> interfaces_{named(hostSystem, "eth0"),
                                               named(hostSystem, "eth0_1"),
                                               named(serviceProcessorSystem, "eth0")};
};

TEST_F(MachineInterfacesServed, StaysAsItIsWhenNothingIsServed) {
    EXPECT_EQ(with({}), interfaces_);
}

TEST_F(MachineInterfacesServed, HasDhcpOffWithoutAnEndpoint) {
    ServedInstances served;
    served.endpoints.emplace();
    for (const InterfaceOverview& each : with(served)) {
        EXPECT_EQ(each.dhcp, false);
    }
}

TEST_F(MachineInterfacesServed, KeepsWhatATreeTellsOfDhcp) {
    interfaces_[0].leases.emplace();
    interfaces_[1].leases.emplace();
    interfaces_[1].dhcp = true;
    ServedInstances served;
    served.endpoints.emplace();
    EXPECT_EQ(with(served)[0].dhcp, std::nullopt);
    EXPECT_EQ(with(served)[1].dhcp, true);
}

TEST_F(MachineInterfacesServed, TakesTheStateOfTheClient) {
    ServedInstances served;
    served.endpoints = {endpoint(host, "eth0", 8), endpoint(processor, "eth0", 99)};
    const auto interfaces = with(served);
    EXPECT_EQ(interfaces[0].dhcp, true);
    EXPECT_EQ(interfaces[0].clientState, 8U);
    EXPECT_EQ(interfaces[1].clientState, std::nullopt);
    EXPECT_EQ(interfaces[2].clientState, 99U);
}

TEST_F(MachineInterfacesServed, TellsInterfacesOfOneNameApartByTheirSystem) {
    ServedInstances served;
    served.endpoints = {endpoint(processor, "eth0", 8)};
    served.accessPoints = {accessPoint(processor, "eth0_IPv4", "192.0.2.1")};
    served.settings = {setting("BMC%eth0", "management"), setting("Computer%eth0", "office")};
    const auto interfaces = with(served);
    InterfaceOverview ofHost = interfaces_[0];
    ofHost.dhcp = false;
    ofHost.servers.emplace();
    ofHost.configurationName = "office";
    InterfaceOverview ofProcessor = interfaces_[2];
    ofProcessor.dhcp = true;
    ofProcessor.clientState = 8;
    ofProcessor.servers = {"192.0.2.1"};
    ofProcessor.configurationName = "management";
    EXPECT_EQ(interfaces[0], ofHost);
    EXPECT_EQ(interfaces[2], ofProcessor);
    // A setting that is missing is known to have no name.
    EXPECT_EQ(interfaces[1].configurationName, "");
}

TEST_F(MachineInterfacesServed, FindsServersByTheWholeNameOfTheInterface) {
    ServedInstances served;
    served.accessPoints = {accessPoint(host, "eth0_IPv4", "192.0.2.1"),
                           accessPoint(host, "eth0_IPv6", "2001:db8::1"),
                           accessPoint(host, "eth0_1_IPv4", "192.0.2.9")};
    const auto interfaces = with(served);
    EXPECT_EQ(interfaces[0].servers, (std::vector<std::string>{"192.0.2.1", "2001:db8::1"}));
    EXPECT_EQ(interfaces[1].servers, (std::vector<std::string>{"192.0.2.9"}));
    EXPECT_TRUE(interfaces[2].servers->empty());
}

}  // namespace
}  // namespace cimdhcp
