#include <gtest/gtest.h>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"
#include "cimom/Results.h"
#include "kit/TestManager.h"
#include "manager/AssociationFilter.h"

namespace cimom::test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class AssociationRequests : public TestManager {
  protected:
    const ObjectPath l1 = path("Test_Left.Id=\"l1\"");
    const ObjectPath r1 = path("Test_Right.Id=\"r1\"");

    std::vector<std::string> far(const ObjectPath& from, const AssociationRequest& request) {
        const PathsResult paths = manager.associatorNames(from, request);
        const InstancesResult instances = manager.associators(from, request);
        EXPECT_EQ(paths.status, Status{});
        EXPECT_EQ(instances.status, Status{});
        EXPECT_EQ(names(paths.paths), names(instances.instances));
        return names(paths.paths);
    }
    std::vector<std::string> links(const ObjectPath& from, const AssociationRequest& request) {
        const PathsResult paths = manager.referenceNames(from, request);
        const InstancesResult instances = manager.references(from, request);
        EXPECT_EQ(paths.status, Status{});
        EXPECT_EQ(instances.status, Status{});
        EXPECT_EQ(names(paths.paths), names(instances.instances));
        std::vector<std::string> short_;
        for (const auto& one : paths.paths) {
            const auto id = [&one](const char* role) {
                return textOf(referenceOf(one->key(role)).key("Id"));
            };
            short_.push_back(one->className.substr(5) + " " + id("Near") + " " + id("Far"));
        }
        return short_;
    }

    static AssociationRequest request(std::optional<std::string> assocClass,
                                      std::optional<std::string> resultClass,
                                      std::optional<std::string> role,
                                      std::optional<std::string> resultRole) {
        return {std::move(assocClass), std::move(resultClass), std::move(role),
                std::move(resultRole), std::nullopt,           ""};
    }
    static constexpr std::nullopt_t none = std::nullopt;
};

TEST_F(AssociationRequests, ProviderIsAskedOnceForAllItsAssociations) {
    const InstancesResult result = manager.associators(l1);
    EXPECT_EQ(result.status, Status{});
    EXPECT_THAT(names(result.instances),
                ElementsAre("Test_Right.Id=\"r1\"", "Test_RightSpecial.Id=\"s1\""));
    EXPECT_EQ(takeLog(), "associators Test_Left null null null null\n");
}

TEST_F(AssociationRequests, ClassesReachTheProviderInTheirCanonicalCase) {
    manager.associatorNames(path("test_left.Id=\"l1\""),
                            request("test_LINKA", "test_left", "near", none));
    EXPECT_THAT(takeLog(),
                testing::StartsWith("associatorNames Test_Left Test_LinkA Test_Left near null\n"));
}

TEST_F(AssociationRequests, ParentAsResultClassIsFilteredAndNotPassed) {
    EXPECT_THAT(far(l1, request(none, "Test_Right", none, none)),
                ElementsAre("Test_Right.Id=\"r1\"", "Test_RightSpecial.Id=\"s1\""));
    EXPECT_THAT(takeLog(), testing::StartsWith("associatorNames Test_Left null null null null\n"));
    EXPECT_THAT(far(l1, request(none, "Test_RightSpecial", none, none)),
                ElementsAre("Test_RightSpecial.Id=\"s1\""));
    EXPECT_THAT(far(l1, request(none, "Test_Left", none, none)), IsEmpty());
}

TEST_F(AssociationRequests, AssociationClassIsTheProvidersMatter) {
    EXPECT_THAT(far(l1, request("Test_LinkB", none, none, none)),
                ElementsAre("Test_RightSpecial.Id=\"s1\""));
    EXPECT_THAT(far(l1, request("Test_Link", none, none, none)),
                ElementsAre("Test_Right.Id=\"r1\"", "Test_RightSpecial.Id=\"s1\""));
}

TEST_F(AssociationRequests, UnknownClassIsAnInvalidParameterOfEachOperation) {
    takeLog();
    const Status refused{CMPI_RC_ERR_INVALID_PARAMETER,
                         "no class \"Nobody_Knows\", by which the associations are to be chosen"};
    for (const AssociationRequest& unknown :
         {request("Nobody_Knows", none, none, none), request(none, "Nobody_Knows", none, none)}) {
        EXPECT_EQ(manager.associators(l1, unknown).status, refused);
        EXPECT_EQ(manager.associatorNames(l1, unknown).status, refused);
    }
    const AssociationRequest unknown = request(none, "Nobody_Knows", none, none);
    EXPECT_EQ(manager.references(l1, unknown).status, refused);
    EXPECT_EQ(manager.referenceNames(l1, unknown).status, refused);
    EXPECT_EQ(takeLog(), "not loaded");
}

TEST_F(AssociationRequests, ClassThatIsNoneOfAssociationsHasNone) {
    EXPECT_THAT(far(l1, request("Test_Right", none, none, none)), IsEmpty());
    EXPECT_THAT(links(l1, request(none, "Test_Right", none, none)), IsEmpty());
}

