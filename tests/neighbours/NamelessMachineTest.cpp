// A machine without a name, behind an object manager with both provider libraries.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <string>

#include "cimom/ObjectManager.h"
#include "cimom/ObjectPathText.h"
#include "cimom/Results.h"
#include "kit/ChildProcess.h"
#include "kit/PrivateNamespace.h"
#include "kit/Tree.h"

namespace {

using test::dhcpInterface;
using test::host;
using test::Json;
using test::serviceProcessor;
using ::testing::HasSubstr;

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
