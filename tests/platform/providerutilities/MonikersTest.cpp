#include <gtest/gtest.h>

#include <string>

#include "ProviderUtilitiesFixture.h"
#include "providerutilities/ProviderUtilities.h"

namespace ZR {

namespace {

/// "NAME=VALUE" of each key, in their order.
std::string describe(Moniker moniker) {
    std::string text;
    for (std::size_t i = 0; i < moniker.getKeyCount(); ++i) {
        std::string name;
        std::string value;
        EXPECT_TRUE(moniker.selectKey(i) && moniker.getName(name) && moniker.getValue(value));
        text += (text.empty() ? "" : " ") + name + "=" + value;
    }
    return text;
}

/// The same of a path's keys, as the broker tells them.
std::string describe(const CMPIObjectPath* path) {
    std::string text;
    for (CMPICount i = 0; i < path->ft->getKeyCount(path, nullptr); ++i) {
        CMPIString* name = nullptr;
        const CMPIData data = path->ft->getKeyAt(path, i, &name, nullptr);
        EXPECT_EQ(data.type, CMPI_string);
        text += (text.empty() ? "" : " ") + std::string(name->ft->getCharPtr(name, nullptr)) + "=" +
                data.value.string->ft->getCharPtr(data.value.string, nullptr);
    }
    return text;
}

class MonikersTest : public Testing::ProviderUtilitiesTest {
  protected:
    void SetUp() override {
        path_ = ProviderUtilities::createObjectPath(broker, "TEST_Element", nameSpace);
        ASSERT_NE(path_, nullptr);
    }

