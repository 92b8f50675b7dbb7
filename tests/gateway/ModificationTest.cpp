#include <linux/capability.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <array>
#include <filesystem>

#include "GatewayFixture.h"
#include "kit/Files.h"

namespace gateway {
namespace {

using cimom::Value;
using ::testing::HasSubstr;
using ZR::Testing::readFile;
using ZR::Testing::writeFile;

/// As long as it lives, this thread may not write what its user may not.
class WithoutPrivilege {
  public:
    WithoutPrivilege() {
        EXPECT_EQ(::syscall(SYS_capget, &header_, before_.data()), 0);
        Data without = before_;
        without.front().effective &= ~(1U << CAP_DAC_OVERRIDE);
        EXPECT_EQ(::syscall(SYS_capset, &header_, without.data()), 0);
    }
    ~WithoutPrivilege() { EXPECT_EQ(::syscall(SYS_capset, &header_, before_.data()), 0); }
    WithoutPrivilege(const WithoutPrivilege&) = delete;
    WithoutPrivilege& operator=(const WithoutPrivilege&) = delete;

  private:
    using Data = std::array<__user_cap_data_struct, 2>;

    __user_cap_header_struct header_{_LINUX_CAPABILITY_VERSION_3, 0};
    Data before_{};
};

class ModificationTest : public GatewayTest {
  protected:
    void SetUp() override {
        GatewayTest::SetUp();
        writeFile(file(), "CONFIG_NAME=office\n");
    }

    static std::string file() { return dataDirectory() + "ifcfg-eth0"; }

    using Properties = std::vector<cimom::NamedValue>;

    strict::StrictHost::Response modify(Properties properties, const char** list = nullptr) {
        return host_.modify({setting("Computer%eth0"), std::move(properties)}, list);
    }

    static Properties named(const std::string& name) {
        return {{"ConfigurationName", Value::ofString(name)}};
    }
};

TEST_F(ModificationTest, ChangesTheName) {
    EXPECT_EQ(modify(named("home")).code, CMPI_RC_OK);
    EXPECT_EQ(readFile(file()), "CONFIG_NAME=home\n");
    EXPECT_EQ(modify(named("")).code, CMPI_RC_OK);
    EXPECT_EQ(readFile(file()), "CONFIG_NAME=\n");
}

TEST_F(ModificationTest, WhatIsNotNamedKeepsItsValue) {
    EXPECT_EQ(modify({{"ElementName", Value::ofString("eth0")}}).code, CMPI_RC_OK);
    EXPECT_EQ(modify({}).code, CMPI_RC_OK);
    EXPECT_EQ(readFile(file()), "CONFIG_NAME=office\n");
}

TEST_F(ModificationTest, ThePropertyListCounts) {
    std::array<const char*, 1> none{nullptr};
    EXPECT_EQ(modify(named("home"), none.data()).code, CMPI_RC_OK);
    std::array<const char*, 2> other{"InstanceID", nullptr};
    auto both = named("home");
    both.push_back({"InstanceID", Value::ofString("Computer%eth0")});
    EXPECT_EQ(modify(both, other.data()).code, CMPI_RC_OK);
    EXPECT_EQ(readFile(file()), "CONFIG_NAME=office\n");
    std::array<const char*, 2> name{"CONFIGURATIONNAME", nullptr};
    both.push_back({"ElementName", Value::ofString("another")});
    EXPECT_EQ(modify(both, name.data()).code, CMPI_RC_OK);
    EXPECT_EQ(readFile(file()), "CONFIG_NAME=home\n");
    // Listed and not there: it has no value.
    EXPECT_EQ(modify({}, name.data()).code, CMPI_RC_OK);
    EXPECT_EQ(readFile(file()), "CONFIG_NAME=\n");
}

TEST_F(ModificationTest, TheWholeInstanceCanBeSentBack) {
    cimom::Instance instance = host_.get(setting("Computer%eth0")).instances.at(0);
    for (cimom::NamedValue& property : instance.properties) {
        if (property.name == "ConfigurationName") {
            property.value = Value::ofString("home");
        }
    }
    EXPECT_EQ(host_.modify(instance).code, CMPI_RC_OK);
    EXPECT_EQ(readFile(file()), "CONFIG_NAME=home\n");
}

TEST_F(ModificationTest, APropertyThatCannotBeChangedIsRefused) {
    auto properties = named("home");
    properties.push_back({"ElementName", Value::ofString("another")});
    const auto response = modify(properties);
    EXPECT_EQ(response.code, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(response.message,
              "the property ElementName of QVXZR_DHCPSettingData cannot be changed");
    EXPECT_EQ(readFile(file()), "CONFIG_NAME=office\n");
    const auto endpoints = host_.modify({endpoint("eth0"), {{"NameFormat", Value::ofString("x")}}});
    EXPECT_EQ(endpoints.code, CMPI_RC_ERR_NOT_SUPPORTED);
    std::array<const char*, 2> unknown{"NoSuchProperty", nullptr};
    EXPECT_EQ(modify({}, unknown.data()).code, CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

TEST_F(ModificationTest, OnlyWhatExistsIsChanged) {
    writeFile(dataDirectory() + "ifcfg-eth9", "CONFIG_NAME=office\n");
    const auto response = host_.modify({setting("Computer%eth9"), named("home")});
    EXPECT_EQ(response.code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(response.message, "there is no QVXZR_DHCPSettingData.InstanceID=\"Computer%eth9\"");
    EXPECT_EQ(readFile(dataDirectory() + "ifcfg-eth9"), "CONFIG_NAME=office\n");
}

TEST_F(ModificationTest, AChangeThatDidNotTakePlaceHasItsReason) {
    auto response = modify(named("two\nlines"));
    EXPECT_EQ(response.code, CMPI_RC_ERR_FAILED);
    EXPECT_THAT(response.message, HasSubstr("line break"));
    response = modify(named(" blanks "));
    EXPECT_EQ(response.code, CMPI_RC_ERR_FAILED);
    EXPECT_THAT(response.message, HasSubstr("gives the name \"blanks\", not \" blanks \""));
    std::filesystem::remove(file());
    response = modify(named("home"));
    EXPECT_EQ(response.code, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(response.message, file() + ": No such file or directory");
    EXPECT_FALSE(std::filesystem::exists(file()));
}

TEST_F(ModificationTest, AFileThatMayNotBeWrittenIsToldAsSuch) {
    const WithoutPrivilege ordinary;
    ASSERT_EQ(::chmod(file().c_str(), 0444), 0);
    const auto response = modify(named("home"));
    EXPECT_EQ(response.code, CMPI_RC_ERR_ACCESS_DENIED);
    EXPECT_EQ(response.message, file() + " cannot be written: Permission denied");
}

}  // namespace
}  // namespace gateway
