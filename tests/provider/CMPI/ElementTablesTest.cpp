// What the tables of the served classes say, beside what the classes' declarations say.
#include "CMPI/ElementTables.h"

#include <gtest/gtest.h>

#include <set>

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
    const cimom::ClassDeclaration* const declaration = host.repository().find(table.name);
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
    for (const auto& property : host.repository().find(table.name)->properties) {
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
    const cimom::ClassDeclaration* const declaration = host.repository().find(table.name);
    ASSERT_NE(declaration, nullptr);
    EXPECT_TRUE(declaration->isAssociation());
    for (const auto& end : {table.first, table.second}) {
        const cimom::PropertyDeclaration* const reference = declaration->property(end.role);
        ASSERT_NE(reference, nullptr) << end.role;
        EXPECT_TRUE(host.repository().isA(end.className, reference->referenceClass)) << end.role;
        EXPECT_TRUE(host.repository().isA(end.className, end.standardClass)) << end.role;
    }
    for (const auto& property : table.ownProperties) {
        EXPECT_NE(declaration->property(property.name), nullptr) << property.name;
    }
}

}  // namespace
