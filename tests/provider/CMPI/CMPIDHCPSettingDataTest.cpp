#include "CMPI/CMPIDHCPSettingData.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>

#include "cimom/Instance.h"
#include "kit/Files.h"
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
using ::testing::IsEmpty;
using ::testing::SizeIs;
using ZR::Testing::readFile;
using ZR::Testing::writeFile;

constexpr const char* settingClass = "QVXZR_DHCPSettingData";

class CMPIDHCPSettingDataTest : public test::TreeTest {
  protected:
    void SetUp() override {
        TreeTest::SetUp();
        auto leased = dhcpInterface("eth0");
        leased["properties"]["IPv4Address"] = "192.0.2.10";
        setTree({host({leased, staticInterface("eth1")})});
    }

    static cimom::ObjectPath pathOfSetting(const std::string& instanceId) {
        return pathOf(settingClass, {{"InstanceID", instanceId}});
    }

    /// A client's instance with these properties.
    static cimom::Instance instanceWith(std::vector<cimom::NamedValue> properties) {
        cimom::Instance instance;
        instance.path = pathOf(settingClass);
        instance.properties = std::move(properties);
        return instance;
    }

    static std::string file(const std::string& interface) {
        return dataDirectory() + "ifcfg-" + interface;
    }

    Host host_;
};

TEST_F(CMPIDHCPSettingDataTest, EveryInterfaceHasASetting) {
    EXPECT_THAT(keysOf(host_.enumerateNames(pathOf(settingClass)), "InstanceID"),
                ElementsAre("Computer%eth0", "Computer%eth1"));
    EXPECT_THAT(keysOf(host_.enumerateNames(pathOfSetting("Computer%eth1")), "InstanceID"),
                ElementsAre("Computer%eth1"));
    EXPECT_THAT(host_.enumerateNames(pathOfSetting("Computer%eth9")).paths, IsEmpty());
}

TEST_F(CMPIDHCPSettingDataTest, InstanceHasWhatIsKnownAndNothingElse) {
    writeFile(file("eth0"), "CONFIG_NAME=office\n");
    const Host::Response response = host_.enumerate(pathOf(settingClass));
    ASSERT_THAT(response.instances, SizeIs(2));
    const cimom::Instance& setting = *response.instances[0];
    EXPECT_EQ(test::textOf(setting, "InstanceID"), "Computer%eth0");
    EXPECT_EQ(test::textOf(setting, "ElementName"), "eth0");
    EXPECT_EQ(test::numberOf(setting, "AddressOrigin"), 4U);
    EXPECT_EQ(test::textOf(setting, "RequestedIPv4Address"), "192.0.2.10");
    EXPECT_EQ(test::textOf(setting, "ConfigurationName"), "office");
    for (const char* name : {"ClientIdentifier", "VendorClassIdentifier", "RequestedOptions",
                             "RequestedLeaseTime", "ChangeableType"}) {
        EXPECT_EQ(setting.property(name), nullptr) << name;
    }
    EXPECT_EQ(response.instances[1]->property("RequestedIPv4Address"), nullptr);
}

TEST_F(CMPIDHCPSettingDataTest, WithoutAFileOrWithAnEmptyNameThereIsNoConfigurationName) {
    writeFile(file("eth1"), "CONFIG_NAME=\n");
    const Host::Response response = host_.enumerate(pathOf(settingClass));
    ASSERT_THAT(response.instances, SizeIs(2));
    for (const auto& instance : response.instances) {
        EXPECT_EQ(instance->property("ConfigurationName"), nullptr);
    }
}

TEST_F(CMPIDHCPSettingDataTest, ModifyWritesTheNameIntoTheFileOfThatInterface) {
    writeFile(file("eth0"), "DEVICE=eth0\nCONFIG_NAME=old\n");
    writeFile(file("eth1"), "CONFIG_NAME=other\n");
    const auto instance = instanceWith({{"ConfigurationName", cimom::Value::ofString("office")},
                                        {"ElementName", cimom::Value::ofString("ignored")},
                                        {"InstanceID", cimom::Value::ofString("Computer%eth1")}});
    const Host::Response response = host_.modify(pathOfSetting("Computer%eth0"), &instance);
    EXPECT_EQ(response.code, CMPI_RC_OK);
    EXPECT_EQ(response.returnDoneCalls, 1U);
    EXPECT_EQ(readFile(file("eth0")), "DEVICE=eth0\nCONFIG_NAME=office\n");
    EXPECT_EQ(readFile(file("eth1")), "CONFIG_NAME=other\n");
}