    CMPIObjectPath* path_ = nullptr;
    Moniker moniker_;
};

TEST_F(MonikersTest, TextKeysAreTakenInThePathsOrder) {
    addTextKey(path_, "SystemName", "host");
    addTextKey(path_, "Name", "");
    addTextKey(path_, "CreationClassName", "C");
    EXPECT_TRUE(ProviderUtilities::transformObjectPathToMoniker(path_, moniker_));
    EXPECT_EQ(describe(moniker_), "SystemName=host Name= CreationClassName=C");
}

TEST_F(MonikersTest, NamesOfTheUsualKeysAreWrittenAsInTheSchema) {
    addTextKey(path_, "name", "eth0");
    addTextKey(path_, "SYSTEMNAME", "host");
    addTextKey(path_, "creationclassname", "C");
    addTextKey(path_, "systemCreationClassName", "S");
    addTextKey(path_, "instanceid", "I");
    addTextKey(path_, "other", "o");
    EXPECT_TRUE(ProviderUtilities::transformObjectPathToMoniker(path_, moniker_));
    EXPECT_EQ(describe(moniker_),
              "Name=eth0 SystemName=host CreationClassName=C SystemCreationClassName=S "
              "InstanceID=I other=o");
}

TEST_F(MonikersTest, KeysThatAreNoTextArePassedOver) {
    addReferenceKey(path_, "Dependent", newPath("TEST_Element"));
    addTextKey(path_, "Name", "eth0");
    addNumberKey(path_, "Number", 7);
    addTextKey(path_, "SystemName", "host");
    EXPECT_TRUE(ProviderUtilities::transformObjectPathToMoniker(path_, moniker_));
    EXPECT_EQ(describe(moniker_), "Name=eth0 SystemName=host");
}

TEST_F(MonikersTest, KeysAreAddedToThoseThatTheMonikerHas) {
    moniker_.addKey("First", "1");
    addTextKey(path_, "Name", "eth0");
    EXPECT_TRUE(ProviderUtilities::transformObjectPathToMoniker(path_, moniker_));
    EXPECT_EQ(describe(moniker_), "First=1 Name=eth0");
}

TEST_F(MonikersTest, PathWithoutKeysAddsNone) {
    EXPECT_TRUE(ProviderUtilities::transformObjectPathToMoniker(path_, moniker_));
    EXPECT_EQ(moniker_.getKeyCount(), 0U);
}

TEST_F(MonikersTest, KeysOfOtherHostsMayBeCharactersAndHaveNoName) {
    // Ours has neither.
    CMPIObjectPathFT functions = *path_->ft;
    functions.getKeyCount = [](const CMPIObjectPath*, CMPIStatus*) -> CMPICount { return 3; };
    static CMPIString* name = nullptr;
    name = broker->eft->newString(broker, "Name", nullptr);
    functions.getKeyAt = [](const CMPIObjectPath*, CMPICount index, CMPIString** keyName,
                            CMPIStatus* rc) {
        static char text[] = "eth0";
        *keyName = index == 1 ? nullptr : name;
        *rc = {index == 2 ? CMPI_RC_ERR_NO_SUCH_PROPERTY : CMPI_RC_OK, nullptr};
        CMPIData data{};
        data.type = CMPI_chars;
        data.state = CMPI_keyValue;
        data.value.chars = text;
        return data;
    };
    const CMPIObjectPath foreign{nullptr, &functions};
    EXPECT_TRUE(ProviderUtilities::transformObjectPathToMoniker(&foreign, moniker_));
    EXPECT_EQ(describe(moniker_), "Name=eth0");
}

TEST_F(MonikersTest, PathGetsTheMonikersKeysInTheirOrderAndNoOthers) {
    addTextKey(path_, "Old", "x");
    moniker_.addKey("SystemName", "host");
    moniker_.addKey("Name", "eth0");
    CMPIObjectPath* path = path_;
    EXPECT_TRUE(ProviderUtilities::transformMonikerToObjectPath(moniker_, &path));
    EXPECT_NE(path, path_);
    EXPECT_EQ(describe(path), "SystemName=host Name=eth0");
    EXPECT_EQ(describe(path_), "Old=x");
}

TEST_F(MonikersTest, PathKeepsItsClassAndNamespace) {
    CMPIObjectPath* path =
        ProviderUtilities::createObjectPath(broker, "CIM_ManagedElement", "root/other");
    moniker_.addKey("Name", "eth0");
    EXPECT_TRUE(ProviderUtilities::transformMonikerToObjectPath(moniker_, &path));
    EXPECT_EQ(textOf(path->ft->getClassName(path, nullptr)), "CIM_ManagedElement");
    EXPECT_EQ(ProviderUtilities::getNamespace(path), "root/other");
}

TEST_F(MonikersTest, EmptyMonikerGivesAPathWithoutKeys) {
    addTextKey(path_, "Old", "x");
    CMPIObjectPath* path = path_;
    EXPECT_TRUE(ProviderUtilities::transformMonikerToObjectPath(moniker_, &path));
    EXPECT_EQ(describe(path), "");
}

TEST_F(MonikersTest, ThereAndBackIsTheSame) {
    addTextKey(path_, "SystemCreationClassName", "QVXZR_ComputerSystem");
    addTextKey(path_, "Name", "a_b%c");
    EXPECT_TRUE(ProviderUtilities::transformObjectPathToMoniker(path_, moniker_));
    CMPIObjectPath* path = path_;
    EXPECT_TRUE(ProviderUtilities::transformMonikerToObjectPath(moniker_, &path));
    EXPECT_EQ(textOf(path), textOf(path_));
}

/// The call of a making function that fails next: 1 for the very next.
int failingCall = 0;
const CMPIBrokerEncFT* realFunctions = nullptr;

TEST_F(MonikersTest, PathStaysWhateverCallToTheBrokerFails) {
    Testing::AlteredBroker altered(broker);
    realFunctions = broker->eft;
    altered.functions.newObjectPath = [](const CMPIBroker* mb, const char* space, const char* name,
                                         CMPIStatus* rc) -> CMPIObjectPath* {
        if (--failingCall == 0) {
            *rc = {CMPI_RC_ERR_FAILED, nullptr};
            return nullptr;
        }
        return realFunctions->newObjectPath(mb, space, name, rc);
    };
    altered.functions.newString = [](const CMPIBroker* mb, const char* text,
                                     CMPIStatus* rc) -> CMPIString* {
        if (--failingCall == 0) {
            *rc = {CMPI_RC_ERR_FAILED, nullptr};
            return nullptr;
        }
        return realFunctions->newString(mb, text, rc);
    };
    moniker_.addKey("SystemName", "host");
    moniker_.addKey("Name", "eth0");

    failingCall = 0;  // none fails
    CMPIObjectPath* const original =
        ProviderUtilities::createObjectPath(altered.record(), "TEST_Element", nameSpace);
    addTextKey(original, "Old", "x");
    CMPIObjectPath* path = original;
    // One call for the path, and one for each key.
    for (int call = 1; call <= 3; ++call) {
        failingCall = call;
        EXPECT_FALSE(ProviderUtilities::transformMonikerToObjectPath(moniker_, &path)) << call;
        EXPECT_EQ(path, original) << call;
        EXPECT_EQ(describe(path), "Old=x") << call;
    }
    failingCall = 4;
    EXPECT_TRUE(ProviderUtilities::transformMonikerToObjectPath(moniker_, &path));
    EXPECT_EQ(describe(path), "SystemName=host Name=eth0");
}

}  // namespace

}  // namespace ZR
