// The request that "modify" sends: to an object manager that remembers it.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "arguments/Commands.h"
#include "cimom/ClassDeclaration.h"
#include "client/ClassLookup.h"
#include "client/Client.h"
#include "commands/classes/CimOperations.h"
#include "text/Failure.h"

namespace cimdhcp {
namespace {

using cimom::Value;
using testing::ElementsAre;

cimom::PropertyDeclaration property(const std::string& name, const char* qualifier = nullptr) {
    cimom::PropertyDeclaration result;
    result.name = name;
    if (qualifier != nullptr) {
        Value yes = Value::null(cimom::Type::boolean, false);
        yes.content = cimom::Scalar(true);
        result.qualifiers.push_back({qualifier, yes});
    }
    return result;
}

/// One instance of a class that can be changed in more than one property.
class Shelf : public Client {
  public:
    Shelf() : Client("root/test") {
        declaration.name = "TEST_Shelf";
        declaration.properties = {property("Id", "Key"), property("Label", "Write"),
                                  property("Place", "Write"), property("Maker")};
        instance.path = {"", "root/test", "TEST_Shelf", {{"Id", Value::ofString("1")}}};
        instance.properties = {{"Id", Value::ofString("1")},
                               {"Label", Value::ofString("old")},
                               {"Place", Value::ofString("cellar")}};
    }

    Response modify(const cimom::Instance& changed,
                    const std::vector<std::string>& properties) override {
        sent = changed;
        named = properties;
        if (takes) {
            instance = changed;
        }
        return {"ModifyInstance", {}, 1, {}, {}};
    }
    Response get(const cimom::ObjectPath& path) override {
        if (!(path == instance.path)) {
            return {"GetInstance", {CMPI_RC_ERR_NOT_FOUND, ""}, 1, {}, {}};
        }
        return {"GetInstance", {}, 1, {}, {instance}};
    }

    [[nodiscard]] ClassLookup classes() override {
        return ClassLookup([this](std::string_view name) {
            return name == declaration.name ? &declaration : nullptr;
        });
    }
    [[nodiscard]] Failure failure(const Response& response,
                                  const cimom::ObjectPath& /*asked*/) const override {
        return {ExitStatus::notDone, "status " + std::to_string(response.status.code)};
    }

    // Not needed for this.
    [[nodiscard]] std::vector<ClassEntry> servedClasses() override { return {}; }
    [[nodiscard]] bool mayServe(std::string_view /*className*/) const override { return true; }
    [[nodiscard]] std::optional<std::string> dataDir() const override { return std::nullopt; }
    Response enumerateNames(const cimom::ObjectPath& /*path*/) override { return {}; }
    Response enumerate(const cimom::ObjectPath& /*path*/) override { return {}; }
    Response associatorNames(const cimom::ObjectPath& /*path*/,
                             const cimom::AssociationRequest& /*request*/) override {
        return {};
    }
    Response associators(const cimom::ObjectPath& /*path*/,
                         const cimom::AssociationRequest& /*request*/) override {
        return {};
    }
    Response referenceNames(const cimom::ObjectPath& /*path*/,
                            const cimom::AssociationRequest& /*request*/) override {
        return {};
    }
    Response references(const cimom::ObjectPath& /*path*/,
                        const cimom::AssociationRequest& /*request*/) override {
        return {};
    }

    cimom::ClassDeclaration declaration;
    cimom::Instance instance;
    bool takes = true;
    std::optional<cimom::Instance> sent;
    std::vector<std::string> named;
};

std::string refusal(Shelf& shelf, const std::vector<std::string>& assignments,
                    const std::string& id = "1") {
    try {
        static_cast<void>(
            carryOut(ModifyCommand{"TEST_Shelf.Id=\"" + id + "\"", assignments}, shelf));
        return "done";
    } catch (const Failure& failure) {
        EXPECT_EQ(failure.status(), ExitStatus::notDone);
        return failure.what();
    }
}

TEST(ModifyRequest, SendsTheOtherPropertiesAsTheyWere) {
    Shelf shelf;
    const cimom::ObjectPath path = shelf.instance.path;
    const CimOperation done = carryOut(ModifyCommand{"TEST_Shelf.Id=\"1\"", {"label=new"}}, shelf);
    EXPECT_TRUE(done.response.status.ok());
    const cimom::Instance expected{path,
                                   {{"Id", Value::ofString("1")},
                                    {"Label", Value::ofString("new")},
                                    {"Place", Value::ofString("cellar")}}};
    EXPECT_EQ(shelf.sent, expected);
    EXPECT_THAT(shelf.named, ElementsAre("Label"));
}

TEST(ModifyRequest, AddsAPropertyThatHadNoValue) {
    Shelf shelf;
    shelf.instance.properties.pop_back();
    EXPECT_EQ(refusal(shelf, {"Place=attic", "Label=x"}), "done");
    EXPECT_EQ(*shelf.instance.property("Place"), Value::ofString("attic"));
    EXPECT_THAT(shelf.named, ElementsAre("Place", "Label"));
}

TEST(ModifyRequest, TellsThatNothingWasChanged) {
    Shelf shelf;
    shelf.takes = false;
    EXPECT_EQ(refusal(shelf, {"Label=new"}), "not changed: Label is still \"old\", not \"new\"");
    EXPECT_EQ(refusal(shelf, {"Label=old"}), "not changed: Label is \"old\" already");
}

TEST(ModifyRequest, TellsWhatIsOtherThanWanted) {
    // One of both is taken.
    class Half : public Shelf {
      public:
        Response modify(const cimom::Instance& changed,
                        const std::vector<std::string>& properties) override {
            cimom::Instance half = changed;
            half.properties.pop_back();
            return Shelf::modify(half, properties);
        }
    } shelf;
    EXPECT_EQ(refusal(shelf, {"Label=new", "Place=attic"}),
              "not changed as wanted: Label is now \"new\"; Place is now not set, not \"attic\"");
}

TEST(ModifyRequest, TellsThatTheChangeCannotBeReadBack) {
    class Gone : public Shelf {
      public:
        Response modify(const cimom::Instance& changed,
                        const std::vector<std::string>& properties) override {
            Response response = Shelf::modify(changed, properties);
            instance.path.keys.clear();
            return response;
        }
    } shelf;
    EXPECT_EQ(refusal(shelf, {"Label=new"}),
              "status 6; what came of the change is not known, as it cannot be read back");
}

TEST(ModifyRequest, IsNotSentForWhatCannotBeWritten) {
    Shelf shelf;
    EXPECT_EQ(refusal(shelf, {"Label=new", "Maker=me", "Id=2"}),
              "not changed: Maker, Id of TEST_Shelf cannot be written");
    EXPECT_EQ(refusal(shelf, {"Label=new"}, "7"), "status 6");
    EXPECT_FALSE(shelf.sent);
}

}  // namespace
}  // namespace cimdhcp
