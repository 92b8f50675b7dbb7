#include "cimom/Instance.h"
#include "mof/ClassResolver.h"

#include <gtest/gtest.h>

#include "cimom/ClassRepository.h"

namespace cimom {
namespace {

constexpr const char* allQualifierTypes = R"(
Qualifier Abstract : boolean = FALSE, Scope(class, association, indication), Flavor(Restricted);
Qualifier Association : boolean = FALSE, Scope(association), Flavor(DisableOverride, ToSubclass);
Qualifier Indication : boolean = FALSE, Scope(class, indication), Flavor(DisableOverride);
Qualifier Key : boolean = FALSE, Scope(property, reference), Flavor(DisableOverride, ToSubclass);
Qualifier Override : string = NULL, Scope(property, reference, method), Flavor(Restricted);
Qualifier Description : string = NULL, Scope(any), Flavor(Translatable);
Qualifier Deprecated : string[], Scope(any), Flavor(Restricted);
Qualifier MaxLen : uint32, Scope(property, method, parameter);
Qualifier Max : uint32, Scope(reference);
Qualifier In : boolean = TRUE, Scope(parameter);
Qualifier Events : boolean, Scope(indication);
)";

constexpr const char* baseClasses = R"(
[Abstract, Description ( "root" )] class T_Root {
    [MaxLen ( 64 ), Deprecated { "x" }] string Name;
    uint16 State = 5;
    uint8 List[];
};
class T_Keyed : T_Root { [Key, Override ( "Name" )] string Name; };
class T_Leaf : T_Keyed { };
class T_Other { [Key] string Id; };
[Association] class T_Link {
    [Key] T_Keyed REF Left;
    [Key] T_Root REF Right;
};
)";

class ClassResolver : public testing::Test {
  protected:
    ClassResolver() {
        repository_.loadText(allQualifierTypes, "qualifiers");
        repository_.loadText(baseClasses, "base");
    }

    const ClassDeclaration& load(const std::string& text, const std::string& name) {
        repository_.loadText(text, "test");
        return *repository_.find(name);
    }

    ClassRepository repository_;
};

TEST_F(ClassResolver, InheritedPropertiesComeFirst) {
    const auto& leaf = load("class T_New : T_Leaf { uint8 Own; };", "T_New");
    ASSERT_EQ(leaf.properties.size(), 4U);
    EXPECT_EQ(leaf.properties[0].name, "Name");
    EXPECT_EQ(leaf.properties[1].name, "State");
    EXPECT_EQ(leaf.properties[2].name, "List");
    EXPECT_EQ(leaf.properties[3].name, "Own");
    EXPECT_TRUE(leaf.properties[0].propagated);
    EXPECT_FALSE(leaf.properties[3].propagated);
    EXPECT_EQ(leaf.properties[0].classOrigin, "T_Root");
    EXPECT_EQ(leaf.properties[3].classOrigin, "T_New");
}

TEST_F(ClassResolver, AnOverrideTakesThePlaceOfWhatItOverrides) {
    const ClassDeclaration& keyed = *repository_.find("T_Keyed");
    ASSERT_EQ(keyed.properties.size(), 3U);
    EXPECT_EQ(keyed.properties[0].name, "Name");
    EXPECT_FALSE(keyed.properties[0].propagated);
    EXPECT_EQ(keyed.properties[0].classOrigin, "T_Root");
    EXPECT_TRUE(keyed.properties[0].isKey());
    EXPECT_FALSE(repository_.find("T_Root")->properties[0].isKey());
}

TEST_F(ClassResolver, QualifiersPassToSubclassesUnlessRestricted) {
    const PropertyDeclaration& declared = *repository_.find("T_Keyed")->property("name");
    EXPECT_NE(declared.qualifier("Override"), nullptr);
    EXPECT_NE(declared.qualifier("MaxLen"), nullptr);
    EXPECT_EQ(declared.qualifier("Deprecated"), nullptr);
    const PropertyDeclaration& inherited = *repository_.find("T_Leaf")->property("NAME");
    EXPECT_EQ(inherited.qualifier("Override"), nullptr);
    EXPECT_NE(inherited.qualifier("MaxLen"), nullptr);
    EXPECT_TRUE(inherited.isKey());
    EXPECT_NE(repository_.find("T_Root")->qualifier("Abstract"), nullptr);
    EXPECT_EQ(repository_.find("T_Leaf")->qualifier("Abstract"), nullptr);
    EXPECT_EQ(repository_.find("T_Leaf")->qualifier("description")->value, Value::ofString("root"));
}

