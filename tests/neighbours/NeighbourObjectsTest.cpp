#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "MachineFacts.h"
#include "NeighbourObjects.h"
#include "cimom/ObjectManager.h"
#include "cimom/ObjectPathText.h"
#include "cimom/Results.h"
#include "kit/ChildProcess.h"
#include "kit/HostNameFake.h"
#include "kit/PrivateNamespace.h"
#include "kit/Tree.h"

namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using Numbers = std::vector<unsigned short>;
using test::computer;
using test::dhcpInterface;
using test::host;
using test::interface;
using test::Json;
using test::serviceProcessor;
using test::staticInterface;
using ZR::DHCPClientNeighbours::ComputerFacts;
using ZR::DHCPClientNeighbours::InterfaceFacts;
using ZR::DHCPClientNeighbours::isNeighbourClass;
using ZR::DHCPClientNeighbours::NeighbourObject;
using ZR::DHCPClientNeighbours::objectsOf;
using ZR::DHCPClientNeighbours::readComputers;
using ZR::DHCPClientNeighbours::readInterfaces;

class MachineFactsTest : public test::TreeTest {};

TEST_F(MachineFactsTest, EmptyMachineHasNeitherComputersNorInterfaces) {
    EXPECT_EQ(readComputers(), std::vector<ComputerFacts>{});
    EXPECT_EQ(readInterfaces(), std::vector<InterfaceFacts>{});
}

TEST_F(MachineFactsTest, ComputersAreToldInTheOrderOfTheTree) {
    setTree({serviceProcessor({}), host({}), computer("Computer", "third", {})});
    EXPECT_EQ(readComputers(), (std::vector<ComputerFacts>{
                                   {"BMC:-1", true}, {hostName(), false}, {"third", false}}));
}

TEST_F(MachineFactsTest, OnlyTheExactDescriptionMakesAServiceProcessor) {
    setTree({computer("bmc", "a", {}), computer("BMC ", "b", {}), computer("BMC", "c", {})});
    EXPECT_EQ(readComputers(),
              (std::vector<ComputerFacts>{{"a", false}, {"b", false}, {"c", true}}));
}

TEST_F(MachineFactsTest, ComputerWithoutAReadableNameIsLeftOut) {
    setTree({{{"type", "ComputerSystem"}, {"description", "Computer"}}, host({})});
    EXPECT_EQ(readComputers(), (std::vector<ComputerFacts>{{hostName(), false}}));
}

TEST_F(MachineFactsTest, InterfacesBelongToTheComputerTwoLevelsAbove) {
    setTree({host({staticInterface("eth0")}), serviceProcessor({dhcpInterface("bmc0")})});
    EXPECT_EQ(readInterfaces(), (std::vector<InterfaceFacts>{{"eth0", hostName(), false, "", 3},
                                                             {"bmc0", "BMC:-1", true, "", 1}}));
}

TEST_F(MachineFactsTest, AddressAndItsSourceAreToldAsFarAsTheyCanBeRead) {
    setTree({host({interface("all", {{"IPv4Address", "192.0.2.1"}, {"AddressSource", 4}}),
                   interface("none"),
                   interface("unreadable", {{"IPv4Address", 5}, {"AddressSource", "DHCP"}})})});
    EXPECT_EQ(readInterfaces(),
              (std::vector<InterfaceFacts>{{"all", hostName(), false, "192.0.2.1", 4},
                                           {"none", hostName(), false, "", 0},
                                           {"unreadable", hostName(), false, "", 0}}));
}

TEST_F(MachineFactsTest, InterfaceWithoutAReadableNameIsLeftOut) {
    setTree({host(
        {{{"type", "NetworkInterface"}, {"description", "nameless"}}, staticInterface("eth0")})});
    EXPECT_EQ(readInterfaces(), (std::vector<InterfaceFacts>{{"eth0", hostName(), false, "", 3}}));
}

