#include "CMPI/CMPIDHCPProtocolEndpoint.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimom/Instance.h"
#include "kit/Host.h"
#include "kit/LogCapture.h"
#include "kit/Tree.h"

namespace {

using test::dhcpInterface;
using test::Fault;
using test::Function;
using test::host;
using test::Host;
using test::keyOf;
using test::keysOf;
using test::pathOf;
using test::serviceProcessor;
using test::staticInterface;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using ZR::Testing::LogCapture;

constexpr const char* endpointClass = "QVXZR_DHCPProtocolEndpoint";

class CMPIDHCPProtocolEndpointTest : public test::TreeTest {
  protected:
    Host host_{Host::Neighbours::absent, Host::Calls::counted};
};

std::vector<std::string> propertyNames(const cimom::Instance& instance) {
    std::vector<std::string> names;
    for (const auto& property : instance.properties) {
        names.push_back(property.name);
    }
    return names;
}

TEST_F(CMPIDHCPProtocolEndpointTest, PathHasTheFourKeysInTheirOrder) {
    setTree({host({dhcpInterface("eth0")})});
    const Host::Response response = host_.enumerateNames(pathOf(endpointClass));
    ASSERT_THAT(response.paths, SizeIs(1));
    cimom::ObjectPath expected =
        pathOf(endpointClass, {{"SystemCreationClassName", "QVXZR_ComputerSystem"},
                               {"SystemName", hostName()},
                               {"CreationClassName", endpointClass},
                               {"Name", "eth0"}});
    EXPECT_EQ(*response.paths[0], expected);
    std::vector<std::string> order;
    for (const auto& key : response.paths[0]->keys) {
        order.push_back(key.name);
    }
    EXPECT_THAT(order,
                ElementsAre("SystemCreationClassName", "SystemName", "CreationClassName", "Name"));
}

TEST_F(CMPIDHCPProtocolEndpointTest, InstanceHasJustThePropertiesThatAreKnown) {
    setTree({host({dhcpInterface("eth0")})});
    const Host::Response response = host_.enumerate(pathOf(endpointClass));
    ASSERT_THAT(response.instances, SizeIs(1));
    const cimom::Instance& instance = *response.instances[0];
    EXPECT_THAT(propertyNames(instance),
                ::testing::UnorderedElementsAre(
                    "ElementName", "RequestedState", "SystemCreationClassName", "SystemName",
                    "CreationClassName", "Description", "EnabledState", "Name", "NameFormat",
                    "ProtocolIFType", "OtherTypeDescription", "ClientState", "OptionsReceived"));
    EXPECT_EQ(test::textOf(instance, "ElementName"), "eth0");
    EXPECT_EQ(test::numberOf(instance, "RequestedState"), 2U);
    EXPECT_EQ(test::textOf(instance, "SystemCreationClassName"), "QVXZR_ComputerSystem");
    EXPECT_EQ(test::textOf(instance, "SystemName"), hostName());
    EXPECT_EQ(test::textOf(instance, "CreationClassName"), endpointClass);
    EXPECT_EQ(test::textOf(instance, "Description"), "Ethernet interface eth0");
    EXPECT_EQ(test::numberOf(instance, "EnabledState"), 2U);
    EXPECT_EQ(test::textOf(instance, "Name"), "eth0");
    EXPECT_EQ(test::textOf(instance, "NameFormat"), "NICName");
    EXPECT_EQ(test::numberOf(instance, "ProtocolIFType"), 1U);
    EXPECT_EQ(test::textOf(instance, "OtherTypeDescription"), "DHCP");
    EXPECT_EQ(test::numberOf(instance, "ClientState"), 8U);
    const cimom::Value* options = instance.property("OptionsReceived");
    ASSERT_NE(options, nullptr);
    EXPECT_EQ(options->type, cimom::Type::uint16);
    ASSERT_NE(options->array(), nullptr);
    EXPECT_THAT(*options->array(),
                ElementsAre(cimom::Scalar(std::uint64_t{8}), cimom::Scalar(std::uint64_t{14}),
                            cimom::Scalar(std::uint64_t{17})));
}

TEST_F(CMPIDHCPProtocolEndpointTest, EndpointWithoutALeaseHasNoLeaseProperties) {
    setTree({host({dhcpInterface("eth0")})});
    const Host::Response response = host_.enumerate(pathOf(endpointClass));
    ASSERT_THAT(response.instances, SizeIs(1));
    for (const char* name : {"LeaseObtained", "LeaseExpires", "LeaseTime", "RenewalTime",
                             "RebindingTime", "InstallDate", "Caption"}) {
        EXPECT_EQ(response.instances[0]->property(name), nullptr) << name;
    }
}

TEST_F(CMPIDHCPProtocolEndpointTest, StatesThatCannotBeReadAreZero) {
    setTree({host({test::interface("eth0", {{"DHCPEnabled", true}, {"AddressSource", 1}})})});
    const Host::Response response = host_.enumerate(pathOf(endpointClass));
    ASSERT_THAT(response.instances, SizeIs(1));
    EXPECT_EQ(test::numberOf(*response.instances[0], "EnabledState"), 0U);
    EXPECT_EQ(test::numberOf(*response.instances[0], "ClientState"), 0U);
}

TEST_F(CMPIDHCPProtocolEndpointTest, PathWithoutKeysGivesEveryEndpoint) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")})});
    EXPECT_THAT(keysOf(host_.enumerateNames(pathOf(endpointClass)), "Name"),
                ElementsAre("eth0", "eth1"));
    const cimom::broker::RequestScope scope;
    ZR::DHCPClientProvider::CMPIDHCPProtocolEndpoint all(host_.broker(), nullptr, "root/cimv2");
    unsigned count = 0;
    for (; all; ++all) {
        ++count;
    }
    EXPECT_EQ(count, 2U);
}

