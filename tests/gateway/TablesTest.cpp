// The tables of the gateway say what the schema says.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <map>
#include <set>

#include "Associations.h"
#include "Classes.h"
#include "broker/BrokerTypes.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "kit/StrictHost.h"
#include "kit/Tree.h"

namespace ZR::DHCPClientGateway {
namespace {

using ::testing::Contains;
using ::testing::ElementsAreArray;
using ::testing::SizeIs;
using ::testing::UnorderedElementsAreArray;

const cimom::ClassRepository& repository() {
    static const cimom::ClassRepository instance = [] {
        cimom::ClassRepository made;
        made.loadDirectory(ZR_SOURCE_DIR "/schema");
        made.complete();
        return made;
    }();
    return instance;
}

const cimom::ClassDeclaration& declarationOf(const ServedClass& served) {
    return *repository().find(served.name);
}

class TablesTest : public ::testing::TestWithParam<ServedClass> {
  protected:
    const ServedClass& served_ = GetParam();
    const cimom::ClassDeclaration& declaration_ = declarationOf(served_);
};

TEST_P(TablesTest, HaveTheAncestors) {
    std::vector<std::string> ancestors;
    for (std::string each = declaration_.superclass; !each.empty();
         each = repository().find(each)->superclass) {
        ancestors.push_back(each);
    }
    EXPECT_THAT(served_.ancestors, ElementsAreArray(ancestors));
    for (const std::string& each : ancestors) {
        EXPECT_TRUE(derivesFrom(served_, each));
    }
    EXPECT_FALSE(derivesFrom(served_, "CIM_Service"));
}

TEST_P(TablesTest, HaveTheKeys) {
    std::vector<std::string> keys;
    for (const cimom::PropertyDeclaration& each : declaration_.properties) {
        if (each.isKey()) {
            keys.push_back(each.name);
        }
    }
    EXPECT_THAT(served_.keys, UnorderedElementsAreArray(keys));
}

TEST_P(TablesTest, HaveTheProperties) {
    std::map<std::string, CMPIType> declared;
    for (const cimom::PropertyDeclaration& each : declaration_.properties) {
        declared.emplace(each.name, cimom::broker::cmpiType(each.type, each.isArray));
    }
    if (served_.server == Server::otherwise) {
        EXPECT_THAT(served_.properties, SizeIs(0));
        return;
    }
    std::map<std::string, CMPIType> known;
    for (const Property& each : served_.properties) {
        known.emplace(each.name, each.type);
    }
    EXPECT_EQ(known, declared);
}

TEST_P(TablesTest, HaveTheDefaultsOfTheStandardSchema) {
    static const cimom::ClassRepository standard = [] {
        cimom::ClassRepository made;
        made.load(strict::wholeSchema);
        made.complete();
        return made;
    }();
    for (const Property& each : served_.properties) {
        std::optional<std::uint64_t> first;
        for (const char* ancestor : served_.ancestors) {
            const cimom::ClassDeclaration* declaration = standard.find(ancestor);
            const auto* property =
                declaration == nullptr ? nullptr : declaration->property(each.name);
            if (property != nullptr && !property->defaultValue.isNull()) {
                first = std::get<std::uint64_t>(*property->defaultValue.scalar());
            }
        }
        EXPECT_EQ(each.standardDefault, first) << each.name;
    }
}

TEST_P(TablesTest, KnowWhatCanBeWritten) {
    const cimom::PropertyDeclaration* writable = nullptr;
    for (const cimom::PropertyDeclaration& each : declaration_.properties) {
        if (cimom::isTrue(each.qualifier("Write")) && each.classOrigin.starts_with("CIM_Setting")) {
            writable = &each;
        }
    }
    if (served_.writable != nullptr) {
        ASSERT_NE(writable, nullptr);
        EXPECT_EQ(writable->name, served_.writable);
    }
}

INSTANTIATE_TEST_SUITE_P(Of, TablesTest,
                         ::testing::ValuesIn(allClasses().begin(), allClasses().end()),
                         [](const auto& each) { return std::string(each.param.name); });

TEST(TablesTest, HaveTheClassesOfTheRegistration) {
    auto registrations = cimom::readRegistrations(ZR_SOURCE_DIR "/schema/DHCPClient.registration");
    std::erase_if(registrations, [](const cimom::Registration& each) {
        return each.provider == "DHCPClientExtensions";
    });
    EXPECT_THAT(allClasses(), SizeIs(registrations.size()));
    for (const cimom::Registration& registration : registrations) {
        const ServedClass* served = findClass(registration.className);
        ASSERT_NE(served, nullptr) << registration.className;
        EXPECT_EQ(registration.association, served->server == Server::gateway);
        EXPECT_EQ(registration.association, findAssociation(*served) != nullptr);
        EXPECT_EQ(registration.provider, served->server == Server::otherwise
                                             ? "DHCPClientNeighbours"
                                             : "DHCPClientGateway");
    }
    EXPECT_NE(findClass("qvxzr_dhcpcapabilities"), nullptr);
    EXPECT_EQ(findClass("CIM_DHCPCapabilities"), nullptr);
}

TEST(TablesTest, HaveTheEndsOfTheAssociations) {
    for (const Association& association : allAssociations()) {
        const cimom::ClassDeclaration& declaration = declarationOf(*findClass(association.name));
        std::size_t references = 0;
        for (const cimom::PropertyDeclaration& each : declaration.properties) {
            if (each.type != cimom::Type::reference) {
                continue;
            }
            const End& end = association.ends.at(references++);
            EXPECT_EQ(each.name, end.role) << association.name;
            for (const char* className : end.classes) {
                EXPECT_TRUE(repository().isA(className, each.referenceClass))
                    << association.name << ' ' << end.role << ' ' << className;
            }
        }
        EXPECT_EQ(references, association.ends.size());
    }
}

/// What the exact provider sets, and what it never does: the former only here if a machine
/// has it.
class PresenceTest : public test::TreeTest {};

TEST_F(PresenceTest, IsThatOfTheExactProvider) {
    setTree({test::host({test::staticInterface("eth1"),
                         test::dhcpInterface("eth0", {"192.0.2.1", "2001:db8::1"})})});
    strict::StrictHost host(ZR_SOURCE_DIR "/schema",
                            {ZR_SOURCE_DIR "/schema/exact/DHCPClientProvider.registration"},
                            ZR_BINARY_DIR "/lib/cmpi");
    std::size_t seen = 0;
    for (const ServedClass& served : allClasses()) {
        if (served.server != Server::exact) {
            continue;
        }
        // The schema declares no defaults that would be shown.
        for (const auto& instance : host.enumerate({"", "root/cimv2", served.name, {}}).instances) {
            ++seen;
            for (const Property& property : served.properties) {
                const cimom::Value* value = instance.property(property.name);
                const bool set = value != nullptr && !value->isNull();
                if (property.presence != Presence::sometimes) {
                    EXPECT_EQ(set, property.presence == Presence::always)
                        << served.name << '.' << property.name;
                }
            }
        }
    }
    EXPECT_EQ(seen, 1U + 1U + 2U + 2U);
}

}  // namespace
}  // namespace ZR::DHCPClientGateway
