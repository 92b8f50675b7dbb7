#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "kit/StrictHost.h"
#include "kit/Tree.h"

namespace {

using ::testing::SizeIs;

class GatewayTest : public test::TreeTest {
  protected:
    strict::StrictHost host_{ZR_SOURCE_DIR "/schema",
                             {ZR_SOURCE_DIR "/schema/DHCPClient.registration"},
                             ZR_BINARY_DIR "/lib/cmpi"};
};

TEST_F(GatewayTest, ServesAllClassesFromOneLibrary) {
    test::Json eth0 = test::dhcpInterface("eth0", {"192.0.2.1"});
    eth0["properties"]["IPv4Address"] = "192.0.2.10";
    setTree({test::host({eth0})});
    EXPECT_THAT(host_.registrations(), SizeIs(15));
    for (const auto& registration : host_.registrations()) {
        const auto response = host_.enumerateNames({"", "root/cimv2", registration.className, {}});
        const bool absent = registration.className == "QVXZR_SPComputerSystem";
        EXPECT_THAT(response.paths, SizeIs(absent ? 0 : 1)) << registration.className;
    }
}

}  // namespace
