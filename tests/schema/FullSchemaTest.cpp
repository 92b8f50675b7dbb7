// Our classes over the parents of the final CIM schema 2.41 in place of the reduced ones
// that are shipped. The schema itself is not in Debian, and this project does not copy
// it: tests/schema/cim-2.41 tells what it declares of these parents. The variable
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
#include "cimom/ObjectManager.h"

namespace cimom {
namespace {

const std::filesystem::path source = ZR_SOURCE_DIR;

const std::filesystem::path fullSchema = source / "tests/schema/cim-2.41/cim_schema_2.41.0.mof";

/// All that is shipped, of which our classes alone are new.
ClassRepository loadOver(const std::filesystem::path& schema) {
    ClassRepository loaded;
    loaded.load(schema);
    loaded.keepDeclared();
    loaded.loadDirectory(source / "schema");
    loaded.complete();
    return loaded;
}

ClassRepository loadOverFullParents() {
    return loadOver(fullSchema);
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
    EXPECT_EQ(ours, 21U);
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

TEST(FullSchema, TakesThePlaceOfTheReducedOneInTheObjectManager) {
    Configuration configuration;
    configuration.schemaDirectories = {source / "schema"};
    const ObjectManager reduced(configuration);
    configuration.fullSchema = fullSchema;
    const ObjectManager full(configuration);
    const auto described = [](const ObjectManager& manager) {
        const auto& state =
            *manager.repository().find("CIM_ProtocolEndpoint")->property("EnabledState");
        return state.defaultValue.isNull() ? "reduced" : "full";
    };
    EXPECT_STREQ(described(reduced), "reduced");
    EXPECT_STREQ(described(full), "full");
    EXPECT_EQ(reduced.repository().find("CIM_Job"), nullptr);
    EXPECT_NE(full.repository().find("CIM_Job"), nullptr);
    EXPECT_TRUE(full.repository().isA("QVXZR_DHCPProtocolEndpoint", "CIM_ManagedElement"));
}

TEST(FullSchema, JobsOfMethodsHaveAKeyOfTheirOwn) {
    const ClassRepository repository = loadOverFullParents();
    EXPECT_EQ(repository.find("CIM_ConcreteJob")->superclass, "CIM_Job");
    EXPECT_TRUE(repository.find("CIM_ConcreteJob")->property("InstanceID")->isKey());
    EXPECT_FALSE(repository.find("CIM_Job")->property("InstanceID")->isKey());
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
    const ClassRepository repository =
        loadOver(std::filesystem::path(directory) / "cim_schema_2.41.0.mof");
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
