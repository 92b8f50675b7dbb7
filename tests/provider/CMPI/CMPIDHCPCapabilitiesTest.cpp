#include "CMPI/CMPIDHCPCapabilities.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimom/Instance.h"
#include "kit/Host.h"
#include "kit/Tree.h"
#include "providerutilities/ProviderUtilities.h"

namespace {

using test::dhcpInterface;
using test::host;
using test::Host;
using test::keysOf;
using test::pathOf;
using test::staticInterface;
using ::testing::ElementsAre;
using ::testing::SizeIs;

constexpr const char* capabilitiesClass = "QVXZR_DHCPCapabilities";

class CMPIDHCPCapabilitiesTest : public test::TreeTest {
  protected:
    Host host_;
};

TEST_F(CMPIDHCPCapabilitiesTest, PathWithoutInstanceIDGivesEveryInstance) {
    setTree({host({dhcpInterface("eth0"), staticInterface("eth1"), dhcpInterface("eth2")})});
    EXPECT_THAT(keysOf(host_.enumerateNames(pathOf(capabilitiesClass)), "InstanceID"),
                ElementsAre("eth0", "eth2"));
    EXPECT_THAT(
        keysOf(host_.enumerateNames(pathOf(capabilitiesClass, {{"Name", "eth0"}})), "InstanceID"),
        ElementsAre("eth0", "eth2"));
}

TEST_F(CMPIDHCPCapabilitiesTest, InstanceIDSelectsOne) {
    setTree({host({dhcpInterface("eth0"), dhcpInterface("eth2")})});
    EXPECT_THAT(keysOf(host_.enumerateNames(pathOf(capabilitiesClass, {{"InstanceID", "eth2"}})),
                       "InstanceID"),
                ElementsAre("eth2"));
}

TEST_F(CMPIDHCPCapabilitiesTest, InstanceHasWhatIsKnownAndNothingElse) {
    auto writable = dhcpInterface("eth0");
    auto readOnly = dhcpInterface("eth1");
    readOnly["readOnly"] = {"Name"};
    auto bare = test::interface("eth2", {{"DHCPEnabled", true}});
    setTree({host({writable, readOnly, bare})});
    const Host::Response response = host_.enumerate(pathOf(capabilitiesClass));
    ASSERT_THAT(response.instances, SizeIs(3));
    const auto edit = [&](std::size_t i) {
        const cimom::Value* value = response.instances[i]->property("ElementNameEditSupported");
        return value != nullptr && std::get<bool>(*value->scalar());
    };
    EXPECT_TRUE(edit(0));
    EXPECT_FALSE(edit(1));
    EXPECT_EQ(test::textOf(*response.instances[0], "InstanceID"), "eth0");
    EXPECT_EQ(test::textOf(*response.instances[0], "ElementName"), "eth0");
    EXPECT_EQ(test::numberOf(*response.instances[0], "MaxElementNameLen"), 15U);
    EXPECT_EQ(response.instances[2]->property("MaxElementNameLen"), nullptr);
    for (const char* name : {"RequestedStatesSupported", "ElementNameMask", "StateAwareness"}) {
        EXPECT_EQ(response.instances[0]->property(name), nullptr) << name;
    }
    const cimom::Value* options = response.instances[0]->property("OptionsSupported");
    ASSERT_NE(options, nullptr);
    EXPECT_EQ(options->type, cimom::Type::uint16);
    ASSERT_NE(options->array(), nullptr);
    EXPECT_THAT(*options->array(), SizeIs(3));
}

TEST_F(CMPIDHCPCapabilitiesTest, AnEmptyListThatIsKnownIsAnEmptyArray) {
    setTree({host({dhcpInterface("eth0")})});
    const cimom::broker::RequestScope scope;
    CMPIObjectPath* path =
        ZR::ProviderUtilities::createObjectPath(host_.broker(), capabilitiesClass, "root/cimv2");
    CMPIInstance* instance = ZR::ProviderUtilities::createInstance(host_.broker(), path);
    ASSERT_TRUE(ZR::ProviderUtilities::setProperty(host_.broker(), instance, "OptionsSupported",
                                                   std::vector<unsigned short>{}));
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const CMPIData data = instance->ft->getProperty(instance, "OptionsSupported", &status);
    ASSERT_EQ(status.rc, CMPI_RC_OK);
    EXPECT_EQ(data.type, CMPI_uint16A);
    EXPECT_EQ(data.state & CMPI_nullValue, 0);
    EXPECT_EQ(data.value.array->ft->getSize(data.value.array, nullptr), 0U);
}

}  // namespace
