#include "cimom/Interop.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <set>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/ObjectManager.h"
#include "cimom/ObjectPathText.h"
#include "cimom/OwnClass.h"
#include "cimom/Results.h"
#include "kit/TestManager.h"

namespace cimom::test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::UnorderedElementsAre;

/// Adds namespaces, and has no instances.
class Elsewhere final : public OwnClass {
  public:
    Elsewhere()
        : OwnClass("CIM_ComputerSystem", {"root/cimv2", "root/cimv2/below", "root/cimv2x"}) {}
    [[nodiscard]] std::vector<Instance> instances(const std::string& /*nameSpace*/) const override {
        return {};
    }
};

class Interop : public testing::Test {
  protected:
    Interop() {
        manager.serve(std::make_unique<Elsewhere>());
        serveInterop(manager, {"server",
                               "1.2.3",
                               {{"CIM-XML", "CIM-XML over HTTP", 2, "1.0", {2, 6}, {3}},
                                {"Other", "another one", 1, "7", {2}, {2}}}});
    }

    std::vector<Instance> all(const std::string& className,
                              const std::string& nameSpace = "root/interop") {
        const InstancesResult result = manager.enumerateInstances({"", nameSpace, className, {}});
        EXPECT_EQ(result.status, Status{});
        std::vector<Instance> found;
        for (const auto& instance : result.instances) {
            found.push_back(*instance);
        }
        return found;
    }

    ObjectManager manager{{{std::filesystem::path(ZR_SOURCE_DIR) / "schema"}, {}, {}, "testhost"}};
};

TEST_F(Interop, TellsOfOneObjectManager) {
    const std::vector<Instance> managers = all("CIM_ObjectManager");
    ASSERT_EQ(managers.size(), 1U);
    const Instance& one = managers.front();
    EXPECT_EQ(textOf(one, "ElementName"), "server");
    EXPECT_EQ(textOf(one, "Description"), "server object manager, version 1.2.3");
    EXPECT_EQ(textOf(one, "SystemName"), "testhost");
    EXPECT_EQ(textOf(one, "SystemCreationClassName"), "CIM_ComputerSystem");
    EXPECT_EQ(textOf(one, "CreationClassName"), "CIM_ObjectManager");
    EXPECT_EQ(textOf(one, "Name"), ManagerIdentity(manager).name);
    EXPECT_EQ(all("CIM_WBEMService").size(), 1U);
}

TEST_F(Interop, TellsOfEveryNamespaceByEveryName) {
    std::vector<std::string> names;
    for (const Instance& instance : all("CIM_Namespace", "Interop")) {
        names.push_back(textOf(instance, "Name"));
        EXPECT_EQ(textOf(instance, "ObjectManagerName"), ManagerIdentity(manager).name);
        EXPECT_NE(manager.findNameSpace(names.back()), nullptr);
    }
    EXPECT_THAT(names, UnorderedElementsAre("root/cimv2", "root/cimv2/below", "root/cimv2x",
                                            "root/interop", "interop"));
}

TEST_F(Interop, TellsOfNamespacesBelowTheOneThatIsAsked) {
    const std::vector<Instance> below = all("__namespace", "ROOT/cimv2");
    ASSERT_EQ(below.size(), 1U);
    EXPECT_EQ(toText(below.front().path), "root/cimv2:__Namespace.Name=\"below\"");
    EXPECT_THAT(all("__Namespace"), IsEmpty());
}

TEST_F(Interop, TellsHowItIsReached) {
    const std::vector<Instance> mechanisms = all("CIM_ObjectManagerCommunicationMechanism");
    ASSERT_EQ(mechanisms.size(), 2U);
    EXPECT_EQ(textOf(mechanisms[0], "Name"), "CIM-XML");
    EXPECT_EQ(textOf(mechanisms[0], "Version"), "1.0");
    EXPECT_EQ(*mechanisms[0].property("FunctionalProfilesSupported"),
              (Value{Type::uint16, true, Array{std::uint64_t{2}, std::uint64_t{6}}}));
    EXPECT_EQ(scalarOf(mechanisms[1].property("CommunicationMechanism")), Scalar(std::uint64_t{1}));
}

TEST_F(Interop, EveryInstanceIsGotByItsPathAsItWasEnumerated) {
    std::size_t count = 0;
    for (const std::string className :
         {"CIM_ObjectManager", "CIM_Namespace", "CIM_ObjectManagerCommunicationMechanism",
          "CIM_NamespaceInManager", "CIM_CommMechanismForManager"}) {
        const ClassDeclaration& declaration = *manager.repository().find(className);
        std::set<std::string> paths;
        for (const Instance& instance : all(className)) {
            EXPECT_EQ(instance.path.nameSpace, "root/interop");
            EXPECT_TRUE(paths.insert(toText(instance.path)).second) << toText(instance.path);
            const InstancesResult got = manager.getInstance(instance.path);
            ASSERT_EQ(got.status, Status{}) << toText(instance.path);
            EXPECT_EQ(*got.instances.front(), instance);
            // Nothing is set that the class does not have, and all that it requires is.
            EXPECT_EQ(instance.properties.size(), declaration.properties.size());
            for (const PropertyDeclaration& property : declaration.properties) {
                const Value* const value = instance.property(property.name);
                ASSERT_NE(value, nullptr) << className << '.' << property.name;
                EXPECT_EQ(value->type, property.type) << className << '.' << property.name;
                EXPECT_EQ(value->isArray, property.isArray) << className << '.' << property.name;
                if (property.isKey() || isTrue(property.qualifier("Required"))) {
                    EXPECT_FALSE(value->isNull()) << className << '.' << property.name;
                }
            }
            ++count;
        }
    }
    EXPECT_EQ(count, 1U + 5U + 2U + 5U + 2U);
}

TEST_F(Interop, TheObjectManagerIsAssociatedWithAllOfThem) {
    const ObjectPath one = all("CIM_ObjectManager").front().path;
    AssociationRequest request;
    request.assocClass = "CIM_NamespaceInManager";
    EXPECT_EQ(manager.associators(one, request).instances.size(), 5U);
    request.assocClass = "CIM_ServiceAccessBySAP";
    request.resultClass = "CIM_ServiceAccessPoint";
    EXPECT_EQ(manager.associators(one, request).instances.size(), 2U);
    const ObjectPath nameSpace = all("CIM_Namespace").front().path;
    EXPECT_EQ(*manager.associators(nameSpace).instances.at(0), all("CIM_ObjectManager").front());
    EXPECT_EQ(manager.referenceNames(nameSpace).paths.size(), 1U);
}

TEST_F(Interop, APathByTheOtherNameOfTheNamespaceIsTheSame) {
    ObjectPath path = all("CIM_NamespaceInManager").front().path;
    path.nameSpace = "interop";
    for (NamedValue& key : path.keys) {
        ObjectPath end = referenceOf(&key.value);
        end.nameSpace = "interop";
        key.value.content = Scalar(std::make_shared<const ObjectPath>(end));
    }
    EXPECT_EQ(manager.getInstance(path).status, Status{});
}

TEST_F(Interop, NothingIsCreatedThere) {
    EXPECT_EQ(manager
                  .createInstance({{"", "interop", "CIM_Namespace", {}},
                                   {{"Name", Value::ofString("root/new")}}})
                  .status.code,
              CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(manager.deleteInstance(all("CIM_Namespace").front().path).code,
              CMPI_RC_ERR_NOT_SUPPORTED);
}

}  // namespace
}  // namespace cimom::test