TEST_F(CMPIDHCPProtocolEndpointTest, NameAloneOrSystemNameAloneFilterByThatAlone) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth1")}),
             serviceProcessor({dhcpInterface("eth0")})});
    const auto byName = host_.enumerateNames(pathOf(endpointClass, {{"Name", "eth0"}}));
    EXPECT_THAT(keysOf(byName, "SystemName"), ElementsAre(hostName(), "BMC:-1"));
    const auto bySystem = host_.enumerateNames(pathOf(endpointClass, {{"SystemName", "BMC:-1"}}));
    EXPECT_THAT(keysOf(bySystem, "Name"), ElementsAre("eth0"));
    EXPECT_THAT(keysOf(bySystem, "SystemCreationClassName"), ElementsAre("QVXZR_SPComputerSystem"));
}

TEST_F(CMPIDHCPProtocolEndpointTest, OtherKeysAreNotCompared) {
    setTree({host({dhcpInterface("eth0")})});
    const auto response = host_.enumerateNames(pathOf(
        endpointClass,
        {{"CreationClassName", "Another_Class"}, {"SystemCreationClassName", "Another_System"}}));
    EXPECT_THAT(keysOf(response, "Name"), ElementsAre("eth0"));
}

TEST_F(CMPIDHCPProtocolEndpointTest, KeysThatMatchNothingGiveAnEmptyWalk) {
    setTree({host({dhcpInterface("eth0")})});
    EXPECT_THAT(host_.enumerateNames(pathOf(endpointClass, {{"Name", "eth7"}})).paths, IsEmpty());
}

TEST_F(CMPIDHCPProtocolEndpointTest, PropertyListDoesNotShrinkTheInstance) {
    setTree({host({dhcpInterface("eth0")})});
    const char* list[] = {"Name", nullptr};
    const Host::Response response = host_.enumerate(pathOf(endpointClass), list);
    ASSERT_THAT(response.instances, SizeIs(1));
    EXPECT_THAT(response.instances[0]->properties, SizeIs(13));
}