TEST_F(MachineFactsTest, MachineThatDoesNotTellItsNameIsLeftOutButNotItsInterfaces) {
    setTree({host({staticInterface("eth0")}), serviceProcessor({dhcpInterface("bmc0")})});
    const ZR::Testing::HostNameFails failing;
    EXPECT_EQ(readComputers(), (std::vector<ComputerFacts>{{"BMC:-1", true}}));
    EXPECT_EQ(readInterfaces(), (std::vector<InterfaceFacts>{{"eth0", "", false, "", 3},
                                                             {"bmc0", "BMC:-1", true, "", 1}}));
}

TEST_F(MachineFactsTest, InterfaceWithNothingAboveIsTheHosts) {
    setTree({interface("eth0")});
    EXPECT_EQ(readInterfaces(), (std::vector<InterfaceFacts>{{"eth0", hostName(), false, "", 0}}));
}

constexpr unsigned short ipv4 = 4096;

unsigned short number(int value) {
    return static_cast<unsigned short>(value);
}

class NeighbourObjectsTest : public test::TreeTest {
  protected:
    void SetUp() override {
        TreeTest::SetUp();
        Json eth0 = dhcpInterface("eth0");
        eth0["properties"]["IPv4Address"] = "192.0.2.10";
        Json bmc0 = staticInterface("bmc0");
        bmc0["properties"]["IPv4Address"] = "192.0.2.20";
        setTree({host({eth0, staticInterface("eth1")}), serviceProcessor({bmc0})});
    }

    /// The object with nulls for the states that are not known of it.
    static NeighbourObject withoutStates(NeighbourObject object) {
        for (const char* name :
             {"EnabledState", "RequestedState", "EnabledDefault", "TransitioningToState"}) {
            object.properties.emplace_back(name, std::monostate{});
        }
        return object;
    }

    static NeighbourObject hostObject() {
        return withoutStates({"QVXZR_ComputerSystem",
                              {{"CreationClassName", "QVXZR_ComputerSystem"}, {"Name", hostName()}},
                              {{"ElementName", hostName()},
                               {"NameFormat", std::string("Other")},
                               {"Dedicated", Numbers{0}}}});
    }

    static NeighbourObject serviceProcessorObject() {
        return withoutStates({"QVXZR_SPComputerSystem",
                              {{"CreationClassName", "QVXZR_SPComputerSystem"}, {"Name", "BMC:-1"}},
                              {{"ElementName", std::string("BMC:-1")},
                               {"NameFormat", std::string("Other")},
                               {"Dedicated", Numbers{28}}}});
    }
};

TEST_F(NeighbourObjectsTest, FourClassesAreServedWhateverTheCaseOfTheirNames) {
    for (const char* name : {"QVXZR_ComputerSystem", "QVXZR_SPComputerSystem",
                             "QVXZR_IPProtocolEndpoint", "qvxzr_ipassignmentsettingdata"}) {
        EXPECT_TRUE(isNeighbourClass(name)) << name;
    }
    for (const char* name :
         {"", "CIM_ComputerSystem", "QVXZR_DHCPProtocolEndpoint", "QVXZR_ComputerSystem "}) {
        EXPECT_FALSE(isNeighbourClass(name)) << name;
        EXPECT_THAT(objectsOf(name, ""), IsEmpty()) << name;
    }
}

TEST_F(NeighbourObjectsTest, ComputerSystemIsTheHostAloneWhenNoneIsNamed) {
    EXPECT_THAT(objectsOf("QVXZR_ComputerSystem", ""), ElementsAre(hostObject()));
}

TEST_F(NeighbourObjectsTest, NamedComputerSystemIsTheComputerOfThatNameInItsOwnClass) {
    EXPECT_THAT(objectsOf("QVXZR_ComputerSystem", hostName()), ElementsAre(hostObject()));
    EXPECT_THAT(objectsOf("QVXZR_ComputerSystem", "BMC:-1"), ElementsAre(serviceProcessorObject()));
    EXPECT_THAT(objectsOf("QVXZR_ComputerSystem", "elsewhere"), IsEmpty());
}

