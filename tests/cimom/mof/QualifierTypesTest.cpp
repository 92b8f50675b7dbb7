#include "cimom/Instance.h"
#include "cimom/MofError.h"
#include "mof/QualifierTypes.h"

#include <gtest/gtest.h>

namespace cimom {
namespace {

MofQualifier written(std::string name, std::optional<MofConstant> constant = std::nullopt,
                     MofFlavors flavors = {}) {
    MofQualifier result{std::move(name), std::nullopt, flavors, {7, 9}};
    if (constant) {
        result.value = MofInitializer{false, {{*constant, {7, 12}}}, {7, 12}};
    }
    return result;
}

class QualifierTypesTest : public testing::Test {
  protected:
    QualifierTypesTest() {
        declare("Key", Type::boolean, {false, true, {}}, {MofScope::property});
        declare("Text", Type::string, {true, true, true}, {MofScope::any});
        declare("Once", Type::string, {true, false, {}}, {MofScope::any});
    }

    void declare(const std::string& name, Type type, MofFlavors flavors,
                 std::vector<MofScope> scopes) {
        types_.add({name, {1, 11}, type, false, {}, std::move(scopes), flavors}, "q.mof");
    }

    std::vector<Qualifier> resolve(const std::vector<MofQualifier>& qualifiers) {
        return types_.resolve(qualifiers, MofScope::property, "f.mof");
    }

    template <typename Action>
    static std::string errorOf(Action action) {
        try {
            action();
        } catch (const MofError& error) {
            return error.what();
        }
        return "no error";
    }

