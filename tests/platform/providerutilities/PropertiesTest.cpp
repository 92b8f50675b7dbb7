#include <gtest/gtest.h>

#include <array>
#include <string>
#include <vector>

#include "ProviderUtilitiesFixture.h"
#include "providerutilities/ProviderUtilities.h"

namespace ZR {

namespace {

using Numbers = std::vector<unsigned short>;
using Texts = std::vector<std::string>;

class PropertiesTest : public Testing::ProviderUtilitiesTest {
  protected:
    void SetUp() override {
        const CMPIObjectPath* path =
            ProviderUtilities::createObjectPath(broker, "TEST_Element", nameSpace);
        instance_ = ProviderUtilities::createInstance(broker, path);
        ASSERT_NE(instance_, nullptr);
    }

    CMPIData get(const char* name) const {
        CMPIStatus status{CMPI_RC_OK, nullptr};
        const CMPIData data = instance_->ft->getProperty(instance_, name, &status);
        EXPECT_EQ(status.rc, CMPI_RC_OK) << name;
        return data;
    }
    bool has(const char* name) const {
        CMPIStatus status{CMPI_RC_OK, nullptr};
        instance_->ft->getProperty(instance_, name, &status);
        return status.rc == CMPI_RC_OK;
    }
    CMPIData element(const char* name, CMPICount index) const {
        const CMPIArray* array = get(name).value.array;
        return array->ft->getElementAt(array, index, nullptr);
    }
    CMPICount size(const char* name) const {
        const CMPIArray* array = get(name).value.array;
        return array->ft->getSize(array, nullptr);
    }

