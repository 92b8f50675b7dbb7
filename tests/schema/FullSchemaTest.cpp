// Our classes over the parents of the final CIM schema 2.41 in place of the reduced ones
// that are shipped. The schema itself is not in Debian, and this project does not copy
// it: tests/schema/cim-2.41.mof tells what it declares of these parents. The variable
// ZR_CIM_SCHEMA names the directory of the schema as DMTF publishes it, for the test
// that reads all of it.
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <map>

#include "ShippedSchema.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "cimom/MofError.h"

namespace cimom {
namespace {

const std::filesystem::path source = ZR_SOURCE_DIR;

ClassRepository loadOverFullParents() {
    ClassRepository loaded;
    loaded.load(source / "schema/01-qualifiers.mof");
    loaded.load(source / "tests/schema/cim-2.41.mof");
    loaded.load(source / "schema/10-dhcp-client.mof");
    loaded.complete();
    return loaded;
}

bool isOurs(const ClassDeclaration& declaration) {
    return declaration.name.starts_with("QVXZR_");
}

/// What a client can see of a property, apart from its qualifiers.
std::string described(const PropertyDeclaration& property) {
    return property.name + ' ' + std::string(typeName(property.type)) +
           (property.isArray ? "[] " : " ") + property.referenceClass +
           (property.isKey() ? " key" : "");
}

void expectOursWithoutDefaults(const ClassRepository& repository) {
    std::size_t ours = 0;
    for (const ClassDeclaration* each : repository.classes()) {
        if (!isOurs(*each)) {
            continue;
        }
        ++ours;
        for (const PropertyDeclaration& property : each->properties) {
            EXPECT_TRUE(property.defaultValue.isNull()) << each->name << '.' << property.name;
        }
    }
    EXPECT_EQ(ours, 15U);
}

TEST(FullSchema, ItsParentsHaveDefaults) {
    const ClassRepository repository = loadOverFullParents();
    std::map<std::string, std::string> defaults;
    for (const ClassDeclaration* each : repository.classes()) {
        for (const PropertyDeclaration& property : each->properties) {
            if (!property.propagated && !property.defaultValue.isNull()) {
                defaults[each->name + '.' + property.name] =
                    std::to_string(std::get<std::uint64_t>(*property.defaultValue.scalar()));
            }
        }
    }
    // CIM_ProtocolEndpoint and others that override a property without a default of
    // their own have the one above.
    const std::map<std::string, std::string> expected{
        {"CIM_DHCPSettingData.AddressOrigin", "4"},
        {"CIM_EnabledLogicalElement.EnabledDefault", "2"},
        {"CIM_EnabledLogicalElement.EnabledState", "5"},
        {"CIM_EnabledLogicalElement.RequestedState", "12"},
        {"CIM_EnabledLogicalElement.TransitioningToState", "12"},
        {"CIM_IPAssignmentSettingData.AddressOrigin", "0"},
        {"CIM_IPProtocolEndpoint.AddressOrigin", "0"},
        {"CIM_IPProtocolEndpoint.ProtocolIFType", "4096"},
        {"CIM_ProtocolEndpoint.EnabledState", "5"},
        {"CIM_RemoteAccessAvailableToElement.OrderOfAccess", "0"},
        {"CIM_RemoteServiceAccessPoint.AccessContext", "0"}};
    EXPECT_EQ(defaults, expected);
}

TEST(FullSchema, NoDefaultOfItReachesOurClasses) {
    expectOursWithoutDefaults(loadOverFullParents());
}

TEST(FullSchema, OurClassesHaveTheSamePropertiesOverItAsOverTheShippedParents) {
    const ClassRepository repository = loadOverFullParents();
    const std::map<std::string, std::size_t> counts{{"QVXZR_ComputerSystem", 32},
                                                    {"QVXZR_SPComputerSystem", 32},
                                                    {"QVXZR_IPProtocolEndpoint", 38},
                                                    {"QVXZR_IPAssignmentSettingData", 8},
                                                    {"QVXZR_DHCPProtocolEndpoint", 36},
                                                    {"QVXZR_DHCPCapabilities", 11},
                                                    {"QVXZR_DHCPSettingData", 14},
                                                    {"QVXZR_DHCPRemoteServiceAccessPoint", 29},
                                                    {"QVXZR_HostedDHCPPoint", 2},
                                                    {"QVXZR_DHCPRemoteHostedAccessPoint", 2},
                                                    {"QVXZR_SAPSAPDependency", 2},
                                                    {"QVXZR_DHCPElementCapabilities", 3},
                                                    {"QVXZR_DHCPRemoteAccessAvailableToElement", 4},
                                                    {"QVXZR_DHCPElementSettingData", 5},
                                                    {"QVXZR_DHCPOrderedComponent", 3}};
    for (const auto& [name, count] : counts) {
        const ClassDeclaration* full = repository.find(name);
        ASSERT_NE(full, nullptr) << name;
        EXPECT_EQ(full->properties.size(), count) << name;
        const ClassDeclaration& shipped = shipped::classOf(name);
        ASSERT_EQ(shipped.properties.size(), count) << name;
        for (std::size_t i = 0; i < count; ++i) {
            EXPECT_EQ(described(full->properties[i]), described(shipped.properties[i])) << name;
        }
    }
}

TEST(FullSchema, ASecondDeclarationOfAnInheritedNameIsRefusedWithoutOverride) {
    ClassRepository repository = loadOverFullParents();
    EXPECT_THROW(repository.loadText("class TEST_Endpoint : QVXZR_DHCPProtocolEndpoint {\n"
                                     "   boolean BroadcastResetSupported;\n};\n",
                                     "shadow.mof"),
                 MofError);
    EXPECT_THROW(repository.loadText("class QVXZR_ComputerSystem : CIM_System { };", "twice.mof"),
                 MofError);
}

TEST(FullSchema, IsReadAsDmtfPublishesIt) {
    const char* directory = std::getenv("ZR_CIM_SCHEMA");
    if (directory == nullptr) {
        GTEST_SKIP() << "ZR_CIM_SCHEMA does not name a directory with the CIM schema 2.41 "
                        "(cim_schema_2.41.0.mof and what it includes), which dmtf.org has";
    }
    ClassRepository repository;
    repository.load(std::filesystem::path(directory) / "cim_schema_2.41.0.mof");
    repository.load(source / "schema/10-dhcp-client.mof");
    repository.complete();
    expectOursWithoutDefaults(repository);
    const ClassRepository told = loadOverFullParents();
    for (const ClassDeclaration* each : told.classes()) {
        const ClassDeclaration* published = repository.find(each->name);
        ASSERT_NE(published, nullptr) << each->name;
        EXPECT_EQ(published->superclass, each->superclass);
        for (const PropertyDeclaration& property : each->properties) {
            const PropertyDeclaration* there = published->property(property.name);
            ASSERT_NE(there, nullptr) << each->name << '.' << property.name;
            EXPECT_EQ(described(*there), described(property)) << each->name;
            EXPECT_EQ(there->defaultValue, property.defaultValue) << each->name;
        }
    }
}

}  // namespace
}  // namespace cimom