TEST_F(AssociationRequests, RoleThatNoAssociationHasLeavesNothingAndNeedsNoProvider) {
    for (const char* const assocClass : {"Test_LinkA", "Test_Link"}) {
        EXPECT_THAT(far(l1, request(assocClass, none, "Middle", none)), IsEmpty());
        EXPECT_THAT(far(l1, request(assocClass, none, none, "Middle")), IsEmpty());
        EXPECT_THAT(links(l1, request(none, assocClass, "Middle", none)), IsEmpty());
    }
    EXPECT_EQ(takeLog(), "not loaded");
}

TEST_F(AssociationRequests, RoleKeepsAssociationsInWhichTheSourcePlaysIt) {
    // r1 is the far end of l1 and l2 and the near end of another link to l2.
    EXPECT_THAT(far(r1, {}),
                ElementsAre("Test_Left.Id=\"l1\"", "Test_Left.Id=\"l2\"", "Test_Left.Id=\"l2\""));
    EXPECT_THAT(far(r1, request("Test_LinkA", none, "Near", none)),
                ElementsAre("Test_Left.Id=\"l2\""));
    EXPECT_THAT(far(r1, request("Test_LinkA", none, "FAR", none)),
                ElementsAre("Test_Left.Id=\"l1\""));
    EXPECT_THAT(far(r1, request(none, none, "Middle", none)), IsEmpty());
}

TEST_F(AssociationRequests, ResultRoleKeepsFarEndsThatPlayIt) {
    EXPECT_THAT(far(r1, request("Test_LinkA", none, none, "Far")),
                ElementsAre("Test_Left.Id=\"l2\""));
    EXPECT_THAT(far(r1, request("Test_LinkA", none, "Near", "Far")),
                ElementsAre("Test_Left.Id=\"l2\""));
    EXPECT_THAT(far(r1, request("Test_LinkA", none, "Near", "Near")), IsEmpty());
}

TEST_F(AssociationRequests, ReferencesWithoutClassAskForEachServedAssociationClass) {
    EXPECT_THAT(links(l1, {}), ElementsAre("LinkA l1 r1", "LinkB l1 s1"));
    EXPECT_EQ(takeLog(),
              "referenceNames Test_Left Test_LinkA\nreferenceNames Test_Left Test_LinkB\n"
              "references Test_Left Test_LinkA\nreferences Test_Left Test_LinkB\n");
}

TEST_F(AssociationRequests, ReferencesOfAParentClassAreThoseOfItsSubclasses) {
    EXPECT_THAT(links(l1, request(none, "TEST_link", none, none)),
                ElementsAre("LinkA l1 r1", "LinkB l1 s1"));
    EXPECT_THAT(links(l1, request(none, "Test_LinkB", none, none)), ElementsAre("LinkB l1 s1"));
    EXPECT_THAT(links(l1, request(none, "Test_Base", none, none)), IsEmpty());
}

TEST_F(AssociationRequests, ReferencesAreFilteredByRole) {
    EXPECT_THAT(links(r1, request(none, none, "near", none)), ElementsAre("LinkA r1 l2"));
    EXPECT_THAT(links(r1, request(none, none, "Far", none)),
                ElementsAre("LinkA l1 r1", "LinkB l2 r1"));
}

TEST_F(AssociationRequests, PropertyListLimitsInstances) {
    AssociationRequest limited;
    limited.propertyList = {"Note"};
    for (const auto& instance : manager.associators(l1, limited).instances) {
        EXPECT_EQ(instance->properties.size(), 1U);
        EXPECT_NE(instance->path.key("Id"), nullptr);
    }
    limited.propertyList = std::vector<std::string>{};
    for (const auto& instance : manager.references(l1, limited).instances) {
        EXPECT_TRUE(instance->properties.empty());
        EXPECT_EQ(instance->path.keys.size(), 2U);
        EXPECT_EQ(instance->path.host, "testhost");
    }
}

TEST_F(AssociationRequests, UnknownObjectClassOrNamespaceIsTold) {
    EXPECT_EQ(manager.associators(path("Nobody_Knows.Id=\"1\"")).status.code,
              CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(manager.references(parseObjectPath("x:Test_Left.Id=\"l1\"")).status.code,
              CMPI_RC_ERR_INVALID_NAMESPACE);
}

TEST_F(AssociationRequests, NamespaceWithoutAssociationsHasNone) {
    const InstancesResult result =
        manager.associators(parseObjectPath("root/other:Test_Left.Id=\"l1\""));
    EXPECT_EQ(result.status, Status{});
    EXPECT_TRUE(result.instances.empty());
}

}  // namespace
}  // namespace cimom::test

namespace cimom {
namespace {

Value reference(const std::string& text) {
    return {Type::reference, false,
            Scalar(std::make_shared<const ObjectPath>(parseObjectPath(text)))};
}

class AssociationFilter : public testing::Test {
  protected:
    AssociationFilter() { repository.load(BROKER_TEST_DIR "/schema/Test.mof"); }

