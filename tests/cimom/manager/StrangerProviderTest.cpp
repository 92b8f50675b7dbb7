// A provider of another maker, which relies on its host: what it delivers is not of the
// source alone, its paths have no keys but properties, and others beside it fail.
#include "kit/Files.h"
#include "kit/TestManager.h"

namespace cimom::test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class StrangerProvider : public testing::Test {
  protected:
    /// With the stranger, and further registrations.
    ObjectManager& manager(const std::string& further = "") {
        return manage({BROKER_TEST_DIR "/stranger/stranger.reg"}, further);
    }
    /// With these registrations alone.
    ObjectManager& managerOf(const std::string& registrations) { return manage({}, registrations); }

    static std::string registration(const std::string& name) {
        return "Stranger_" + name + "Link root/test " + name + " StrangerProvider association\n";
    }
    static ObjectPath path(const std::string& text) { return parseObjectPath("root/test:" + text); }

    std::vector<std::string> associators(const AssociationRequest& request = {}) const {
        const PathsResult paths = manager_->associatorNames(l1, request);
        const InstancesResult instances = manager_->associators(l1, request);
        EXPECT_EQ(paths.status, Status{});
        EXPECT_EQ(instances.status, Status{});
        EXPECT_EQ(names(paths.paths), names(instances.instances));
        return names(paths.paths);
    }
    std::vector<std::string> references(const ObjectPath& source,
                                        const AssociationRequest& request = {}) const {
        const PathsResult paths = manager_->referenceNames(source, request);
        const InstancesResult instances = manager_->references(source, request);
        EXPECT_EQ(paths.status, Status{});
        EXPECT_EQ(instances.status, Status{});
        EXPECT_EQ(names(paths.paths), names(instances.instances));
        return names(paths.paths);
    }
    /// The one status of all four operations.
    Status status() const {
        const Status first = manager_->associators(l1).status;
        EXPECT_EQ(manager_->associatorNames(l1).status, first);
        EXPECT_EQ(manager_->references(l1).status, first);
        EXPECT_EQ(manager_->referenceNames(l1).status, first);
        return first;
    }

    static std::string link(const std::string& near, const std::string& far) {
        return "Stranger_Link.Near=\"root/test:Stranger_Left.Id=\\\"" + near +
               "\\\"\",Far=\"root/test:Stranger_Right.Id=\\\"" + far + "\\\"\"";
    }

    const ObjectPath l1 = path("Stranger_Left.Id=\"l1\"");
    std::vector<std::string> log;

  private:
    ObjectManager& manage(std::vector<std::filesystem::path> files, const std::string& further) {
        Configuration configuration = test::configuration("");
        configuration.schemaDirectories.emplace_back(BROKER_TEST_DIR "/stranger/schema");
        ZR::Testing::writeFile(directory_ / "further.reg", further);
        files.emplace_back(directory_ / "further.reg");
        configuration.registrationFiles = std::move(files);
        configuration.log = [this](const std::string& line) { log.push_back(line); };
        manager_ = std::make_unique<ObjectManager>(std::move(configuration));
        return *manager_;
    }

    ZR::Testing::TemporaryDirectory directory_;
    std::unique_ptr<ObjectManager> manager_;
};

TEST_F(StrangerProvider, PathsHaveTheKeysThatWereSetAsProperties) {
    ObjectManager& asked = manager();
    EXPECT_THAT(names(asked.enumerateInstanceNames(path("Stranger_Left")).paths),
                ElementsAre("Stranger_Left.Id=\"l1\"", "Stranger_Left.Id=\"l2\""));
    EXPECT_THAT(names(asked.enumerateInstanceNames(path("Stranger_Link")).paths),
                ElementsAre(link("l1", "r1"), link("l1", "r2"), link("l2", "r2")));
}

TEST_F(StrangerProvider, InstanceCanBeGotByEachNameThatAnOperationGave) {
    ObjectManager& asked = manager();
    for (const auto& given : {asked.enumerateInstanceNames(path("Stranger_Link")).paths,
                              asked.referenceNames(l1).paths}) {
        ASSERT_FALSE(given.empty());
        for (const auto& one : given) {
            const InstancesResult got = asked.getInstance(*one);
            ASSERT_EQ(got.status, Status{}) << toText(*one);
            EXPECT_EQ(names(got.instances), names({one}));
        }
    }
}

TEST_F(StrangerProvider, ReferencesToThisHostDoNotNameIt) {
    const InstancesResult result = manager().references(l1);
    ASSERT_FALSE(result.instances.empty());
    for (const auto& instance : result.instances) {
        EXPECT_EQ(instance->path.host, "testhost");
        EXPECT_EQ(referenceOf(instance->path.key("Far")).host, "");
        EXPECT_EQ(referenceOf(instance->property("Far")).host, "");
    }
}

TEST_F(StrangerProvider, KeysOutliveAPropertyListThatTheProviderAppliesItself) {
    AssociationRequest request;
    request.propertyList = {"Note"};
    const InstancesResult result = manager().references(l1, request);
    EXPECT_THAT(names(result.instances), ElementsAre(link("l1", "r1"), link("l1", "r2")));
    for (const auto& instance : result.instances) {
        EXPECT_EQ(instance->properties.size(), 1U);
    }
}