TEST_F(ClassResolver, AnOverrideWithoutADefaultKeepsTheOneAbove) {
    const Value five{Type::uint16, false, Scalar(std::uint64_t{5})};
    const auto& kept = load("class T_A : T_Root { [Override(\"State\")] uint16 State; };", "T_A");
    EXPECT_EQ(kept.property("State")->defaultValue, five);
    const auto& none =
        load("class T_B : T_Root { [Override(\"State\")] uint16 State = NULL; };", "T_B");
    EXPECT_TRUE(none.property("State")->defaultValue.isNull());
    EXPECT_EQ(none.property("List")->defaultValue, Value::null(Type::uint8, true));
}

TEST_F(ClassResolver, AnAssociationPassesItsKindToItsSubclasses) {
    const auto& derived =
        load("class T_Sub : T_Link { [Override(\"Left\")] T_Leaf REF Left; };", "T_Sub");
    EXPECT_TRUE(derived.isAssociation());
    EXPECT_EQ(derived.property("Left")->referenceClass, "T_Leaf");
    EXPECT_EQ(derived.property("Right")->referenceClass, "T_Root");
    EXPECT_TRUE(derived.property("Left")->isKey());
    EXPECT_FALSE(repository_.find("T_Leaf")->isAssociation());
}

TEST_F(ClassResolver, AKeyMayBeAddedWhereNoneIsInherited) {
    EXPECT_TRUE(load("class T_A : T_Root { [Key] string Id; };", "T_A").property("Id")->isKey());
}

TEST_F(ClassResolver, AnIndicationTakesQualifiersOfItsScope) {
    EXPECT_NE(load("[Indication, Events] class T_Event { };", "T_Event").qualifier("Events"),
              nullptr);
}

TEST_F(ClassResolver, MethodsAreCheckedAndLeftOut) {
    const auto& declaration = load(
        "class T_A { [Description(\"d\")] uint32 Run([In] T_Unknown REF Job, uint8 List[]); };",
        "T_A");
    EXPECT_TRUE(declaration.properties.empty());
    EXPECT_NO_THROW(repository_.complete());
}

struct WrongClass {
    const char* text;
    const char* reason;
};

class WrongClassText : public testing::TestWithParam<WrongClass> {};

TEST_P(WrongClassText, IsRefusedWithThePlaceAndTheReason) {
    ClassRepository repository;
    repository.loadText(allQualifierTypes, "qualifiers");
    repository.loadText(baseClasses, "base");
    const auto before = repository.classes().size();
    try {
        repository.loadText(GetParam().text, "test.mof");
        FAIL() << "accepted: " << GetParam().text;
    } catch (const MofError& error) {
        EXPECT_EQ(error.what(), std::string("test.mof:") + GetParam().reason);
        EXPECT_EQ(error.file, "test.mof");
    }
    EXPECT_EQ(repository.classes().size(), before);
    EXPECT_NO_THROW(repository.complete());
}

