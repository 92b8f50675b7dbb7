// Object paths and instances themselves.
#include <gtest/gtest.h>

#include <string>

#include "ProviderUtilitiesFixture.h"
#include "providerutilities/ProviderUtilities.h"

namespace ZR {

namespace {

using ObjectsTest = Testing::ProviderUtilitiesTest;

TEST_F(ObjectsTest, PathHasItsClassAndNamespaceAndNoKeys) {
    const CMPIObjectPath* path =
        ProviderUtilities::createObjectPath(broker, "TEST_Element", "root/test");
    ASSERT_NE(path, nullptr);
    EXPECT_EQ(textOf(path->ft->getClassName(path, nullptr)), "TEST_Element");
    EXPECT_EQ(ProviderUtilities::getNamespace(path), "root/test");
    EXPECT_EQ(ProviderUtilities::getKeyCount(path), 0U);
}

TEST_F(ObjectsTest, NamespaceMayBeEmpty) {
    const CMPIObjectPath* path = ProviderUtilities::createObjectPath(broker, "TEST_Element", "");
    ASSERT_NE(path, nullptr);
    EXPECT_EQ(ProviderUtilities::getNamespace(path), "");
}

TEST_F(ObjectsTest, HostsMayReportAMissingNamespaceAsNull) {
    // Ours reports an empty text.
    CMPIObjectPathFT functions = *newPath("")->ft;
    functions.getNameSpace = [](const CMPIObjectPath*, CMPIStatus*) -> CMPIString* {
        return nullptr;
    };
    const CMPIObjectPath path{nullptr, &functions};
    EXPECT_EQ(ProviderUtilities::getNamespace(&path), "");
}

TEST_F(ObjectsTest, InstanceHasTheKeysOfItsPath) {
    CMPIObjectPath* path = ProviderUtilities::createObjectPath(broker, "TEST_Element", "root/test");
    ASSERT_TRUE(ProviderUtilities::setKeyProperty(path, "InstanceID", std::string("x")));
    const CMPIInstance* instance = ProviderUtilities::createInstance(broker, path);
    ASSERT_NE(instance, nullptr);
    EXPECT_EQ(textOf(instance->ft->getObjectPath(instance, nullptr)), textOf(path));
}

TEST_F(ObjectsTest, BrokerThatRefusesGivesNull) {
    Testing::AlteredBroker altered(broker);
    altered.functions.newObjectPath = [](const CMPIBroker*, const char*, const char*,
                                         CMPIStatus* rc) -> CMPIObjectPath* {
        *rc = {CMPI_RC_ERR_FAILED, nullptr};
        return nullptr;
    };
    altered.functions.newInstance = [](const CMPIBroker*, const CMPIObjectPath*,
                                       CMPIStatus* rc) -> CMPIInstance* {
        *rc = {CMPI_RC_ERR_FAILED, nullptr};
        return nullptr;
    };
    EXPECT_EQ(ProviderUtilities::createObjectPath(altered.record(), "C", nameSpace), nullptr);
    EXPECT_EQ(ProviderUtilities::createInstance(altered.record(), newPath("C")), nullptr);
}

TEST_F(ObjectsTest, ObjectThatComesWithAnErrorIsNone) {
    Testing::AlteredBroker altered(broker);
    static CMPIObjectPath* path = nullptr;
    path = newPath("C");
    altered.functions.newObjectPath = [](const CMPIBroker*, const char*, const char*,
                                         CMPIStatus* rc) {
        *rc = {CMPI_RC_ERR_FAILED, nullptr};
        return path;
    };
    EXPECT_EQ(ProviderUtilities::createObjectPath(altered.record(), "C", nameSpace), nullptr);
}

}  // namespace

}  // namespace ZR