TEST_F(StrangerProvider, AssociationsOfOtherObjectsAreLeftOut) {
    manager();
    EXPECT_THAT(references(l1), ElementsAre(link("l1", "r1"), link("l1", "r2")));
    EXPECT_THAT(references(path("Stranger_Right.Id=\"r2\"")),
                ElementsAre(link("l1", "r2"), link("l2", "r2")));
    EXPECT_THAT(references(path("Stranger_Left.Id=\"l9\"")), IsEmpty());
}

TEST_F(StrangerProvider, ObjectThatNoAssociationCanHaveHasNone) {
    manager();
    EXPECT_THAT(references(path("Stranger_Apart.Id=\"a1\"")), IsEmpty());
    EXPECT_THAT(references(path("Test_Left.Id=\"l1\"")), IsEmpty());
}

TEST_F(StrangerProvider, AssociatorsThatNoAssociationCanHaveAreLeftOut) {
    manager();
    EXPECT_THAT(associators(), ElementsAre("Stranger_Right.Id=\"r1\"", "Stranger_Right.Id=\"r2\""));
    AssociationRequest request;
    request.assocClass = "Stranger_Link";
    request.resultRole = "Far";
    EXPECT_THAT(associators(request),
                ElementsAre("Stranger_Right.Id=\"r1\"", "Stranger_Right.Id=\"r2\""));
    request.resultRole = "Near";
    EXPECT_THAT(associators(request), IsEmpty());
}

TEST_F(StrangerProvider, FailureOfAnotherIsLoggedAndChangesNothing) {
    manager(registration("Failing") + "Stranger_AbsentLink root/test Absent Nowhere association\n");
    EXPECT_THAT(associators(), ElementsAre("Stranger_Right.Id=\"r1\"", "Stranger_Right.Id=\"r2\""));
    EXPECT_THAT(references(l1), ElementsAre(link("l1", "r1"), link("l1", "r2")));
    const std::string failed =
        "provider Failing failed in a request about associations of a "
        "Stranger_Left: CIM_ERR_FAILED: out of order";
    const auto absent = testing::StartsWith(
        "provider Absent failed in a request about associations of a Stranger_Left: "
        "CIM_ERR_FAILED: libNowhere.so");
    EXPECT_THAT(log, ElementsAre(failed, absent, failed, absent, failed, absent, failed, absent));
}

TEST_F(StrangerProvider, FailureOfAnotherChangesNothingOfARequestForTheirCommonClass) {
    manager(registration("Failing"));
    AssociationRequest request;
    request.assocClass = "Stranger_Tie";
    request.role = "Near";
    EXPECT_THAT(associators(request),
                ElementsAre("Stranger_Right.Id=\"r1\"", "Stranger_Right.Id=\"r2\""));
    EXPECT_EQ(log.size(), 2U);
    request = {};
    request.resultClass = "Stranger_Tie";
    EXPECT_THAT(references(l1, request), ElementsAre(link("l1", "r1"), link("l1", "r2")));
    EXPECT_EQ(log.size(), 4U);
}

TEST_F(StrangerProvider, FailureOfTheOneThatWasNamedIsTheClients) {
    ObjectManager& asked = manager(registration("Failing") + registration("Refusing"));
    AssociationRequest request;
    request.assocClass = "Stranger_FailingLink";
    const Status failed{CMPI_RC_ERR_FAILED, "out of order"};
    EXPECT_EQ(asked.associators(l1, request).status, failed);
    EXPECT_EQ(asked.associatorNames(l1, request).status, failed);
    request = {};
    request.resultClass = "Stranger_FailingLink";
    EXPECT_EQ(asked.references(l1, request).status, failed);
    EXPECT_EQ(asked.referenceNames(l1, request).status, failed);
    request.resultClass = "Stranger_RefusingLink";
    EXPECT_EQ(asked.references(l1, request).status.code, CMPI_RC_ERR_INVALID_CLASS);
}

TEST_F(StrangerProvider, FirstErrorIsTheClientsWhenAllFail) {
    managerOf(registration("Failing") + registration("Missing") + registration("Refusing"));
    EXPECT_EQ(status(), (Status{CMPI_RC_ERR_FAILED, "out of order"}));
    managerOf(registration("Missing") + registration("Refusing"));
    EXPECT_EQ(status().code, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(StrangerProvider, ThatKnowsNoneOfTheClassesHasNothingToAdd) {
    managerOf(registration("Refusing"));
    EXPECT_EQ(status(), Status{});
    managerOf(registration("Missing"));
    EXPECT_EQ(status().code, CMPI_RC_ERR_NOT_FOUND);
    manager(registration("Refusing") + registration("Missing"));
    EXPECT_EQ(references(l1).size(), 2U);
    EXPECT_EQ(associators().size(), 2U);
    EXPECT_THAT(log, IsEmpty());
}

TEST_F(StrangerProvider, ThatCannotTellTheRolesOfItsAssociatorsFails) {
    ObjectManager& asked = managerOf(registration("Roleless"));
    AssociationRequest request;
    request.role = "Near";
    EXPECT_EQ(asked.associators(l1, request).status, (Status{CMPI_RC_ERR_FAILED, "out of order"}));
    EXPECT_EQ(log.size(), 1U);
    manager(registration("Roleless"));
    EXPECT_THAT(associators(request),
                ElementsAre("Stranger_Right.Id=\"r1\"", "Stranger_Right.Id=\"r2\""));
    EXPECT_EQ(log.size(), 3U);
}

}  // namespace
}  // namespace cimom::test
