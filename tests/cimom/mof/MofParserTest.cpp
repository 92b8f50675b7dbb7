#include "mof/MofParser.h"

#include <gtest/gtest.h>

#include "cimom/ClassRepository.h"

namespace cimom {
namespace {

std::vector<MofDeclaration> declarations(std::string_view text) {
    MofParser parser(text, "f.mof");
    std::vector<MofDeclaration> result;
    while (auto declaration = parser.next()) {
        result.push_back(*std::move(declaration));
    }
    return result;
}

template <typename Kind>
Kind only(std::string_view text) {
    const auto all = declarations(text);
    EXPECT_EQ(all.size(), 1U);
    return std::get<Kind>(all.at(0));
}

TEST(MofParser, AnEmptyTextDeclaresNothing) {
    EXPECT_TRUE(declarations(" // nothing\n").empty());
}

TEST(MofParser, ReadsPragmas) {
    const auto pragma = only<MofPragma>("#pragma Include (\"a/\" \"b.mof\")");
    EXPECT_EQ(pragma.name, "Include");
    EXPECT_EQ(pragma.value, "a/b.mof");
    EXPECT_EQ(pragma.position, (MofPosition{1, 18}));
}

TEST(MofParser, ReadsQualifierTypes) {
    const auto type = only<MofQualifierType>(
        "Qualifier Values : string[] = { \"a\" }, Scope(property, METHOD, any),\n"
        " Flavor(DisableOverride, Restricted, Translatable);");
    EXPECT_EQ(type.name, "Values");
    EXPECT_EQ(type.type, Type::string);
    EXPECT_TRUE(type.isArray);
    ASSERT_TRUE(type.defaultValue);
    EXPECT_EQ(type.defaultValue->elements.at(0).value, MofConstant(std::string("a")));
    EXPECT_EQ(type.scopes, (std::vector{MofScope::property, MofScope::method, MofScope::any}));
    EXPECT_EQ(type.flavors, (MofFlavors{false, false, true}));
}

TEST(MofParser, AQualifierTypeNeedsNeitherValueNorFlavors) {
    const auto type = only<MofQualifierType>("qualifier Max : uint32, scope(reference);");
    EXPECT_FALSE(type.defaultValue);
    EXPECT_FALSE(type.isArray);
    EXPECT_EQ(type.flavors, MofFlavors());
}

TEST(MofParser, ReadsAClassWithItsHead) {
    const auto declaration =
        only<MofClass>("[Abstract, Version ( \"1\" )]\nclass A_B as $Alias : A_C { };");
    EXPECT_EQ(declaration.name, "A_B");
    EXPECT_EQ(declaration.position, (MofPosition{2, 7}));
    EXPECT_EQ(declaration.superclass, "A_C");
    EXPECT_EQ(declaration.superclassPosition, (MofPosition{2, 23}));
    ASSERT_EQ(declaration.qualifiers.size(), 2U);
    EXPECT_FALSE(declaration.qualifiers[0].value);
    EXPECT_EQ(declaration.qualifiers[1].value->elements.at(0).value, MofConstant(std::string("1")));
}

TEST(MofParser, ReadsPropertiesOfEveryForm) {
    const auto declaration = only<MofClass>(
        "class A_B { uint16 A; UINT8 B[]; string C[4] = { \"x\", NULL }; boolean D = true;\n"
        "A_C REF E; A_D ref F = NULL; sint64 G = -3; };");
    const auto& all = declaration.properties;
    ASSERT_EQ(all.size(), 7U);
    EXPECT_EQ(all[0].type.type, Type::uint16);
    EXPECT_FALSE(all[0].defaultValue);
    EXPECT_EQ(all[1].type.type, Type::uint8);
    EXPECT_TRUE(all[1].isArray);
    EXPECT_EQ(all[1].arraySize, std::nullopt);
    EXPECT_EQ(all[2].arraySize, 4U);
    ASSERT_TRUE(all[2].defaultValue);
    EXPECT_TRUE(all[2].defaultValue->isArray);
    EXPECT_EQ(all[2].defaultValue->elements.size(), 2U);
    EXPECT_EQ(all[3].defaultValue->elements.at(0).value, MofConstant(true));
    EXPECT_EQ(all[4].type.type, Type::reference);
    EXPECT_EQ(all[4].type.referenceClass, "A_C");
    EXPECT_EQ(all[4].type.position, (MofPosition{2, 1}));
    EXPECT_EQ(all[5].name, "F");
    EXPECT_EQ(all[6].defaultValue->elements.at(0).value, (MofConstant(MofInteger{true, 3})));
}

TEST(MofParser, KeywordsMayBeNames) {
    const auto declaration = only<MofClass>(
        "class A_Class { string Ref; string Class; uint8 Qualifier; string string; };");
    ASSERT_EQ(declaration.properties.size(), 4U);
    EXPECT_EQ(declaration.properties[0].name, "Ref");
    EXPECT_EQ(declaration.properties[3].name, "string");
}

TEST(MofParser, ReadsQualifiersOfEveryForm) {
    const auto declaration = only<MofClass>(
        "class A_B { [Key, Max ( 0x10 ), Values { \"a\", \"b\" \"c\" }, Empty {},\n"
        "Description ( \"one \"\n // between\n \"two\" ) : Translatable ToSubclass,\n"
        "Deprecated { \"x\" } : Restricted DisableOverride] uint8 P; };");
    const auto& all = declaration.properties.at(0).qualifiers;
    ASSERT_EQ(all.size(), 6U);
    EXPECT_FALSE(all[0].value);
    EXPECT_EQ(all[1].value->elements.at(0).value, MofConstant(MofInteger{false, 16}));
    EXPECT_EQ(all[2].value->elements.size(), 2U);
    EXPECT_EQ(all[2].value->elements.at(1).value, MofConstant(std::string("bc")));
    EXPECT_TRUE(all[3].value->isArray);
    EXPECT_TRUE(all[3].value->elements.empty());
    EXPECT_EQ(all[4].value->elements.at(0).value, MofConstant(std::string("one two")));
    EXPECT_EQ(all[4].flavors, (MofFlavors{std::nullopt, true, true}));
    EXPECT_EQ(all[5].flavors, (MofFlavors{false, false, std::nullopt}));
    EXPECT_EQ(all[5].position, (MofPosition{5, 1}));
}

TEST(MofParser, ReadsMethodsAmongProperties) {
    const auto declaration = only<MofClass>(
        "class A_B { uint32 Stop(); [X] uint32 Start([In, Out(FALSE)] uint16 State[],\n"
        "A_Job REF Job, A_Job REF More[]); string P; };");
    ASSERT_EQ(declaration.methods.size(), 2U);
    EXPECT_TRUE(declaration.methods[0].parameters.empty());
    const MofMethod& start = declaration.methods[1];
    EXPECT_EQ(start.name, "Start");
    EXPECT_EQ(start.returnType.type, Type::uint32);
    ASSERT_EQ(start.parameters.size(), 3U);
    EXPECT_TRUE(start.parameters[0].isArray);
    EXPECT_EQ(start.parameters[0].qualifiers.size(), 2U);
    EXPECT_EQ(start.parameters[1].type.referenceClass, "A_Job");
    EXPECT_TRUE(start.parameters[2].isArray);
    EXPECT_EQ(declaration.properties.size(), 1U);
}

struct WrongText {
    const char* text;
    const char* reason;
};

class WrongForm : public testing::TestWithParam<WrongText> {};

TEST_P(WrongForm, IsRefusedWithThePlaceAndTheReason) {
    try {
        declarations(GetParam().text);
        FAIL() << "accepted: " << GetParam().text;
    } catch (const MofError& error) {
        EXPECT_EQ(error.what(), std::string("f.mof:") + GetParam().reason);
    }
}

INSTANTIATE_TEST_SUITE_P(
    Texts, WrongForm,
    testing::Values(
        WrongText{"#include (\"x\")", "1:2: expected \"pragma\" after \"#\", found \"include\""},
        WrongText{"#pragma locale \"x\"",
                  "1:16: expected \"(\" after the name of a pragma, found a string"},
        WrongText{"#pragma locale (x)", "1:17: expected a string, found \"x\""},
        WrongText{"#pragma locale (\"x\"",
                  "1:20: expected \")\" after the value of a pragma, found the end of the text"},
        WrongText{"{", "1:1: expected a class, a qualifier type or a pragma, found \"{\""},
        WrongText{"[A] qualifier",
                  "1:5: expected a class, a qualifier type or a pragma, found \"qualifier\""},
        WrongText{"instance of A_B { };", "1:1: instances cannot be declared here, only classes"},
        WrongText{"Qualifier A string;",
                  "1:13: expected \":\" after the name of a qualifier, "
                  "found \"string\""},
        WrongText{"Qualifier A : text;", "1:15: \"text\" is not a type"},
        WrongText{"Qualifier A : string;",
                  "1:21: expected \",\" after the value of a qualifier type, found \";\""},
        WrongText{"Qualifier A : string, Flavor(Restricted);",
                  "1:23: expected \"Scope\", found \"Flavor\""},
        WrongText{"Qualifier A : string, Scope(classes);", "1:29: \"classes\" is not a scope"},
        WrongText{"Qualifier A : string, Scope(any), Flavour(Restricted);",
                  "1:35: expected \"Flavor\", found \"Flavour\""},
        WrongText{"Qualifier A : string, Scope(any), Flavor(Inherited);",
                  "1:42: \"Inherited\" is not a flavor"},
        WrongText{"Qualifier A : string, Scope(any), Flavor(ToSubclass, Restricted);",
                  "1:54: \"Restricted\" contradicts another flavor"},
        WrongText{"Qualifier A : string, Scope(any)",
                  "1:33: expected \";\" after a qualifier type, found the end of the text"},
        WrongText{"class { };", "1:7: expected the name of a class, found \"{\""},
        WrongText{"class A as B { };", "1:12: expected \"$\" after \"as\", found \"B\""},
        WrongText{"class A : { };", "1:11: expected the name of the superclass, found \"{\""},
        WrongText{"class A;", "1:8: expected \"{\" after the head of a class, found \";\""},
        WrongText{"class A { }", "1:12: expected \";\" after a class, found the end of the text"},
        WrongText{"class A { string P }", "1:20: expected \";\" after a property, found \"}\""},
        WrongText{"class A {\n  string;\n};",
                  "2:9: expected the name of a property or method, found \";\""},
        WrongText{"class A {\n  text P;\n};", "2:3: \"text\" is not a type"},
        WrongText{"class A { reference P; };", "1:11: \"reference\" is not a type"},
        WrongText{"class A { string P[0]; };", "1:20: \"0\" is not a size of an array"},
        WrongText{"class A { string P[-1]; };", "1:20: \"-1\" is not a size of an array"},
        WrongText{"class A { string P[x]; };",
                  "1:20: expected \"]\" after the size of an array, found \"x\""},
        WrongText{"class A { string P = x; };", "1:22: expected a value, found \"x\""},
        WrongText{"class A { string P[] = { \"a\" \"b\", }; };",
                  "1:35: expected a value, found \"}\""},
        WrongText{"class A { string P[] = { 1 2 }; };",
                  "1:28: expected \",\" after a value, found \"2\""},
        WrongText{"class A { uint32 M(string P };",
                  "1:29: expected \",\" after a parameter, found \"}\""},
        WrongText{"class A { uint32 M(string P) }",
                  "1:30: expected \";\" after a method, found \"}\""},
        WrongText{"[Key class A { };", "1:6: expected \"]\" after the qualifiers, found \"class\""},
        WrongText{"[] class A { };", "1:2: expected the name of a qualifier, found \"]\""},
        WrongText{"[Max ( 1 ] class A { };",
                  "1:10: expected \")\" after the value of a qualifier, found \"]\""},
        WrongText{"[Max ( ) ] class A { };", "1:8: expected a value, found \")\""},
        WrongText{"[Key : ] class A { };", "1:8: expected a flavor, found \"]\""},
        WrongText{"class A { \"x\" };", "1:11: expected a type, found a string"},
        WrongText{"class A {", "1:10: expected a type, found the end of the text"}));

}  // namespace
}  // namespace cimom