TEST_F(NeighbourObjectsTest, ServiceProcessorsAreAClassOfTheirOwn) {
    EXPECT_THAT(objectsOf("QVXZR_SPComputerSystem", ""), ElementsAre(serviceProcessorObject()));
    setTree({host({})});
    EXPECT_THAT(objectsOf("QVXZR_SPComputerSystem", ""), IsEmpty());
}

// The class of the system is the same for the service processor's interfaces: so the
// association names them.
TEST_F(NeighbourObjectsTest, IPEndpointsAreTheInterfacesThatHaveAnAddress) {
    EXPECT_THAT(objectsOf("QVXZR_IPProtocolEndpoint", ""),
                ElementsAre(withoutStates({"QVXZR_IPProtocolEndpoint",
                                           {{"SystemCreationClassName", "QVXZR_ComputerSystem"},
                                            {"SystemName", hostName()},
                                            {"CreationClassName", "QVXZR_IPProtocolEndpoint"},
                                            {"Name", "eth0"}},
                                           {{"ElementName", std::string("eth0")},
                                            {"NameFormat", std::string("NICName")},
                                            {"ProtocolIFType", ipv4},
                                            {"IPv4Address", std::string("192.0.2.10")},
                                            {"AddressOrigin", number(4)}}}),
                            withoutStates({"QVXZR_IPProtocolEndpoint",
                                           {{"SystemCreationClassName", "QVXZR_ComputerSystem"},
                                            {"SystemName", "BMC:-1"},
                                            {"CreationClassName", "QVXZR_IPProtocolEndpoint"},
                                            {"Name", "bmc0"}},
                                           {{"ElementName", std::string("bmc0")},
                                            {"NameFormat", std::string("NICName")},
                                            {"ProtocolIFType", ipv4},
                                            {"IPv4Address", std::string("192.0.2.20")},
                                            {"AddressOrigin", number(3)}}})));
}

TEST_F(NeighbourObjectsTest, EveryInterfaceHasAnAssignment) {
    const auto assignment = [](const char* id, const char* interface) {
        return NeighbourObject{
            "QVXZR_IPAssignmentSettingData",
            {{"InstanceID", id}},
            {{"ElementName", std::string(interface)}, {"AddressOrigin", number(4)}}};
    };
    EXPECT_THAT(
        objectsOf("QVXZR_IPAssignmentSettingData", ""),
        ElementsAre(assignment("Computer%eth0%dhcp", "eth0"),
                    assignment("Computer%eth1%dhcp", "eth1"), assignment("BMC%bmc0%dhcp", "bmc0")));
}

TEST_F(NeighbourObjectsTest, NameChoosesAmongComputersOnly) {
    EXPECT_EQ(objectsOf("QVXZR_IPProtocolEndpoint", "eth0").size(), 2U);
    EXPECT_EQ(objectsOf("QVXZR_IPAssignmentSettingData", "eth0").size(), 3U);
    EXPECT_EQ(objectsOf("QVXZR_SPComputerSystem", "elsewhere").size(), 1U);
}

TEST_F(NeighbourObjectsTest, ObjectsHaveTheKeysOfTheirClasses) {
    for (const char* name : {"QVXZR_ComputerSystem", "QVXZR_SPComputerSystem",
                             "QVXZR_IPProtocolEndpoint", "qvxzr_ipassignmentsettingdata"}) {
        const auto objects = objectsOf(name, "");
        ASSERT_THAT(objects, ::testing::Not(IsEmpty())) << name;
        std::vector<std::string> names;
        for (const auto& [key, value] : objects.front().keys) {
            names.push_back(key);
        }
        const auto keys = ZR::DHCPClientNeighbours::keysOf(name);
        EXPECT_EQ(names, std::vector<std::string>(keys.begin(), keys.end())) << name;
    }
    EXPECT_TRUE(ZR::DHCPClientNeighbours::keysOf("CIM_ComputerSystem").empty());
}