TEST_F(CMPIDHCPSettingDataTest, ModifyWithoutANameOrWithNoTextClearsIt) {
    for (const auto& instance :
         {instanceWith({{"ElementName", cimom::Value::ofString("x")}}),
          instanceWith({{"ConfigurationName", cimom::Value::null(cimom::Type::string, false)}})}) {
        writeFile(file("eth0"), "CONFIG_NAME=old\n");
        EXPECT_EQ(host_.modify(pathOfSetting("Computer%eth0"), &instance).code, CMPI_RC_OK);
        EXPECT_EQ(readFile(file("eth0")), "CONFIG_NAME=\n");
    }
}

TEST_F(CMPIDHCPSettingDataTest, ModifyOfAnInterfaceWithoutAFileSucceedsWithoutEffect) {
    const auto instance = instanceWith({{"ConfigurationName", cimom::Value::ofString("office")}});
    EXPECT_EQ(host_.modify(pathOfSetting("Computer%eth0"), &instance).code, CMPI_RC_OK);
    EXPECT_FALSE(std::filesystem::exists(file("eth0")));
}

TEST_F(CMPIDHCPSettingDataTest, ModifyOfAMissingSettingTouchesNoFile) {
    writeFile(file("eth0"), "CONFIG_NAME=old\n");
    const auto instance = instanceWith({{"ConfigurationName", cimom::Value::ofString("office")}});
    EXPECT_EQ(host_.modify(pathOfSetting("Computer%eth9"), &instance).code, CMPI_RC_OK);
    EXPECT_EQ(readFile(file("eth0")), "CONFIG_NAME=old\n");
}

TEST_F(CMPIDHCPSettingDataTest, AdapterOnNothingWritesNothing) {
    writeFile(file("eth0"), "CONFIG_NAME=old\n");
    Host::Response response = host_.request(
        Host::Kind::instances, pathOfSetting("Computer%eth9"),
        [&](auto* context, auto* /*result*/, auto* path) {
            ZR::DHCPClientProvider::CMPIDHCPSettingData adapter(host_.broker(), context, path);
            EXPECT_FALSE(static_cast<bool>(adapter));
            CMPIInstance* instance = ZR::ProviderUtilities::createInstance(host_.broker(), path);
            ZR::ProviderUtilities::setProperty(instance, "ConfigurationName", std::string("x"));
            return adapter.modifyInstance(instance);
        });
    EXPECT_EQ(response.code, CMPI_RC_OK);
    EXPECT_EQ(readFile(file("eth0")), "CONFIG_NAME=old\n");
}

TEST_F(CMPIDHCPSettingDataTest, NoNewInstanceFailsAndLeavesTheFile) {
    writeFile(file("eth0"), "CONFIG_NAME=old\n");
    EXPECT_EQ(host_.modify(pathOfSetting("Computer%eth0"), nullptr).code, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(readFile(file("eth0")), "CONFIG_NAME=old\n");
}

// The getter hands out one number, where the schema has an array; it always refuses,
// so that the scalar never meets the schema. Were it to respond, a scalar would be set.
TEST_F(CMPIDHCPSettingDataTest, RequestedOptionsIsAScalarThatIsNeverTold) {
    using Getter = bool (ZR::DHCPClientProvider::DHCPSettingData::*)(unsigned short&) const;
    const Getter getter = &ZR::DHCPClientProvider::DHCPSettingData::getRequestedOptions;
    unsigned short value = 77;
    EXPECT_FALSE((ZR::DHCPClientProvider::DHCPSettingData().*getter)(value));
    EXPECT_EQ(value, 77);
}

}  // namespace