TEST_F(CMPIDHCPProtocolEndpointTest, KeyWhoseGetterFailsIsLeftOut) {
    setTree({host({{{"type", "NetworkInterface"},
                    {"description", "nameless"},
                    {"properties", {{"DHCPEnabled", true}}}}})});
    const Host::Response response = host_.enumerate(pathOf(endpointClass));
    ASSERT_THAT(response.instances, SizeIs(1));
    // A name that cannot be read is the empty name; there is no element name then.
    EXPECT_EQ(test::textOf(*response.instances[0], "Name"), "");
    EXPECT_EQ(response.instances[0]->property("ElementName"), nullptr);
}

TEST_F(CMPIDHCPProtocolEndpointTest, AnAdapterPastItsEndHasNoPath) {
    setTree({host({staticInterface("eth0")})});
    const cimom::broker::RequestScope scope;
    ZR::DHCPClientProvider::CMPIDHCPProtocolEndpoint adapter(host_.broker(), nullptr, "root/cimv2");
    EXPECT_NE(adapter.getObjectPath(), nullptr);  // on the interface without DHCP
    EXPECT_FALSE(static_cast<bool>(adapter));
    EXPECT_EQ(adapter.getObjectPath(), nullptr);
    EXPECT_EQ(adapter.getCMPIInstance(nullptr), nullptr);
}

TEST_F(CMPIDHCPProtocolEndpointTest, NullPathLeavesTheAdapterUnfiltered) {
    setTree({host({dhcpInterface("eth0")})});
    const cimom::broker::RequestScope scope;
    ZR::DHCPClientProvider::CMPIDHCPProtocolEndpoint adapter(
        host_.broker(), nullptr, static_cast<const CMPIObjectPath*>(nullptr));
    EXPECT_TRUE(static_cast<bool>(adapter));
}

TEST_F(CMPIDHCPProtocolEndpointTest, NullFromTheBrokerGivesNull) {
    setTree({host({dhcpInterface("eth0")})});
    const cimom::broker::RequestScope scope;
    ZR::DHCPClientProvider::CMPIDHCPProtocolEndpoint adapter(host_.broker(), nullptr, "root/cimv2");
    host_.counted().fail(Function::newObjectPath, 1, Fault::null);
    EXPECT_EQ(adapter.getObjectPath(), nullptr);
    host_.counted().fail(Function::newObjectPath, 1, Fault::status);
    EXPECT_EQ(adapter.getCMPIInstance(nullptr), nullptr);
    host_.counted().fail(Function::newInstance, 1, Fault::null);
    EXPECT_EQ(adapter.getCMPIInstance(nullptr), nullptr);
}

TEST_F(CMPIDHCPProtocolEndpointTest, TracesItsOperationsInItsOwnName) {
    setTree({host({dhcpInterface("eth0")})});
    const LogCapture log;
    host_.enumerate(pathOf(endpointClass, {{"Name", "eth0"}}));
    std::vector<std::string> own;
    for (const auto& line : log.log()) {
        if (line.file == "CMPI/CMPIDHCPProtocolEndpoint") {
            own.push_back(std::to_string(line.level) + " " + line.function + " " +
                          line.message.substr(0, line.message.find_first_of(":(")));
        }
    }
    EXPECT_THAT(
        own, ElementsAre("3000 CMPIDHCPProtocolEndpoint ENTERING", "3000 setObjectPath ENTERING",
                         "4000 setObjectPath VARIABLE", "3000 setObjectPath EXITING",
                         "3000 CMPIDHCPProtocolEndpoint EXITING", "4000 operator\\x20bool METHOD",
                         "3000 getCMPIInstance ENTERING", "4000 getObjectPath ENTERING",
                         "4000 getObjectPath EXITING", "3000 getCMPIInstance EXITING",
                         "4000 operator++ METHOD", "4000 operator\\x20bool METHOD",
                         "4000 ~CMPIDHCPProtocolEndpoint METHOD"));
}

}  // namespace