    QualifierTypes types_;
};

TEST_F(QualifierTypesTest, ANameAloneMeansTrueOrNull) {
    const auto all = resolve({written("KEY"), written("Text")});
    ASSERT_EQ(all.size(), 2U);
    EXPECT_EQ(all[0].name, "Key");
    EXPECT_TRUE(isTrue(&all[0]));
    EXPECT_TRUE(all[1].value.isNull());
}

TEST_F(QualifierTypesTest, FlavorsAreThoseOfTheTypeUnlessWritten) {
    const auto all = resolve({written("Text", MofConstant(std::string("x"))),
                              written("Once", std::nullopt, {false, true, true})});
    EXPECT_TRUE(all[0].overridable && all[0].toSubclass && all[0].translatable);
    EXPECT_FALSE(all[1].overridable);
    EXPECT_TRUE(all[1].toSubclass);
    EXPECT_TRUE(all[1].translatable);
}

TEST_F(QualifierTypesTest, RefusesWhatIsUnknownMisplacedDoubledOrOfAnotherType) {
    EXPECT_EQ(errorOf([&] { resolve({written("Other")}); }),
              "f.mof:7:9: qualifier Other is not declared");
    EXPECT_EQ(errorOf([&] {
                  resolve({written("Text"), written("TEXT")});
              }),
              "f.mof:7:9: qualifier TEXT is given twice");
    EXPECT_EQ(errorOf([&] { resolve({written("Key", MofConstant(std::string("x")))}); }),
              "f.mof:7:12: this is not a value of type boolean");
    EXPECT_EQ(errorOf([&] {
                  resolve({written("Key", std::nullopt, {true, {}, {}})});
              }),
              "f.mof:7:9: qualifier Key cannot be made overridable");
    const std::vector<std::pair<MofScope, std::string>> misplaced{
        {MofScope::classes, "a class"},          {MofScope::association, "an association"},
        {MofScope::indication, "an indication"}, {MofScope::reference, "a reference"},
        {MofScope::method, "a method"},          {MofScope::parameter, "a parameter"}};
    for (const auto& [scope, name] : misplaced) {
        EXPECT_EQ(errorOf([&, where = scope] {
                      static_cast<void>(types_.resolve({written("Key")}, where, "f.mof"));
                  }),
                  "f.mof:7:9: qualifier Key cannot stand at " + name);
    }
}

TEST_F(QualifierTypesTest, RefusesATypeThatIsDeclaredTwice) {
    EXPECT_EQ(errorOf([&] { declare("kEY", Type::string, {}, {}); }),
              "q.mof:1:11: qualifier kEY is declared twice, in different ways");
}

TEST_F(QualifierTypesTest, TheSameDeclarationOnceMoreChangesNothing) {
    types_.add(
        {"Two", {1, 11}, Type::string, false, {}, {MofScope::property, MofScope::method}, {}},
        "q.mof");
    types_.add({"TWO",
                {1, 11},
                Type::string,
                false,
                {},
                {MofScope::method, MofScope::property},
                {true, true, false}},
               "q.mof");
    EXPECT_EQ(resolve({written("Two")}).front().name, "Two");
    EXPECT_EQ(
        errorOf([&] {
            declare("Two", Type::string, {false, true, {}}, {MofScope::property, MofScope::method});
        }),
        "q.mof:1:11: qualifier Two is declared twice, in different ways");
    EXPECT_EQ(errorOf([&] { declare("Two", Type::string, {}, {MofScope::property}); }),
              "q.mof:1:11: qualifier Two is declared twice, in different ways");
}

TEST_F(QualifierTypesTest, KeptTypesStandAgainstOthers) {
    types_.keepDeclared();
    declare("Key", Type::string, {true, true, true}, {MofScope::any});
    EXPECT_TRUE(isTrue(&resolve({written("Key")}).front()));
}

TEST_F(QualifierTypesTest, OnlyQualifiersToSubclassAreInherited) {
    const auto above = resolve({written("Key"), written("Once"), written("Text")});
    const auto all = inheritQualifiers({}, {}, above, "f.mof");
    ASSERT_EQ(all.size(), 2U);
    EXPECT_EQ(all[0].name, "Key");
    EXPECT_EQ(all[1].name, "Text");
}

TEST_F(QualifierTypesTest, AnOverridableQualifierIsReplaced) {
    const auto above = resolve({written("Text", MofConstant(std::string("above")))});
    const std::vector<MofQualifier> mine{written("Text", MofConstant(std::string("mine")))};
    const auto all = inheritQualifiers(resolve(mine), mine, above, "f.mof");
    ASSERT_EQ(all.size(), 1U);
    EXPECT_EQ(all[0].value, Value::ofString("mine"));
}

TEST_F(QualifierTypesTest, AFixedQualifierMayBeRepeatedButNotChanged) {
    const auto above = resolve({written("Key")});
    const std::vector<MofQualifier> same{written("Key", MofConstant(true))};
    EXPECT_EQ(inheritQualifiers(resolve(same), same, above, "f.mof"), above);
    const std::vector<MofQualifier> other{written("Text"), written("Key", MofConstant(false))};
    EXPECT_EQ(errorOf([&] {
                  static_cast<void>(inheritQualifiers(resolve(other), other, above, "f.mof"));
              }),
              "f.mof:7:9: qualifier Key cannot be changed in a subclass");
}

TEST_F(QualifierTypesTest, WhatASuperclassFixedStaysFixed) {
    const MofFlavors fixed{false, {}, {}};
    const auto above = resolve({written("Text", MofConstant(std::string("x")), fixed)});
    const std::vector<MofQualifier> same{written("Text", MofConstant(std::string("x")))};
    const auto all = inheritQualifiers(resolve(same), same, above, "f.mof");
    ASSERT_EQ(all.size(), 1U);
    EXPECT_FALSE(all[0].overridable);
}

TEST_F(QualifierTypesTest, OnlyABooleanTrueIsTrue) {
    EXPECT_FALSE(isTrue(nullptr));
    for (const auto& all :
         {resolve({written("Key", MofConstant(false))}), resolve({written("Key", MofConstant())}),
          resolve({written("Text", MofConstant(std::string("TRUE")))})}) {
        EXPECT_FALSE(isTrue(&all.at(0)));
    }
}

}  // namespace
}  // namespace cimom
