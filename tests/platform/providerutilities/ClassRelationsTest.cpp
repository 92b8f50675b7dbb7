#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "ProviderUtilitiesFixture.h"
#include "providerutilities/ProviderUtilities.h"

namespace ZR {

namespace {

/// What an altered broker was asked: "CLASS in NAMESPACE is a PARENT?".
std::vector<std::string>& requests() {
    static std::vector<std::string> asked;
    return asked;
}

std::string describe(const CMPIObjectPath* path, const char* parent) {
    const auto text = [](const CMPIString* string) {
        return std::string(string->ft->getCharPtr(string, nullptr));
    };
    return text(path->ft->getClassName(path, nullptr)) + " in " +
           text(path->ft->getNameSpace(path, nullptr)) + " is a " + parent + "?";
}

class ClassRelationsTest : public Testing::ProviderUtilitiesTest {
  protected:
    void SetUp() override { requests().clear(); }

    bool related(const char* className, const char* parent) const {
        return ProviderUtilities::areClassesRelated(broker, nameSpace, className, parent);
    }
};

TEST_F(ClassRelationsTest, ClassIsRelatedToItself) {
    EXPECT_TRUE(related("CIM_HostedAccessPoint", "CIM_HostedAccessPoint"));
    EXPECT_TRUE(related("cim_hostedaccesspoint", "CIM_HostedAccessPoint"));
}

TEST_F(ClassRelationsTest, ClassIsRelatedToItsAncestors) {
    EXPECT_TRUE(related("CIM_HostedAccessPoint", "CIM_HostedDependency"));
    EXPECT_TRUE(related("CIM_HostedAccessPoint", "CIM_Dependency"));
}

TEST_F(ClassRelationsTest, ClassIsRelatedToItsDescendants) {
    EXPECT_TRUE(related("CIM_HostedDependency", "CIM_HostedAccessPoint"));
    EXPECT_TRUE(related("CIM_Dependency", "CIM_HostedAccessPoint"));
}

TEST_F(ClassRelationsTest, ClassIsNotRelatedToOthers) {
    EXPECT_FALSE(related("CIM_SAPSAPDependency", "CIM_HostedAccessPoint"));
    EXPECT_FALSE(related("CIM_HostedDependency", "CIM_SAPSAPDependency"));
    EXPECT_FALSE(related("CIM_ManagedElement", "CIM_Dependency"));
    EXPECT_FALSE(related("No_SuchClass", "CIM_Dependency"));
    EXPECT_FALSE(related("CIM_Dependency", "No_SuchClass"));
}

TEST_F(ClassRelationsTest, NoClassNameIsNoRestriction) {
    EXPECT_TRUE(related(nullptr, "CIM_HostedAccessPoint"));
    EXPECT_TRUE(related("", "CIM_HostedAccessPoint"));
    EXPECT_TRUE(related("", "No_SuchClass"));
}

TEST_F(ClassRelationsTest, RestrictionWithoutAParentIsNotMet) {
    EXPECT_FALSE(related("CIM_Dependency", nullptr));
}

TEST_F(ClassRelationsTest, WithoutABrokerNoRestrictionIsMet) {
    EXPECT_FALSE(ProviderUtilities::areClassesRelated(nullptr, nameSpace, "CIM_Dependency",
                                                      "CIM_Dependency"));
    EXPECT_TRUE(
        ProviderUtilities::areClassesRelated(nullptr, nameSpace, nullptr, "CIM_Dependency"));
}

TEST_F(ClassRelationsTest, BrokerThatRefusesIsOneThatSaysNo) {
    // Ours asks for a namespace.
    EXPECT_FALSE(ProviderUtilities::areClassesRelated(broker, "", "CIM_HostedAccessPoint",
                                                      "CIM_Dependency"));
}

TEST_F(ClassRelationsTest, BothDirectionsAreAskedInTheNamespaceGiven) {
    Testing::AlteredBroker altered(broker);
    altered.functions.classPathIsA = [](const CMPIBroker*, const CMPIObjectPath* path,
                                        const char* parent, CMPIStatus* rc) -> CMPIBoolean {
        requests().push_back(describe(path, parent));
        *rc = {CMPI_RC_OK, nullptr};
        return 0;
    };
    EXPECT_FALSE(ProviderUtilities::areClassesRelated(altered.record(), "root/other", "A", "B"));
    EXPECT_EQ(requests(),
              (std::vector<std::string>{"A in root/other is a B?", "B in root/other is a A?"}));
}

TEST_F(ClassRelationsTest, ResultThatComesWithAnErrorCountsAsNo) {
    Testing::AlteredBroker altered(broker);
    altered.functions.classPathIsA = [](const CMPIBroker*, const CMPIObjectPath* path,
                                        const char* parent, CMPIStatus* rc) -> CMPIBoolean {
        requests().push_back(describe(path, parent));
        *rc = {CMPI_RC_ERR_INVALID_CLASS, nullptr};
        return 1;
    };
    EXPECT_FALSE(ProviderUtilities::areClassesRelated(altered.record(), nameSpace, "A", "B"));
    EXPECT_EQ(requests().size(), 2U);
}

TEST_F(ClassRelationsTest, ErrorInOneDirectionDoesNotHideTheOther) {
    Testing::AlteredBroker altered(broker);
    altered.functions.classPathIsA = [](const CMPIBroker*, const CMPIObjectPath* path,
                                        const char* parent, CMPIStatus* rc) -> CMPIBoolean {
        requests().push_back(describe(path, parent));
        const bool first = requests().size() == 1;
        *rc = {first ? CMPI_RC_ERR_INVALID_CLASS : CMPI_RC_OK, nullptr};
        return 1;
    };
    EXPECT_TRUE(ProviderUtilities::areClassesRelated(altered.record(), nameSpace, "A", "B"));
}

TEST_F(ClassRelationsTest, BrokerThatMakesNoPathSaysNo) {
    Testing::AlteredBroker altered(broker);
    altered.functions.newObjectPath = [](const CMPIBroker*, const char*, const char*,
                                         CMPIStatus* rc) -> CMPIObjectPath* {
        *rc = {CMPI_RC_ERR_FAILED, nullptr};
        return nullptr;
    };
    EXPECT_FALSE(ProviderUtilities::areClassesRelated(altered.record(), nameSpace, "CIM_Dependency",
                                                      "CIM_Dependency"));
}

}  // namespace

}  // namespace ZR
