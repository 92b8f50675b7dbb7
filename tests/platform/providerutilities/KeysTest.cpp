#include <gtest/gtest.h>

#include <string>
#include <thread>

#include "ProviderUtilitiesFixture.h"
#include "providerutilities/ProviderUtilities.h"

namespace ZR {

namespace {

class KeysTest : public Testing::ProviderUtilitiesTest {
  protected:
    void SetUp() override {
        path_ = ProviderUtilities::createObjectPath(broker, "TEST_Element", nameSpace);
        ASSERT_NE(path_, nullptr);
    }

    CMPIObjectPath* path_ = nullptr;
};

TEST_F(KeysTest, TextIsSetAsAString) {
    EXPECT_TRUE(ProviderUtilities::setKeyProperty(path_, "InstanceID", std::string("a%b")));
    const CMPIData data = path_->ft->getKey(path_, "InstanceID", nullptr);
    EXPECT_EQ(data.type, CMPI_string);
    EXPECT_EQ(textOf(data.value.string), "a%b");
}

TEST_F(KeysTest, TextComesBack) {
    for (const std::string text : {"Computer%eth0", "", "\xE2\x82\xAC \"quoted\" \\"}) {
        EXPECT_TRUE(ProviderUtilities::setKeyProperty(path_, "InstanceID", text));
        std::string value = "before";
        EXPECT_TRUE(ProviderUtilities::getKeyProperty(path_, "InstanceID", value));
        EXPECT_EQ(value, text);
    }
    EXPECT_EQ(ProviderUtilities::getKeyCount(path_), 1U);
}

TEST_F(KeysTest, ReferenceComesBack) {
    CMPIObjectPath* other = newPath("TEST_Element");
    addTextKey(other, "InstanceID", "other");
    EXPECT_TRUE(ProviderUtilities::setKeyProperty(path_, "Dependent", other));
    EXPECT_EQ(path_->ft->getKey(path_, "Dependent", nullptr).type, CMPI_ref);
    CMPIObjectPath* reference = nullptr;
    ASSERT_TRUE(ProviderUtilities::getKeyProperty(path_, "Dependent", &reference));
    EXPECT_EQ(textOf(reference), textOf(other));
}

TEST_F(KeysTest, NullReferenceAddsNoKey) {
    EXPECT_FALSE(ProviderUtilities::setKeyProperty(path_, "Dependent",
                                                   static_cast<CMPIObjectPath*>(nullptr)));
    EXPECT_EQ(ProviderUtilities::getKeyCount(path_), 0U);
}

TEST_F(KeysTest, TextIsReadOnlyOfATextKey) {
    addReferenceKey(path_, "Reference", newPath("TEST_Element"));
    addNumberKey(path_, "Number", 7);
    for (const char* name : {"Reference", "Number", "Missing", ""}) {
        std::string value = "before";
        EXPECT_FALSE(ProviderUtilities::getKeyProperty(path_, name, value)) << name;
        EXPECT_EQ(value, "before");
    }
}

TEST_F(KeysTest, ReferenceIsReadOnlyOfAReferenceKey) {
    addTextKey(path_, "Text", "x");
    addNumberKey(path_, "Number", 7);
    CMPIObjectPath* const before = newPath("TEST_Element");
    for (const char* name : {"Text", "Number", "Missing", ""}) {
        CMPIObjectPath* reference = before;
        EXPECT_FALSE(ProviderUtilities::getKeyProperty(path_, name, &reference)) << name;
        EXPECT_EQ(reference, before);
    }
}

TEST_F(KeysTest, NameIsComparedWithoutRegardToCase) {
    addTextKey(path_, "InstanceID", "x");
    std::string value;
    EXPECT_TRUE(ProviderUtilities::getKeyProperty(path_, "instanceid", value));
    EXPECT_EQ(value, "x");
}

TEST_F(KeysTest, CountIsThatOfAllKeysWithAValue) {
    addTextKey(path_, "A", "x");
    addNumberKey(path_, "B", 7);
    addReferenceKey(path_, "C", newPath("TEST_Element"));
    EXPECT_EQ(ProviderUtilities::getKeyCount(path_), 3U);
}

/// What a host that is not ours may hand out for a key: see each test.
CMPIData foreignKey{};
CMPIrc foreignCode = CMPI_RC_OK;
CMPIString* foreignNames[2] = {};

/// A path of a class that declares two keys, of which the first is not set.
CMPIData foreignKeyAt(const CMPIObjectPath* /*path*/, CMPICount index, CMPIString** name,
                      CMPIStatus* rc) {
    *name = foreignNames[index];
    *rc = {index == 0 ? CMPI_RC_OK : foreignCode, nullptr};
    CMPIData unset{};
    unset.type = CMPI_chars;
    unset.state = CMPI_nullValue;
    return index == 0 ? unset : foreignKey;
}

class ForeignKeysTest : public KeysTest {
  protected:
    void SetUp() override {
        KeysTest::SetUp();
        functions_ = *path_->ft;
        // Some hosts do not survive being asked by name.
        functions_.getKey = nullptr;
        functions_.getKeyCount = [](const CMPIObjectPath*, CMPIStatus*) -> CMPICount { return 2; };
        functions_.getKeyAt = &foreignKeyAt;
        foreignNames[0] = broker->eft->newString(broker, "Unset", nullptr);
        foreignNames[1] = broker->eft->newString(broker, "Key", nullptr);
        foreignCode = CMPI_RC_OK;
        foreignKey = CMPIData{};
        foreignKey.state = CMPI_keyValue;
    }

