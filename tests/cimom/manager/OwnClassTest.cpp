#include "cimom/OwnClass.h"

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/MofError.h"
#include "cimom/Results.h"
#include "kit/TestManager.h"

namespace cimom::test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

Value referenceTo(const std::string& text) {
    return {Type::reference, false,
            Scalar(std::make_shared<const ObjectPath>(parseObjectPath(text)))};
}

/// Things that are kept in memory, of a class of its own.
class Things final : public OwnClass {
  public:
    explicit Things(std::vector<std::string> ids = {"a", "b"})
        : OwnClass("Own_Thing", {"root/test", "root/own"}), ids_(std::move(ids)) {}

    [[nodiscard]] std::string_view declaration() const noexcept override {
        return "class Own_Thing { [Key] string Id; string Note; uint16 Number; };";
    }
    [[nodiscard]] std::vector<Instance> instances(const std::string& nameSpace) const override {
        if (nameSpace != "root/test") {
            throw std::runtime_error("no things in " + nameSpace);
        }
        std::vector<Instance> made;
        for (const std::string& id : ids_) {
            made.push_back({{"", "", className(), {{"Id", Value::ofString(id)}}},
                            {{"Id", Value::ofString(id)}}});
        }
        return made;
    }
    [[nodiscard]] ObjectPath create(const Instance& instance,
                                    const std::string& principal) override {
        const std::string id = textOf(instance, "Id") + principal;
        if (id == "a") {
            throw RequestRefused(CMPI_RC_ERR_ALREADY_EXISTS, "there is an a");
        }
        ids_.push_back(id);
        return {"", "", className(), {{"Id", Value::ofString(id)}}};
    }
    void modify(const Instance& instance,
                const std::optional<std::vector<std::string>>& propertyList,
                const std::string& /*principal*/) override {
        changed = textOf(instance.path.key("Id")) + ' ' +
                  std::to_string(instance.properties.size()) + ' ' +
                  (propertyList ? propertyList->front() : "");
    }
    void remove(const ObjectPath& path, const std::string& /*principal*/) override {
        std::erase(ids_, textOf(path.key("Id")));
    }

    std::string changed;

  private:
    std::vector<std::string> ids_;
};

/// Associations between the lefts of the test provider and things.
class Links final : public OwnClass {
  public:
    Links() : OwnClass("Own_Link", {"root/test"}) {}

    [[nodiscard]] std::string_view declaration() const noexcept override {
        return "[Association] class Own_Link "
               "{ [Key] Test_Left REF Left; [Key] Own_Thing REF Thing; };";
    }
    [[nodiscard]] std::vector<Instance> instances(const std::string& /*nameSpace*/) const override {
        return {link("l1", "a"), link("l1", "gone"), link("l2", "b")};
    }

  private:
    [[nodiscard]] Instance link(const std::string& left, const std::string& thing) const {
        Instance made;
        made.path.className = className();
        made.path.keys = {{"Left", referenceTo("root/test:Test_Left.Id=\"" + left + '"')},
                          {"Thing", referenceTo("root/test:Own_Thing.Id=\"" + thing + '"')}};
        made.properties = made.path.keys;
        return made;
    }
};

class OwnClasses : public TestManager {
  protected:
    OwnClasses() {
        auto made = std::make_unique<Things>();
        things = made.get();
        manager.serve(std::move(made));
        manager.serve(std::make_unique<Links>());
    }

    Things* things;
};

TEST_F(OwnClasses, AddTheirNamespacesAndDeclarations) {
    EXPECT_THAT(manager.nameSpaces(), ElementsAre("root/test", "root/other", "root/own"));
    EXPECT_NE(manager.repository().find("own_thing"), nullptr);
    EXPECT_EQ(*manager.findNameSpace("ROOT/own/"), "root/own");
    EXPECT_EQ(manager.findNameSpace("root/none"), nullptr);
}

TEST_F(OwnClasses, AreReadLikeThoseOfProviders) {
    EXPECT_THAT(names(manager.enumerateInstanceNames(path("OWN_thing")).paths),
                ElementsAre("Own_Thing.Id=\"a\"", "Own_Thing.Id=\"b\""));
    const InstancesResult all = manager.enumerateInstances(path("Own_Thing"));
    ASSERT_EQ(all.instances.size(), 2U);
    EXPECT_EQ(all.instances.front()->path.host, "testhost");
    EXPECT_EQ(all.instances.front()->path.nameSpace, "root/test");
    const InstancesResult one = manager.getInstance(path("Own_Thing.Id=\"a\""));
    ASSERT_EQ(one.status, Status{});
    EXPECT_EQ(*one.instances.front(), *all.instances.front());
    EXPECT_TRUE(one.instances.front()->property("Note")->isNull());
    EXPECT_EQ(one.instances.front()->property("Number")->type, Type::uint16);
    EXPECT_EQ(manager.getInstance(path("Own_Thing.Id=\"c\"")).status.code, CMPI_RC_ERR_NOT_FOUND);
    const InstancesResult listed =
        manager.enumerateInstances(path("Own_Thing"), {std::vector<std::string>{"Note"}, ""});
    EXPECT_EQ(listed.instances.front()->properties.size(), 1U);
}