// A machine without a name, behind an object manager with both provider libraries.

cimom::Configuration bothProviders() {
    cimom::Configuration result;
    result.schemaDirectories = {ZR_SOURCE_DIR "/schema"};
    result.registrationFiles = {ZR_SOURCE_DIR "/schema/exact/DHCPClientProvider.registration",
                                ZR_SOURCE_DIR "/schema/exact/DHCPClientNeighbours.registration"};
    result.providerDirectories = {ZR_BINARY_DIR "/lib/cmpi"};
    return result;
}

class NamelessMachineTest : public test::TreeTest {
  protected:
    void SetUp() override {
        TreeTest::SetUp();
        if (!ZR::Testing::canEnterNamespaces()) {
            GTEST_SKIP() << "needs a UTS name space of its own";
        }
        Json eth0 = dhcpInterface("eth0", {"192.0.2.1"});
        eth0["properties"]["IPv4Address"] = "192.0.2.10";
        setTree({host({eth0}), serviceProcessor({dhcpInterface("bmc0")})});
    }

    /// The names of a class' instances, one in a line, where the host name is empty.
    static std::string namesOf(const std::string& className) {
        const auto result = ZR::Testing::inChild([&className] {
            ZR::Testing::enterNamespaces(CLONE_NEWUTS);
            if (::sethostname("", 0) != 0) {
                return std::string("the host name cannot be set");
            }
            cimom::ObjectManager manager{bothProviders()};
            const auto found =
                manager.enumerateInstanceNames(cimom::parseObjectPath("root/cimv2:" + className));
            std::string text = "code " + std::to_string(found.status.code) + "\n";
            for (const auto& path : found.paths) {
                text += toText(path.value()) + "\n";
            }
            return text;
        });
        EXPECT_EQ(result.exitStatus, 0) << result.output;
        return result.output;
    }
};

TEST_F(NamelessMachineTest, ServesTheInterfacesOfItsHost) {
    const std::string endpoints = namesOf("QVXZR_DHCPProtocolEndpoint");
    EXPECT_THAT(endpoints, HasSubstr("code 0\n"));
    EXPECT_THAT(endpoints, HasSubstr(R"(Name="eth0")"));
    EXPECT_THAT(endpoints, HasSubstr(R"(Name="bmc0")"));
    EXPECT_THAT(namesOf("QVXZR_DHCPRemoteServiceAccessPoint"), HasSubstr(R"(Name="eth0_IPv4")"));
    EXPECT_THAT(namesOf("QVXZR_DHCPCapabilities"), HasSubstr("eth0"));
    EXPECT_THAT(namesOf("QVXZR_DHCPSettingData"), HasSubstr(R"("Computer%eth0")"));
}

TEST_F(NamelessMachineTest, HasNeighboursButForTheComputerWithoutAName) {
    EXPECT_EQ(namesOf("QVXZR_ComputerSystem"), "code 0\n");
    EXPECT_THAT(namesOf("QVXZR_SPComputerSystem"), HasSubstr(R"(Name="BMC:-1")"));
    EXPECT_EQ(namesOf("QVXZR_IPProtocolEndpoint"),
              "code 0\nroot/cimv2:QVXZR_IPProtocolEndpoint."
              R"(SystemCreationClassName="QVXZR_ComputerSystem",SystemName="",)"
              R"(CreationClassName="QVXZR_IPProtocolEndpoint",Name="eth0")"
              "\n");
    EXPECT_THAT(namesOf("QVXZR_IPAssignmentSettingData"), HasSubstr(R"("Computer%eth0%dhcp")"));
}

}  // namespace