    static Instance link(const std::string& near, const std::string& far) {
        return {{"", "", "Test_LinkA", {{"Near", reference(near)}, {"Far", reference(far)}}}, {}};
    }
    ClassRepository repository;
    const ObjectPath l1 = parseObjectPath("Test_Left.Id=\"l1\"");
    const ObjectPath l2 = parseObjectPath("Test_Left.Id=\"l2\"");
};

TEST_F(AssociationFilter, ClassMatchesItselfAndItsParents) {
    EXPECT_TRUE(isOfClass("Test_Left", std::nullopt, repository));
    EXPECT_TRUE(isOfClass("Test_Left", "test_base", repository));
    EXPECT_TRUE(isOfClass("Unknown", "UNKNOWN", repository));
    EXPECT_FALSE(isOfClass("Test_Base", "Test_Left", repository));
}

TEST_F(AssociationFilter, RoleIsTheReferenceThatNamesTheObject) {
    const Instance one = link("Test_Left.Id=\"l1\"", "Test_Left.Id=\"l2\"");
    EXPECT_TRUE(playsRole(one, l1, "near", repository));
    EXPECT_FALSE(playsRole(one, l1, "Far", repository));
    EXPECT_FALSE(playsRole(one, l1, "Middle", repository));
    EXPECT_TRUE(playsRole(one, l1, std::nullopt, repository));
    EXPECT_FALSE(playsRole(one, parseObjectPath("Test_Left.Id=\"l3\""), std::nullopt, repository));
}

TEST_F(AssociationFilter, ClassesCanBeConnectedByTheReferencesOfTheAssociation) {
    repository.load(BROKER_TEST_DIR "/stranger/schema/Stranger.mof");
    const ClassDeclaration& tie = *repository.find("Stranger_Link");
    const auto can = [&](const std::optional<std::string>& source,
                         const std::optional<std::string>& other, const char* role = nullptr,
                         const char* resultRole = nullptr) {
        const auto named = [](const char* name) {
            return name == nullptr ? std::nullopt : std::optional<std::string>(name);
        };
        return canConnect(tie, source, other, named(role), named(resultRole), repository);
    };
    EXPECT_TRUE(can("Stranger_Left", "Stranger_Right"));
    EXPECT_TRUE(can("Stranger_Right", "Stranger_Left"));
    EXPECT_FALSE(can("Stranger_Left", "Stranger_Left"));
    EXPECT_TRUE(can("Stranger_Thing", "Stranger_Thing"));  // parents of both
    EXPECT_FALSE(can("Stranger_Left", "Stranger_Apart"));
    EXPECT_FALSE(can("Stranger_Apart", std::nullopt));
    EXPECT_TRUE(can("Stranger_Left", std::nullopt, "near", "FAR"));
    EXPECT_FALSE(can("Stranger_Left", std::nullopt, "Far"));
    EXPECT_FALSE(can("Stranger_Left", std::nullopt, nullptr, "Near"));
    EXPECT_FALSE(can(std::nullopt, std::nullopt, "Near", "Near"));
    EXPECT_TRUE(canConnect(*repository.find("Stranger_Left"), "Stranger_Apart", std::nullopt,
                           std::nullopt, std::nullopt, repository));
}

TEST_F(AssociationFilter, ConnectionNeedsTwoDifferentReferences) {
    const std::vector<Instance> all{link("Test_Left.Id=\"l1\"", "Test_Left.Id=\"l2\"")};
    EXPECT_TRUE(connects(all, l1, l2, std::nullopt, std::nullopt, repository));
    EXPECT_TRUE(connects(all, l1, l2, "Near", "Far", repository));
    EXPECT_FALSE(connects(all, l1, l2, "Far", std::nullopt, repository));
    EXPECT_FALSE(connects(all, l1, l2, std::nullopt, "Near", repository));
    EXPECT_FALSE(connects(all, l1, l1, std::nullopt, std::nullopt, repository));
    const std::vector<Instance> loop{link("Test_Left.Id=\"l1\"", "Test_Left.Id=\"l1\"")};
    EXPECT_TRUE(connects(loop, l1, l1, "Near", "Far", repository));
}

TEST_F(AssociationFilter, ReferencesMayBePropertiesOnly) {
    Instance one = link("Test_Left.Id=\"l1\"", "Test_Left.Id=\"l2\"");
    one.properties = std::move(one.path.keys);
    one.path.keys.clear();
    EXPECT_TRUE(connects({one}, l2, l1, "Far", "Near", repository));
}

TEST_F(AssociationFilter, NullReferenceConnectsNothing) {
    Instance one = link("Test_Left.Id=\"l1\"", "Test_Left.Id=\"l2\"");
    one.path.keys[1].value = Value::null(Type::reference, false);
    EXPECT_FALSE(connects({one}, l1, l2, std::nullopt, std::nullopt, repository));
}

}  // namespace
}  // namespace cimom