INSTANTIATE_TEST_SUITE_P(
    Texts, WrongClassText,
    testing::Values(
        WrongClass{"class t_root { };", "1:7: class t_root is declared twice"},
        WrongClass{"class T_A : T_None { };", "1:13: superclass T_None is not known"},
        WrongClass{"class T_A : T_A { };", "1:13: superclass T_A is not known"},
        WrongClass{"[Unknown] class T_A { };", "1:2: qualifier Unknown is not declared"},
        WrongClass{"class T_A {\n   [Key, Nothing] string P;\n};",
                   "2:10: qualifier Nothing is not declared"},
        WrongClass{"class T_A { uint32 M([Nothing] uint8 P); };",
                   "1:23: qualifier Nothing is not declared"},
        WrongClass{"class T_A { [Key] uint32 M(); };",
                   "1:14: qualifier Key cannot stand at a method"},
        WrongClass{"[Key] class T_A { };", "1:2: qualifier Key cannot stand at a class"},
        WrongClass{"[Association, Key] class T_A { };",
                   "1:15: qualifier Key cannot stand at an association"},
        WrongClass{"[Association(FALSE)] class T_A { };",
                   "1:2: qualifier Association cannot stand at a class"},
        WrongClass{"class T_A { [Max(1)] string P; };",
                   "1:14: qualifier Max cannot stand at a property"},
        WrongClass{"class T_A { [MaxLen(-1)] string P; };", "1:21: -1 does not fit uint32"},
        WrongClass{"class T_A { [Key, key] string P; };", "1:19: qualifier key is given twice"},
        WrongClass{"class T_A { string P; uint8 p; };", "1:29: property p is declared twice"},
        WrongClass{"class T_A { uint32 M(); uint32 m(); };", "1:32: method m is declared twice"},
        WrongClass{"class T_A : T_Leaf { string Name; };",
                   "1:29: property Name hides that of T_Root: Override is missing"},
        WrongClass{"class T_A { [Override(\"P\")] string P; };",
                   "1:14: Override names P, which no superclass declares"},
        WrongClass{"class T_A : T_Root { [Override(\"State\")] string Name; };",
                   "1:23: Override must name the property Name"},
        WrongClass{"class T_A : T_Root { [Override] string Name; };",
                   "1:23: Override must name the property Name"},
        WrongClass{"class T_A : T_Root { [Override(\"Name\")] uint8 Name; };",
                   "1:41: property Name is uint8 here, but string in T_Root"},
        WrongClass{"class T_A : T_Root { [Override(\"Name\")] string Name[]; };",
                   "1:41: property Name is string[] here, but string in T_Root"},
        WrongClass{"class T_A : T_Root { [Override(\"List\")] uint8 List; };",
                   "1:41: property List is uint8 here, but uint8[] in T_Root"},
        WrongClass{"class T_A : T_Leaf { [Override(\"Name\"), Key(FALSE)] string Name; };",
                   "1:41: qualifier Key cannot be changed in a subclass"},
        WrongClass{"[Association(FALSE)] class T_A : T_Link { };",
                   "1:2: qualifier Association cannot be changed in a subclass"},
        WrongClass{"class T_A : T_Leaf { [Key] string Id; };",
                   "1:35: key Id cannot be added to the keys of T_Leaf"},
        WrongClass{"class T_A : T_Leaf { [Key, Override(\"State\")] uint16 State; };",
                   "1:54: key State cannot be added to the keys of T_Leaf"},
        WrongClass{"[Association] class T_A { [Key] T_Root REF One; };",
                   "1:21: association T_A needs two references at least, and has 1"},
        WrongClass{"[Association] class T_A { string P; };",
                   "1:21: association T_A needs two references at least, and has 0"},
        WrongClass{"class T_A { T_Root REF One; };",
                   "1:13: a reference can stand in an association only"},
        WrongClass{"[Association] class T_A { T_Root REF One[]; T_Root REF Two; };",
                   "1:38: reference One cannot be an array"},
        WrongClass{"class T_A : T_Link {\n  [Override(\"Left\")]\n  T_Other REF Left;\n};",
                   "3:3: T_Other is not a subclass of T_Keyed, which the superclass references"},
        WrongClass{"class T_A : T_Link { [Override(\"Left\")] T_Root REF Left; };",
                   "1:41: T_Root is not a subclass of T_Keyed, which the superclass references"},
        WrongClass{"class T_A { uint8 P = 256; };", "1:23: 256 does not fit uint8"},
        WrongClass{"class T_A { uint8 P[] = 1; };", "1:25: a list in braces is needed here"},
        WrongClass{"class T_A { uint8 P = { 1 }; };", "1:23: one value is needed here, not a list"},
        WrongClass{"class T_A { datetime P = \"now\"; };",
                   "1:26: this is not a value of type datetime"},
        WrongClass{"Qualifier key : boolean, Scope(any);",
                   "1:11: qualifier key is declared twice, in different ways"},
        WrongClass{"Qualifier New : uint8 = TRUE, Scope(any);",
                   "1:25: this is not a value of type uint8"}));

}  // namespace
}  // namespace cimom
