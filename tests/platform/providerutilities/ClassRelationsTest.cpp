#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <clocale>
#include <cstdlib>
#include <map>
#include <string>
#include <vector>

#include "ProviderUtilitiesFixture.h"
#include "kit/ChildProcess.h"
#include "kit/Files.h"
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

namespace {

unsigned short idOf(const char* className) {
    return ProviderUtilities::getClassId(className);
}
unsigned short idOf(const std::string& className) {
    return idOf(className.c_str());
}

const std::map<std::string, unsigned short>& numbering() {
    static const std::map<std::string, unsigned short> ids{
        {"QVXZR_ComputerSystem", 1},
        {"QVXZR_DHCPProtocolEndpoint", 4},
        {"QVXZR_DHCPCapabilities", 5},
        {"QVXZR_DHCPElementCapabilities", 6},
        {"QVXZR_SAPSAPDependency", 8},
        {"QVXZR_IPProtocolEndpoint", 9},
        {"QVXZR_HostedDHCPPoint", 34},
        {"QVXZR_IPAssignmentSettingData", 66},
        {"QVXZR_DHCPRemoteServiceAccessPoint", 82},
        {"QVXZR_DHCPRemoteAccessAvailableToElement", 83},
        {"QVXZR_DHCPRemoteHostedAccessPoint", 84},
        {"QVXZR_DHCPSettingData", 85},
        {"QVXZR_DHCPElementSettingData", 86},
        {"QVXZR_DHCPOrderedComponent", 87},
    };
    return ids;
}

std::string changed(std::string text, int (*change)(int)) {
    std::transform(text.begin(), text.end(), text.begin(), [change](char character) {
        return static_cast<char>(change(static_cast<unsigned char>(character)));
    });
    return text;
}

TEST(ClassIdentifiers, FourteenClassesHaveTheirNumbers) {
    EXPECT_EQ(numbering().size(), 14U);
    for (const auto& [name, id] : numbering()) {
        EXPECT_EQ(idOf(name), id) << name;
    }
}

TEST(ClassIdentifiers, CaseOfTheNameDoesNotMatter) {
    for (const auto& [name, id] : numbering()) {
        EXPECT_EQ(idOf(changed(name, &std::tolower)), id) << name;
        EXPECT_EQ(idOf(changed(name, &std::toupper)), id) << name;
    }
}

TEST(ClassIdentifiers, CaseDoesNotMatterInATurkishLocaleEither) {
    // There, "I" and "i" are different letters, and strcasecmp keeps them apart.
    const Testing::TemporaryDirectory directory;
    const std::string make =
        "localedef -i tr_TR -f ISO-8859-9 '" + (directory / "zr_TR") + "' >/dev/null 2>&1";
    if (std::system(make.c_str()) != 0) {
        GTEST_SKIP() << "no Turkish locale can be made here";
    }
    const auto result = Testing::inChild([&directory] {
        ::setenv("LOCPATH", directory.path().c_str(), 1);
        if (std::setlocale(LC_ALL, "zr_TR") == nullptr || std::tolower('I') == 'i') {
            return std::string("not in a Turkish locale");
        }
        return std::to_string(idOf("qvxzr_ipprotocolendpoint")) + " " +
               std::to_string(idOf("QVXZR_IPASSIGNMENTSETTINGDATA"));
    });
    EXPECT_EQ(result.output, "9 66");
}

TEST(ClassIdentifiers, EveryOtherNameIsUnknown) {
    EXPECT_EQ(ProviderUtilities::unknownClass, 255);
    for (const char* name :
         {"", "QVXZR_SPComputerSystem", "CIM_ComputerSystem", "CIM_DHCPProtocolEndpoint",
          "CIM_ElementCapabilities", "CIM_HostedAccessPoint", "CIM_SAPSAPDependency",
          "CIM_OrderedComponent", "CIM_RemoteAccessAvailableToElement", "CIM_ElementSettingData",
          "QVXZR_DHCPSettingDat", "QVXZR_DHCPSettingDataX", " QVXZR_DHCPSettingData",
          "DHCPSettingData", "QVXZR_", "85"}) {
        EXPECT_EQ(idOf(name), 255) << name;
    }
}

TEST(ClassIdentifiers, NullNameIsUnknown) {
    EXPECT_EQ(idOf(static_cast<const char*>(nullptr)), 255);
}

using ClassIdentifiersOfPathsTest = Testing::ProviderUtilitiesTest;

TEST_F(ClassIdentifiersOfPathsTest, AreThoseOfTheirClasses) {
    EXPECT_EQ(ProviderUtilities::getClassId(newPath("QVXZR_DHCPSettingData")), 85);
    EXPECT_EQ(ProviderUtilities::getClassId(newPath("qvxzr_hosteddhcppoint")), 34);
    EXPECT_EQ(ProviderUtilities::getClassId(newPath("CIM_ManagedElement")), 255);
}

TEST_F(ClassIdentifiersOfPathsTest, PathWithoutAClassIsUnknown) {
    EXPECT_EQ(ProviderUtilities::getClassId(newPath("")), 255);
    EXPECT_EQ(ProviderUtilities::getClassId(static_cast<const CMPIObjectPath*>(nullptr)), 255);
}

TEST_F(ClassIdentifiersOfPathsTest, HostsMayReportAMissingClassAsNull) {
    // Ours reports an empty text.
    CMPIObjectPathFT functions = *newPath("")->ft;
    functions.getClassName = [](const CMPIObjectPath*, CMPIStatus*) -> CMPIString* {
        return nullptr;
    };
    const CMPIObjectPath path{nullptr, &functions};
    EXPECT_EQ(ProviderUtilities::getClassId(&path), 255);
}

}  // namespace

}  // namespace ZR
