#include "manager/AssociationFilter.h"

#include <gtest/gtest.h>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"

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
