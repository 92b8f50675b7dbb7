#include "CMPI/CMPIDHCPRemoteServiceAccessPoint.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>

#include "CMPI/ElementTables.h"
#include "cimom/Instance.h"
#include "kit/Host.h"
#include "kit/Tree.h"

namespace {

using test::dhcpInterface;
using test::host;
using test::Host;
using test::keysOf;
using test::pathOf;
using test::serviceProcessor;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

constexpr const char* accessPointClass = "QVXZR_DHCPRemoteServiceAccessPoint";

class CMPIDHCPRemoteServiceAccessPointTest : public test::TreeTest {
  protected:
    Host host_;
};

TEST_F(CMPIDHCPRemoteServiceAccessPointTest, OneInstancePerServerAddress) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1", "2001:db8::1"}), dhcpInterface("eth1")})});
    const Host::Response response = host_.enumerate(pathOf(accessPointClass));
    ASSERT_THAT(response.instances, SizeIs(2));
    const cimom::Instance& first = *response.instances[0];
    EXPECT_EQ(test::textOf(first, "ElementName"), "DHCP Server");
    EXPECT_EQ(test::textOf(first, "AccessInfo"), "192.0.2.1");
    EXPECT_EQ(test::numberOf(first, "InfoFormat"), 3U);
    EXPECT_EQ(test::numberOf(first, "AccessContext"), 7U);
    EXPECT_EQ(test::textOf(first, "SystemCreationClassName"), "QVXZR_ComputerSystem");
    EXPECT_EQ(test::textOf(first, "SystemName"), hostName());
    EXPECT_EQ(test::textOf(first, "CreationClassName"), accessPointClass);
    EXPECT_EQ(test::textOf(first, "Name"), "eth0_IPv4");
    EXPECT_THAT(first.properties, SizeIs(8));
    const cimom::Instance& second = *response.instances[1];
    EXPECT_EQ(test::textOf(second, "AccessInfo"), "2001:db8::1");
    EXPECT_EQ(test::numberOf(second, "InfoFormat"), 4U);
    EXPECT_EQ(test::textOf(second, "Name"), "eth0_IPv6");
}

TEST_F(CMPIDHCPRemoteServiceAccessPointTest, ServerOfTheServiceProcessorHasTheHostsName) {
    setTree({serviceProcessor({dhcpInterface("bmc0", {"192.0.2.1"})})});
    const Host::Response response = host_.enumerateNames(pathOf(accessPointClass));
    EXPECT_THAT(keysOf(response, "SystemName"), ElementsAre(hostName()));
    EXPECT_THAT(keysOf(response, "SystemCreationClassName"), ElementsAre("QVXZR_SPComputerSystem"));
}

TEST_F(CMPIDHCPRemoteServiceAccessPointTest, NameAloneSelectsAcrossAllSystems) {
    // A name without a "_" of its own is never rejected.
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})}),
             serviceProcessor({dhcpInterface("bmc0", {"192.0.2.2"})})});
    EXPECT_THAT(
        keysOf(host_.enumerateNames(pathOf(accessPointClass, {{"Name", "eth0_IPv4"}})), "Name"),
        ElementsAre("eth0_IPv4", "bmc0_IPv4"));
}

TEST_F(CMPIDHCPRemoteServiceAccessPointTest, SystemNameOfAnotherComputerSelectsNothingFurther) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"}), dhcpInterface("eth1", {"192.0.2.2"})})});
    // The filter moves the cursor past the end, but the addresses that were loaded
    // before stay: their one record is still there, without a path to tell.
    const Host::Response response =
        host_.enumerateNames(pathOf(accessPointClass, {{"SystemName", "elsewhere"}}));
    ASSERT_THAT(response.paths, SizeIs(1));
    EXPECT_EQ(test::keyOf(*response.paths[0], "Name"), "_IPv4");
}

TEST_F(CMPIDHCPRemoteServiceAccessPointTest, NoServersGiveNothing) {
    setTree({host({dhcpInterface("eth0"), test::interface("eth1")})});
    EXPECT_THAT(host_.enumerate(pathOf(accessPointClass)).instances, IsEmpty());
}

TEST_F(CMPIDHCPRemoteServiceAccessPointTest, ServerWhoseAddressCannotBeReadHasNoAccessInfo) {
    setTree({host({dhcpInterface("eth0")})});
    const cimom::broker::RequestScope scope;
    // As the adapter fills its instance, from an access point without an address.
    using Element = ZR::DHCPClientProvider::DHCPRemoteServiceAccessPoint;
    const std::array properties{
        ZR::DHCPClientProvider::property<&Element::getElementName>("ElementName"),
        ZR::DHCPClientProvider::property<&Element::getAccessInfo>("AccessInfo")};
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const CMPIObjectPath* path =
        host_.broker()->eft->newObjectPath(host_.broker(), "root/cimv2", accessPointClass, &status);
    const CMPIInstance* instance =
        ZR::DHCPClientProvider::makeInstance<Element>(host_.broker(), path, Element(), properties);
    ASSERT_NE(instance, nullptr);
    EXPECT_EQ(instance->ft->getPropertyCount(instance, &status), 1U);
    instance->ft->getProperty(instance, "AccessInfo", &status);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

TEST_F(CMPIDHCPRemoteServiceAccessPointTest, InterfaceWhoseServersCannotBeReadHasNoAccessPoint) {
    setTree({R"({"type": "NetworkInterface", "properties": {
        "Name": "eth0", "DHCPServerAddresses": ["192.0.2.1", 2]}})"});
    EXPECT_THAT(host_.enumerate(pathOf(accessPointClass)).instances, IsEmpty());
}

TEST_F(CMPIDHCPRemoteServiceAccessPointTest, AnAdapterPastItsAddressesHasNoPathAndNoInstance) {
    setTree({host({dhcpInterface("eth0", {"192.0.2.1"})})});
    const cimom::broker::RequestScope scope;
    ZR::DHCPClientProvider::CMPIDHCPRemoteServiceAccessPoint adapter(host_.broker(), nullptr,
                                                                     "root/cimv2");
    EXPECT_NE(adapter.getObjectPath(), nullptr);
    ++adapter;
    EXPECT_FALSE(static_cast<bool>(adapter));
    EXPECT_EQ(adapter.getObjectPath(), nullptr);
    EXPECT_EQ(adapter.getCMPIInstance(nullptr), nullptr);
}

}  // namespace