    bool readsText(const char* name = "Key") const {
        std::string value = "before";
        const bool read = ProviderUtilities::getKeyProperty(&foreign_, name, value);
        EXPECT_EQ(value == "before", !read);
        return read && value == "text";
    }
    bool readsReference() const {
        CMPIObjectPath* reference = nullptr;
        const bool read = ProviderUtilities::getKeyProperty(&foreign_, "Key", &reference);
        EXPECT_EQ(reference != nullptr, read);
        return read;
    }

    CMPIObjectPathFT functions_{};
    CMPIObjectPath foreign_{nullptr, &functions_};
    std::string text_ = "text";
};

TEST_F(ForeignKeysTest, TextOfCharactersIsReadAsAStringIs) {
    foreignKey.type = CMPI_chars;
    foreignKey.value.chars = text_.data();
    EXPECT_TRUE(readsText());
    EXPECT_FALSE(readsReference());
    foreignKey.type = CMPI_string;
    foreignKey.value.string = broker->eft->newString(broker, "text", nullptr);
    EXPECT_TRUE(readsText());
    EXPECT_FALSE(readsReference());
}

TEST_F(ForeignKeysTest, NullPointersAreNotRead) {
    for (const CMPIType type : {CMPI_chars, CMPI_string, CMPI_ref}) {
        foreignKey.type = type;
        foreignKey.value = CMPIValue{};
        EXPECT_FALSE(readsText()) << type;
        EXPECT_FALSE(readsReference()) << type;
    }
}

TEST_F(ForeignKeysTest, ValuesThatAreNoneAreNotRead) {
    for (const CMPIValueState state : {CMPI_nullValue, CMPI_notFound, CMPI_badValue}) {
        foreignKey.state = static_cast<CMPIValueState>(state | CMPI_keyValue);
        foreignKey.type = CMPI_chars;
        foreignKey.value.chars = text_.data();
        EXPECT_FALSE(readsText()) << state;
        foreignKey.type = CMPI_ref;
        foreignKey.value.ref = path_;
        EXPECT_FALSE(readsReference()) << state;
    }
}

TEST_F(ForeignKeysTest, ValuesThatComeWithAnErrorAreNotRead) {
    foreignCode = CMPI_RC_ERR_FAILED;
    foreignKey.type = CMPI_chars;
    foreignKey.value.chars = text_.data();
    EXPECT_FALSE(readsText());
    foreignKey.type = CMPI_ref;
    foreignKey.value.ref = path_;
    EXPECT_FALSE(readsReference());
}

TEST_F(ForeignKeysTest, KeysThatTheClassDeclaresAndThePathLacksAreNone) {
    foreignKey.type = CMPI_chars;
    foreignKey.value.chars = text_.data();
    EXPECT_FALSE(readsText("Unset"));
    EXPECT_TRUE(readsText("KEY"));
    EXPECT_EQ(ProviderUtilities::getKeyCount(&foreign_), 1U);
    foreignKey.state = CMPI_nullValue;
    EXPECT_EQ(ProviderUtilities::getKeyCount(&foreign_), 0U);
}

TEST_F(ForeignKeysTest, KeysWithoutANameAreNone) {
    foreignKey.type = CMPI_chars;
    foreignKey.value.chars = text_.data();
    foreignNames[1] = nullptr;
    EXPECT_FALSE(readsText(""));
    EXPECT_EQ(ProviderUtilities::getKeyCount(&foreign_), 0U);
}

TEST_F(KeysTest, TextNeedsABrokerWithWhichTheThreadHasMadeSomething) {
    bool before = true;
    bool after = false;
    std::thread([this, &before, &after] {
        const cimom::broker::RequestScope scope;
        CMPIObjectPath* path = newPath("TEST_Element");
        before = ProviderUtilities::setKeyProperty(path, "InstanceID", std::string("x"));
        static_cast<void>(ProviderUtilities::createInstance(broker, path));
        after = ProviderUtilities::setKeyProperty(path, "InstanceID", std::string("x"));
    }).join();
    EXPECT_FALSE(before);
    EXPECT_TRUE(after);
}

TEST_F(KeysTest, BrokerThatMakesNoStringAddsNoKey) {
    Testing::AlteredBroker altered(broker);
    altered.functions.newString = [](const CMPIBroker*, const char*,
                                     CMPIStatus* rc) -> CMPIString* {
        *rc = {CMPI_RC_ERR_FAILED, nullptr};
        return nullptr;
    };
    CMPIObjectPath* path = ProviderUtilities::createObjectPath(altered.record(), "C", nameSpace);
    EXPECT_FALSE(ProviderUtilities::setKeyProperty(path, "InstanceID", std::string("x")));
    EXPECT_EQ(ProviderUtilities::getKeyCount(path), 0U);
}

}  // namespace

}  // namespace ZR
