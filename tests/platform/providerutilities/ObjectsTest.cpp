#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "ProviderUtilitiesFixture.h"
#include "providerutilities/ProviderUtilities.h"

namespace ZR {

// Object paths and instances themselves.

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

// Every function takes null for every pointer: nothing is dereferenced, and
// outputs stay as they were.

namespace {

constexpr const CMPIBroker* noBroker = nullptr;
constexpr CMPIObjectPath* noPath = nullptr;
constexpr CMPIInstance* noInstance = nullptr;
constexpr const char* noName = nullptr;

using Utilities = ProviderUtilities;

class NullArgumentsTest : public Testing::ProviderUtilitiesTest {
  protected:
    void SetUp() override {
        path_ = Utilities::createObjectPath(broker, "TEST_Element", nameSpace);
        addTextKey(path_, "InstanceID", "x");
        instance_ = Utilities::createInstance(broker, path_);
        ASSERT_NE(instance_, nullptr);
    }
    void TearDown() override {
        EXPECT_EQ(text_, "before");
        EXPECT_EQ(Utilities::getKeyCount(path_), 1U);
        EXPECT_EQ(instance_->ft->getPropertyCount(instance_, nullptr), 0U);
    }

    CMPIObjectPath* path_ = nullptr;
    CMPIInstance* instance_ = nullptr;
    std::string text_ = "before";
    Moniker moniker_;
};

TEST_F(NullArgumentsTest, CreationReturnsNull) {
    EXPECT_EQ(Utilities::createObjectPath(noBroker, "C", nameSpace), nullptr);
    EXPECT_EQ(Utilities::createObjectPath(broker, noName, nameSpace), nullptr);
    EXPECT_EQ(Utilities::createInstance(noBroker, path_), nullptr);
    EXPECT_EQ(Utilities::createInstance(broker, noPath), nullptr);
}

TEST_F(NullArgumentsTest, ReadsOfAPathFindNothing) {
    CMPIObjectPath* reference = path_;
    EXPECT_EQ(Utilities::getNamespace(noPath), "");
    EXPECT_EQ(Utilities::getKeyCount(noPath), 0U);
    EXPECT_FALSE(Utilities::getKeyProperty(noPath, "InstanceID", text_));
    EXPECT_FALSE(Utilities::getKeyProperty(path_, noName, text_));
    EXPECT_FALSE(Utilities::getKeyProperty(noPath, "Other", &reference));
    EXPECT_FALSE(Utilities::getKeyProperty(path_, noName, &reference));
    EXPECT_FALSE(Utilities::getKeyProperty(path_, "Other", nullptr));
    EXPECT_EQ(reference, path_);
}

TEST_F(NullArgumentsTest, KeysAreNotSet) {
    EXPECT_FALSE(Utilities::setKeyProperty(noPath, "InstanceID", std::string("x")));
    EXPECT_FALSE(Utilities::setKeyProperty(path_, noName, std::string("x")));
    EXPECT_FALSE(Utilities::setKeyProperty(noPath, "Other", path_));
    EXPECT_FALSE(Utilities::setKeyProperty(path_, noName, path_));
    EXPECT_FALSE(Utilities::setKeyProperty(path_, "Other", noPath));
}

template <typename Value>
void expectNotSet(CMPIInstance* instance, const Value& value) {
    EXPECT_FALSE(Utilities::setProperty(noInstance, "P", value));
    EXPECT_FALSE(Utilities::setProperty(instance, noName, value));
}

TEST_F(NullArgumentsTest, PropertiesAreNotSet) {
    expectNotSet(instance_, std::string("x"));
    expectNotSet(instance_, static_cast<unsigned short>(1));
    expectNotSet(instance_, 1U);
    expectNotSet(instance_, 1ULL);
    expectNotSet(instance_, true);
    expectNotSet(instance_, path_);
    EXPECT_FALSE(Utilities::setProperty(instance_, "Other", noPath));
    const std::string moment = "20261120081530.123456+060";
    for (const bool dateTime : {false, true}) {
        EXPECT_FALSE(Utilities::setProperty(noBroker, instance_, "P", moment, dateTime));
        EXPECT_FALSE(Utilities::setProperty(broker, noInstance, "P", moment, dateTime));
        EXPECT_FALSE(Utilities::setProperty(broker, instance_, noName, moment, dateTime));
    }
}

TEST_F(NullArgumentsTest, ListsAreNotSet) {
    const std::vector<unsigned short> numbers{1};
    EXPECT_FALSE(Utilities::setProperty(noBroker, instance_, "P", numbers));
    EXPECT_FALSE(Utilities::setProperty(broker, noInstance, "P", numbers));
    EXPECT_FALSE(Utilities::setProperty(broker, instance_, noName, numbers));
    const std::vector<std::string> texts{"x"};
    EXPECT_FALSE(Utilities::setProperty(noBroker, instance_, "P", texts));
    EXPECT_FALSE(Utilities::setProperty(broker, noInstance, "P", texts));
    EXPECT_FALSE(Utilities::setProperty(broker, instance_, noName, texts));
}

TEST_F(NullArgumentsTest, PropertiesAreNotRead) {
    for (const bool dateTime : {false, true}) {
        EXPECT_FALSE(Utilities::getProperty(noInstance, "P", text_, dateTime));
        EXPECT_FALSE(Utilities::getProperty(instance_, noName, text_, dateTime));
    }
}

TEST_F(NullArgumentsTest, MonikersAreNotConverted) {
    moniker_.addKey("Name", "x");
    const Moniker before = moniker_;
    EXPECT_FALSE(Utilities::transformObjectPathToMoniker(noPath, moniker_));
    EXPECT_EQ(moniker_, before);
    EXPECT_FALSE(Utilities::transformMonikerToObjectPath(moniker_, nullptr));
    CMPIObjectPath* path = nullptr;
    EXPECT_FALSE(Utilities::transformMonikerToObjectPath(moniker_, &path));
    EXPECT_EQ(path, nullptr);
}

}  // namespace

}  // namespace ZR