    CMPIInstance* instance_ = nullptr;
};

TEST_F(PropertiesTest, TextIsSetAsAString) {
    EXPECT_TRUE(ProviderUtilities::setProperty(instance_, "ElementName", std::string("eth0")));
    EXPECT_EQ(get("ElementName").type, CMPI_string);
    EXPECT_EQ(textOf(get("ElementName").value.string), "eth0");

    EXPECT_TRUE(ProviderUtilities::setProperty(broker, instance_, "ElementName", "eth1", false));
    EXPECT_EQ(get("ElementName").type, CMPI_string);
    EXPECT_EQ(textOf(get("ElementName").value.string), "eth1");
}

TEST_F(PropertiesTest, NumbersOfEveryWidthAreSet) {
    EXPECT_TRUE(
        ProviderUtilities::setProperty(instance_, "Number16", static_cast<unsigned short>(65535)));
    EXPECT_TRUE(ProviderUtilities::setProperty(instance_, "Number32", 4294967295U));
    EXPECT_TRUE(ProviderUtilities::setProperty(instance_, "Number64", 18446744073709551615ULL));
    EXPECT_EQ(get("Number16").type, CMPI_uint16);
    EXPECT_EQ(get("Number16").value.uint16, 65535U);
    EXPECT_EQ(get("Number32").type, CMPI_uint32);
    EXPECT_EQ(get("Number32").value.uint32, 4294967295U);
    EXPECT_EQ(get("Number64").type, CMPI_uint64);
    EXPECT_EQ(get("Number64").value.uint64, 18446744073709551615ULL);
}

TEST_F(PropertiesTest, TruthIsSet) {
    EXPECT_TRUE(ProviderUtilities::setProperty(instance_, "Truth", true));
    EXPECT_EQ(get("Truth").type, CMPI_boolean);
    EXPECT_EQ(get("Truth").value.boolean, 1);
    EXPECT_TRUE(ProviderUtilities::setProperty(instance_, "Truth", false));
    EXPECT_EQ(get("Truth").value.boolean, 0);
}

TEST_F(PropertiesTest, ReferenceIsSet) {
    CMPIObjectPath* other = newPath("CIM_ManagedElement");
    EXPECT_TRUE(ProviderUtilities::setProperty(instance_, "Other", other));
    EXPECT_EQ(get("Other").type, CMPI_ref);
    EXPECT_EQ(textOf(get("Other").value.ref), textOf(other));
    EXPECT_FALSE(
        ProviderUtilities::setProperty(instance_, "Other", static_cast<CMPIObjectPath*>(nullptr)));
    EXPECT_EQ(textOf(get("Other").value.ref), textOf(other));
}

TEST_F(PropertiesTest, PropertyOfAnotherTypeIsRefused) {
    EXPECT_FALSE(ProviderUtilities::setProperty(instance_, "Number16", std::string("7")));
    EXPECT_FALSE(ProviderUtilities::setProperty(instance_, "ElementName", 7U));
    EXPECT_FALSE(ProviderUtilities::setProperty(broker, instance_, "Texts", Numbers{1}));
    EXPECT_FALSE(has("Number16"));
    EXPECT_FALSE(has("ElementName"));
    EXPECT_FALSE(has("Texts"));
}

TEST_F(PropertiesTest, ListsAreSetInTheirOrder) {
    EXPECT_TRUE(ProviderUtilities::setProperty(broker, instance_, "Numbers", Numbers{8, 14, 17}));
    EXPECT_EQ(get("Numbers").type, CMPI_uint16A);
    ASSERT_EQ(size("Numbers"), 3U);
    EXPECT_EQ(element("Numbers", 0).value.uint16, 8U);
    EXPECT_EQ(element("Numbers", 1).value.uint16, 14U);
    EXPECT_EQ(element("Numbers", 2).value.uint16, 17U);

    EXPECT_TRUE(ProviderUtilities::setProperty(broker, instance_, "Texts", Texts{"a", "", "b"}));
    EXPECT_EQ(get("Texts").type, CMPI_stringA);
    ASSERT_EQ(size("Texts"), 3U);
    for (CMPICount i = 0; i < 3; ++i) {
        EXPECT_EQ(element("Texts", i).type, CMPI_string);
        EXPECT_EQ(element("Texts", i).state, CMPI_goodValue);
    }
    EXPECT_EQ(textOf(element("Texts", 0).value.string), "a");
    EXPECT_EQ(textOf(element("Texts", 1).value.string), "");
    EXPECT_EQ(textOf(element("Texts", 2).value.string), "b");
}

TEST_F(PropertiesTest, EmptyListsAreSetAsEmptyLists) {
    EXPECT_TRUE(ProviderUtilities::setProperty(broker, instance_, "Numbers", Numbers{}));
    EXPECT_TRUE(ProviderUtilities::setProperty(broker, instance_, "Texts", Texts{}));
    EXPECT_EQ(get("Numbers").type, CMPI_uint16A);
    EXPECT_EQ(get("Numbers").state, CMPI_goodValue);
    EXPECT_EQ(size("Numbers"), 0U);
    EXPECT_EQ(get("Texts").type, CMPI_stringA);
    EXPECT_EQ(get("Texts").state, CMPI_goodValue);
    EXPECT_EQ(size("Texts"), 0U);
}

TEST_F(PropertiesTest, DateTimeIsSetFromItsText) {
    const std::string moment = "20261120081530.123456+060";
    EXPECT_TRUE(ProviderUtilities::setProperty(broker, instance_, "Moment", moment, true));
    EXPECT_EQ(get("Moment").type, CMPI_dateTime);
    std::string value;
    EXPECT_TRUE(ProviderUtilities::getProperty(instance_, "Moment", value, true));
    EXPECT_EQ(value, moment);

    const std::string interval = "00000001132312.000000:000";
    EXPECT_TRUE(ProviderUtilities::setProperty(broker, instance_, "Moment", interval, true));
    EXPECT_TRUE(ProviderUtilities::getProperty(instance_, "Moment", value, true));
    EXPECT_EQ(value, interval);
}

TEST_F(PropertiesTest, BadDateTimeTextSetsNothing) {
    for (const char* text : {"", "now", "20261120081530.123456+06", "20261320081530.123456+060",
                             "20261120081530,123456+060"}) {
        EXPECT_FALSE(ProviderUtilities::setProperty(broker, instance_, "Moment", text, true))
            << text;
        EXPECT_FALSE(has("Moment")) << text;
    }
}

TEST_F(PropertiesTest, TextComesBack) {
    ProviderUtilities::setProperty(instance_, "ElementName", std::string("eth0"));
    std::string value;
    EXPECT_TRUE(ProviderUtilities::getProperty(instance_, "ElementName", value, false));
    EXPECT_EQ(value, "eth0");
    EXPECT_TRUE(ProviderUtilities::getProperty(instance_, "elementname", value, false));
    ProviderUtilities::setProperty(instance_, "ElementName", std::string());
    EXPECT_TRUE(ProviderUtilities::getProperty(instance_, "ElementName", value, false));
    EXPECT_EQ(value, "");
}

TEST_F(PropertiesTest, WhatIsNoTextIsNotReadAsText) {
    ProviderUtilities::setProperty(instance_, "Number16", static_cast<unsigned short>(7));
    ProviderUtilities::setProperty(instance_, "Truth", true);
    ProviderUtilities::setProperty(instance_, "Other", newPath("CIM_ManagedElement"));
    ProviderUtilities::setProperty(broker, instance_, "Moment", "20261120081530.123456+060", true);
    ProviderUtilities::setProperty(broker, instance_, "Texts", Texts{"a"});
    instance_->ft->setProperty(instance_, "ElementName", nullptr, CMPI_string);
    for (const char* name :
         {"Number16", "Truth", "Other", "Moment", "Texts", "ElementName", "Missing", ""}) {
        std::string value = "before";
        EXPECT_FALSE(ProviderUtilities::getProperty(instance_, name, value, false)) << name;
        EXPECT_EQ(value, "before") << name;
    }
}

TEST_F(PropertiesTest, WhatIsNoDateTimeIsNotReadAsOne) {
    ProviderUtilities::setProperty(instance_, "ElementName",
                                   std::string("20261120081530.123456+060"));
    instance_->ft->setProperty(instance_, "Moment", nullptr, CMPI_dateTime);
    for (const char* name : {"ElementName", "Moment", "Missing"}) {
        std::string value = "before";
        EXPECT_FALSE(ProviderUtilities::getProperty(instance_, name, value, true)) << name;
        EXPECT_EQ(value, "before") << name;
    }
}

TEST_F(PropertiesTest, TextOfCharactersIsReadAsAStringIs) {
    // Other hosts hand out texts so; ours turns them into strings.
    CMPIInstanceFT functions = *instance_->ft;
    functions.getProperty = [](const CMPIInstance*, const char*, CMPIStatus* rc) {
        static char text[] = "eth0";
        *rc = {CMPI_RC_OK, nullptr};
        CMPIData data{};
        data.type = CMPI_chars;
        data.value.chars = text;
        return data;
    };
    const CMPIInstance foreign{nullptr, &functions};
    std::string value;
    EXPECT_TRUE(ProviderUtilities::getProperty(&foreign, "ElementName", value, false));
    EXPECT_EQ(value, "eth0");
    EXPECT_FALSE(ProviderUtilities::getProperty(&foreign, "ElementName", value, true));
}

TEST_F(PropertiesTest, BrokerThatMakesNothingSetsNothing) {
    Testing::AlteredBroker altered(broker);
    altered.functions.newString = [](const CMPIBroker*, const char*,
                                     CMPIStatus* rc) -> CMPIString* {
        *rc = {CMPI_RC_ERR_FAILED, nullptr};
        return nullptr;
    };
    altered.functions.newArray = [](const CMPIBroker*, CMPICount, CMPIType,
                                    CMPIStatus* rc) -> CMPIArray* {
        *rc = {CMPI_RC_ERR_FAILED, nullptr};
        return nullptr;
    };
    const CMPIBroker* const refusing = altered.record();
    EXPECT_FALSE(ProviderUtilities::setProperty(refusing, instance_, "ElementName", "x", false));
    EXPECT_FALSE(ProviderUtilities::setProperty(refusing, instance_, "Numbers", Numbers{1}));
    EXPECT_FALSE(ProviderUtilities::setProperty(refusing, instance_, "Texts", Texts{"a"}));
    altered.functions.newArray = broker->eft->newArray;
    EXPECT_FALSE(ProviderUtilities::setProperty(refusing, instance_, "Texts", Texts{"a"}));
    for (const char* name : {"ElementName", "Numbers", "Texts"}) {
        EXPECT_FALSE(has(name)) << name;
    }
}

TEST(PropertyLists, NameWhatAClientWantsInAnyCase) {
    const std::array<const char*, 3> list{"Name", "elementNAME", nullptr};
    EXPECT_TRUE(ProviderUtilities::isListed(list.data(), "Name"));
    EXPECT_TRUE(ProviderUtilities::isListed(list.data(), "ElementName"));
    EXPECT_FALSE(ProviderUtilities::isListed(list.data(), "Element"));
    EXPECT_FALSE(ProviderUtilities::isListed(list.data(), ""));
}

TEST(PropertyLists, WithoutOneAllIsWantedAndWithAnEmptyOneNothing) {
    EXPECT_TRUE(ProviderUtilities::isListed(nullptr, "Name"));
    const std::array<const char*, 1> none{nullptr};
    EXPECT_FALSE(ProviderUtilities::isListed(none.data(), "Name"));
}

}  // namespace

}  // namespace ZR
