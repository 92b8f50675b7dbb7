// What clients see of a machine that does not tell its name.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "cimom/Instance.h"
#include "kit/Host.h"
#include "kit/HostNameFake.h"
#include "kit/LogCapture.h"
#include "kit/Tree.h"
#include "zrclient/InstrumentationService.h"

namespace {

using test::dhcpInterface;
using test::Host;
using test::keyOf;
using test::pathOf;
using test::textOf;
using ::testing::SizeIs;
using ZR::Testing::LogCapture;

class HostNameTest : public test::TreeTest, public ::testing::WithParamInterface<const char*> {
  protected:
    void SetUp() override {
        TreeTest::SetUp();
        setTree({test::host({dhcpInterface("eth0", {"192.0.2.1"})})});
        // The source has a diagnostic of its own when it cannot fill in the name.
        static_cast<void>(ZR::InstrumentationService::process().current());
    }

    Host host_;
};

TEST_P(HostNameTest, ThatCannotBeHadIsLeftOutOfKeysAndPropertiesAndToldByItsGetter) {
    const ZR::Testing::HostNameFails failing;
    const LogCapture log(6000, 6000);
    const Host::Response names = host_.enumerateNames(pathOf(GetParam()));
    EXPECT_EQ(names.code, CMPI_RC_OK);
    ASSERT_THAT(names.paths, SizeIs(1));
    EXPECT_EQ(names.paths[0]->key("SystemName"), nullptr);
    EXPECT_THAT(names.paths[0]->keys, SizeIs(3));
    ASSERT_THAT(log.log(), SizeIs(1));
    EXPECT_EQ(log.logMessages(), log.traceMessages());
    EXPECT_EQ(log.log()[0].function, "getSystemName");
    EXPECT_EQ(log.log()[0].file, "Lindows/" + std::string(GetParam()).substr(6));
    EXPECT_TRUE(log.log()[0].message.ends_with("gethostname Failed"));
    const Host::Response instances = host_.enumerate(pathOf(GetParam()));
    ASSERT_THAT(instances.instances, SizeIs(1));
    EXPECT_EQ(instances.instances[0]->property("SystemName"), nullptr);
    EXPECT_EQ(textOf(*instances.instances[0], "SystemCreationClassName"), "QVXZR_ComputerSystem");
    EXPECT_NE(instances.instances[0]->property("Name"), nullptr);
    // Once more for the path, and once for the property.
    EXPECT_THAT(log.log(), SizeIs(3));
}

TEST_P(HostNameTest, ThatIsEmptyIsAnEmptyKeyAndProperty) {
    const ZR::Testing::HostNameIsEmpty empty;
    const LogCapture log(6000, 6000);
    const Host::Response instances = host_.enumerate(pathOf(GetParam()));
    ASSERT_THAT(instances.instances, SizeIs(1));
    EXPECT_EQ(keyOf(instances.instances[0]->path, "SystemName"), "");
    EXPECT_EQ(textOf(*instances.instances[0], "SystemName"), "");
    EXPECT_THAT(log.log(), SizeIs(0));
}

INSTANTIATE_TEST_SUITE_P(Classes, HostNameTest,
                         ::testing::Values("QVXZR_DHCPProtocolEndpoint",
                                           "QVXZR_DHCPRemoteServiceAccessPoint"),
                         [](const auto& each) { return std::string(each.param).substr(6); });

TEST_F(HostNameTest, IsNotNeededByTheOtherClasses) {
    const ZR::Testing::HostNameFails failing;
    const LogCapture log(6000, 6000);
    for (const char* name : {"QVXZR_DHCPSettingData", "QVXZR_DHCPCapabilities"}) {
        EXPECT_THAT(host_.enumerate(pathOf(name)).instances, SizeIs(1)) << name;
    }
    EXPECT_THAT(log.log(), SizeIs(0));
}

}  // namespace