TEST_F(OwnClasses, WhatTheyThrowFailsTheRequestAlone) {
    EXPECT_EQ(manager.enumerateInstances(parseObjectPath("root/own:Own_Thing")).status,
              (Status{CMPI_RC_ERR_FAILED, "Own_Thing: no things in root/own"}));
    EXPECT_EQ(manager.createInstance({path("Own_Thing"), {{"Id", Value::ofString("a")}}}).status,
              (Status{CMPI_RC_ERR_ALREADY_EXISTS, "there is an a"}));
    EXPECT_EQ(manager.enumerateInstances(path("Own_Thing")).status, Status{});
}

TEST_F(OwnClasses, InstancesAreCreatedChangedAndDeleted) {
    const PathsResult made = manager.createInstance(
        {path("own_thing"), {{"Id", Value::ofString("c")}}}, {std::nullopt, "@ada"});
    ASSERT_EQ(made.status, Status{});
    EXPECT_EQ(toText(*made.paths.front()), "root/test:Own_Thing.Id=\"c@ada\"");
    EXPECT_EQ(made.paths.front()->host, "testhost");
    EXPECT_EQ(manager
                  .modifyInstance({path("Own_Thing.Id=\"c@ada\""), {{"Note", Value()}}},
                                  {std::vector<std::string>{"Note"}, ""})
                  .status,
              Status{});
    EXPECT_EQ(things->changed, "c@ada 1 Note");
    EXPECT_EQ(manager.deleteInstance(path("Own_Thing.Id=\"c@ada\"")), Status{});
    EXPECT_EQ(manager.deleteInstance(path("Own_Thing.Id=\"c@ada\"")).code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(manager.modifyInstance({path("Own_Thing.Id=\"c@ada\""), {}}).status.code,
              CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(OwnClasses, AreFixedUnlessTheySayOtherwise) {
    const std::string link = R"(Own_Link.Left="Test_Left.Id=\"l2\"",Thing="Own_Thing.Id=\"b\"")";
    EXPECT_EQ(manager.getInstance(path(link)).status, Status{});
    EXPECT_EQ(manager.createInstance({path("Own_Link"), {}}).status,
              (Status{CMPI_RC_ERR_NOT_SUPPORTED, "instances of Own_Link cannot be created"}));
    EXPECT_EQ(manager.modifyInstance({path(link), {}}).status,
              (Status{CMPI_RC_ERR_NOT_SUPPORTED, "instances of Own_Link cannot be modified"}));
    EXPECT_EQ(manager.deleteInstance(path(link)),
              (Status{CMPI_RC_ERR_NOT_SUPPORTED, "instances of Own_Link cannot be deleted"}));
}

TEST_F(OwnClasses, TheirReferencesAssociate) {
    const ObjectPath left = path("Test_Left.Id=\"l1\"");
    AssociationRequest request;
    request.assocClass = "Own_Link";
    EXPECT_THAT(names(manager.associatorNames(left, request).paths),
                ElementsAre("Own_Thing.Id=\"a\"", "Own_Thing.Id=\"gone\""));
    // What there is not cannot be handed over as an instance.
    EXPECT_THAT(names(manager.associators(left, request).instances),
                ElementsAre("Own_Thing.Id=\"a\""));
    request.role = "Thing";
    EXPECT_THAT(manager.associatorNames(left, request).paths, IsEmpty());
    request.role = "left";
    request.resultRole = "Thing";
    EXPECT_THAT(manager.associatorNames(left, request).paths, testing::SizeIs(2));
    request.resultClass = "Test_Left";
    EXPECT_THAT(manager.associatorNames(left, request).paths, IsEmpty());

    // The other end is a provider's.
    EXPECT_THAT(names(manager.associators(path("Own_Thing.Id=\"b\"")).instances),
                ElementsAre("Test_Left.Id=\"l2\""));
}

TEST_F(OwnClasses, AreReferencesOfTheirEnds) {
    AssociationRequest request;
    request.resultClass = "Own_Link";
    const PathsResult paths = manager.referenceNames(path("Test_Left.Id=\"l2\""), request);
    ASSERT_EQ(paths.paths.size(), 1U);
    EXPECT_EQ(referenceOf(paths.paths.front()->key("Thing")).className, "Own_Thing");
    EXPECT_EQ(manager.references(path("Own_Thing.Id=\"a\"")).instances.size(), 1U);
    request.role = "Thing";
    EXPECT_THAT(manager.referenceNames(path("Test_Left.Id=\"l2\""), request).paths, IsEmpty());
}

class Named final : public OwnClass {
  public:
    Named(std::string className, std::string_view text)
        : OwnClass(std::move(className), {"root/test"}), text_(text) {}
    [[nodiscard]] std::string_view declaration() const noexcept override { return text_; }
    [[nodiscard]] std::vector<Instance> instances(const std::string& /*nameSpace*/) const override {
        return {};
    }

  private:
    std::string_view text_;
};

TEST_F(OwnClasses, WhatCannotBeServedIsRefused) {
    const auto serve = [this](const char* name, std::string_view text) {
        manager.serve(std::make_unique<Named>(name, text));
    };
    EXPECT_THROW(serve("Unknown_Class", ""), LoadError);
    EXPECT_THROW(serve("Unknown_Class", "class Other_Class { };"), LoadError);
    EXPECT_THROW(serve("Bad_Class", "class Bad_Class {"), MofError);
    EXPECT_THROW(serve("Test_Left", ""), LoadError);
    EXPECT_THROW(serve("Own_Thing", ""), LoadError);
    EXPECT_NO_THROW(serve("Test_Unserved", ""));
}

}  // namespace
}  // namespace cimom::test
