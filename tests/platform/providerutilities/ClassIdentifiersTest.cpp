#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <clocale>
#include <cstdlib>
#include <map>
#include <string>

#include "ProviderUtilitiesFixture.h"
#include "kit/ChildProcess.h"
#include "kit/TemporaryDirectory.h"
#include "providerutilities/ProviderUtilities.h"

namespace ZR {

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
