// What the tables of the served classes say, beside what the classes' declarations say.
#include "CMPI/ElementTables.h"

#include <gtest/gtest.h>

#include <array>
#include <set>
#include <string>
#include <vector>

#include "CMPI/CMPIDHCPCapabilities.h"
#include "CMPI/CMPIDHCPElementCapabilities.h"
#include "CMPI/CMPIDHCPElementSettingData.h"
#include "CMPI/CMPIDHCPHostedAccessPoint.h"
#include "CMPI/CMPIDHCPOrderedComponent.h"
#include "CMPI/CMPIDHCPProtocolEndpoint.h"
#include "CMPI/CMPIDHCPRemoteAccessAvailableToElement.h"
#include "CMPI/CMPIDHCPRemoteHostedAccessPoint.h"
#include "CMPI/CMPIDHCPRemoteServiceAccessPoint.h"
#include "CMPI/CMPIDHCPSettingData.h"
#include "CMPI/CMPISAPSAPDependency.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "kit/Host.h"

namespace {

using namespace ZR::DHCPClientProvider;
using test::Host;

template <typename Row>
class ElementTables : public ::testing::Test {};
using ElementRows = ::testing::Types<DHCPProtocolEndpointRow, DHCPCapabilitiesRow,
                                     DHCPRemoteServiceAccessPointRow, DHCPSettingDataRow>;
TYPED_TEST_SUITE(ElementTables, ElementRows);

TYPED_TEST(ElementTables, EveryPropertyIsDeclaredByTheClassAndStandsOnce) {
    const Host host;
    const auto& table = TypeParam::elementClass;
    const cimom::ClassDeclaration* const declaration =
        host.repository().find(TypeParam::servedClass.name);
    ASSERT_NE(declaration, nullptr);
    std::set<std::string> names;
    for (const auto& property : table.properties) {
        EXPECT_TRUE(names.insert(property.name).second) << property.name;
        const cimom::PropertyDeclaration* const declared = declaration->property(property.name);
        ASSERT_NE(declared, nullptr) << property.name;
        EXPECT_EQ(declared->name, property.name);
    }
    EXPECT_FALSE(names.empty());
}

TYPED_TEST(ElementTables, ThePathHasExactlyTheKeysThatTheClassDeclares) {
    const Host host;
    const auto& table = TypeParam::elementClass;
    std::set<std::string> declared;
    for (const auto& property : host.repository().find(TypeParam::servedClass.name)->properties) {
        if (property.isKey()) {
            declared.insert(property.name);
        }
    }
    std::set<std::string> keys;
    for (const auto& key : table.pathKeys) {
        keys.insert(key.name);
    }
    EXPECT_EQ(keys, declared);
    for (const auto& filter : table.filterKeys) {
        EXPECT_TRUE(declared.contains(filter.name)) << filter.name;
    }
}

/// An element whose lists are known and empty, or not known at all.
struct ElementWithLists {
    // NOLINTBEGIN(readability-non-const-parameter,readability-convert-member-functions-to-static)
    bool getNumbers(std::vector<unsigned short>& /*value*/) const { return true; }
    bool getTexts(std::vector<std::string>& /*value*/) const { return true; }
    bool getUnknown(std::vector<unsigned short>& /*value*/) const { return false; }
    // NOLINTEND(readability-non-const-parameter,readability-convert-member-functions-to-static)
};

TEST(ElementLists, EmptyListThatIsKnownIsAnEmptyArrayAndOneThatIsNotKnownIsLeftOut) {
    constexpr std::array properties{
        property<&ElementWithLists::getNumbers>("OptionsReceived"),
        property<&ElementWithLists::getTexts>("StatusDescriptions"),
        property<&ElementWithLists::getUnknown>("OperationalStatus"),
    };
    Host host;
    const Host::Response response = host.request(
        Host::Kind::instances, test::pathOf("QVXZR_DHCPProtocolEndpoint"),
        [&](auto* /*context*/, auto* result, auto* path) {
            return result->ft->returnInstance(
                result, makeInstance<ElementWithLists>(host.broker(), path, {}, properties));
        });
    ASSERT_EQ(response.instances.size(), 1U);
    ASSERT_TRUE(response.instances[0]);
    const auto expectEmpty = [&](const char* name, cimom::Type type) {
        const cimom::Value* const value = response.instances[0]->property(name);
        ASSERT_NE(value, nullptr) << name;
        EXPECT_EQ(value->type, type) << name;
        ASSERT_NE(value->array(), nullptr) << name;
        EXPECT_TRUE(value->array()->empty()) << name;
    };
    expectEmpty("OptionsReceived", cimom::Type::uint16);
    expectEmpty("StatusDescriptions", cimom::Type::string);
    EXPECT_EQ(response.instances[0]->property("OperationalStatus"), nullptr);
}

template <typename Row>
class AssociationTables : public ::testing::Test {};
using AssociationRows =
    ::testing::Types<DHCPElementCapabilitiesAssociation, SAPSAPDependencyAssociation,
                     DHCPHostedAccessPointAssociation,
                     DHCPRemoteAccessAvailableToElementAssociation,
                     DHCPRemoteHostedAccessPointAssociation, DHCPElementSettingDataAssociation,
                     DHCPOrderedComponentAssociation>;
TYPED_TEST_SUITE(AssociationTables, AssociationRows);

TYPED_TEST(AssociationTables, TheEndsAreTheReferencesThatTheClassDeclares) {
    const Host host;
    const auto& table = TypeParam::associationClass;
    const cimom::ClassDeclaration* const declaration =
        host.repository().find(TypeParam::servedClass.name);
    ASSERT_NE(declaration, nullptr);
    EXPECT_TRUE(declaration->isAssociation());
    const auto expectEnd = [&](const auto& end, const ZR::Classes::Class& served) {
        const cimom::PropertyDeclaration* const reference = declaration->property(end.role);
        ASSERT_NE(reference, nullptr) << end.role;
        EXPECT_TRUE(host.repository().isA(served.name, reference->referenceClass)) << end.role;
        EXPECT_TRUE(host.repository().isA(served.name, served.standardName)) << end.role;
    };
    expectEnd(table.first, TypeParam::First::servedClass);
    expectEnd(table.second, TypeParam::Second::servedClass);
    for (const auto& property : table.ownProperties) {
        EXPECT_NE(declaration->property(property.name), nullptr) << property.name;
    }
}

}  // namespace
