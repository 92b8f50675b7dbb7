#include "NeighbourObjects.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "kit/Tree.h"

namespace {

using test::dhcpInterface;
using test::host;
using test::Json;
using test::serviceProcessor;
using test::staticInterface;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ZR::DHCPClientNeighbours::isNeighbourClass;
using ZR::DHCPClientNeighbours::NeighbourObject;
using ZR::DHCPClientNeighbours::objectsOf;

using Numbers = std::vector<unsigned short>;

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

}  // namespace
