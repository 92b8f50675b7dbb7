#include "cimom/ClassRepository.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <fstream>
#include <random>

#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "cimom/MofError.h"

namespace cimom {
namespace {

constexpr const char* qualifierTypes =
    "Qualifier Association : boolean = FALSE, Scope(association), Flavor(DisableOverride);\n"
    "Qualifier Key : boolean = FALSE, Scope(property, reference), Flavor(DisableOverride);\n"
    "Qualifier Override : string, Scope(property, reference), Flavor(Restricted);\n";

/// A directory that lives as long as the test.
class ClassRepositoryTest : public testing::Test {
  protected:
    ClassRepositoryTest() {
        std::string name = testing::TempDir() + "repository-XXXXXX";
        directory_ = ::mkdtemp(name.data());
    }
    ~ClassRepositoryTest() override {
        std::error_code ignored;  // a leftover in the temporary directory does no harm
        std::filesystem::remove_all(directory_, ignored);
    }

    std::filesystem::path write(const std::string& name, const std::string& text) {
        auto path = directory_ / name;
        std::filesystem::create_directories(path.parent_path());
        std::ofstream(path) << text;
        return path;
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

    [[nodiscard]] std::vector<std::string> names(std::string_view top) const {
        std::vector<std::string> result;
        for (const ClassDeclaration* each : repository_.withSubclasses(top)) {
            result.push_back(each->name);
        }
        return result;
    }

    std::filesystem::path directory_;
    ClassRepository repository_;
};

TEST_F(ClassRepositoryTest, WhatIsKeptStandsAgainstFurtherDeclarations) {
    repository_.loadText(qualifierTypes, "q.mof");
    repository_.loadText("class T_A { uint8 First; };", "a.mof");
    repository_.keepDeclared();
    // Of the kept ones, another form is passed over.
    repository_.loadText(
        "Qualifier KEY : string, Scope(any);\nclass t_a { uint8 Second; };\n"
        "class T_B : T_A { [Key] uint8 Third; };",
        "b.mof");
    EXPECT_EQ(names("T_A"), (std::vector<std::string>{"T_A", "T_B"}));
    EXPECT_NE(repository_.find("T_A")->property("First"), nullptr);
    EXPECT_EQ(repository_.find("T_A")->property("Second"), nullptr);
    EXPECT_TRUE(repository_.find("T_B")->property("Third")->isKey());
    // What came later is still declared once only.
    EXPECT_EQ(errorOf([&] { repository_.loadText("class T_B { };", "c.mof"); }),
              "c.mof:1:7: class T_B is declared twice");
}

TEST_F(ClassRepositoryTest, AnEmptyRepositoryKnowsNothing) {
    EXPECT_EQ(repository_.find("A_B"), nullptr);
    EXPECT_FALSE(repository_.isA("A_B", "A_B"));
    EXPECT_TRUE(repository_.withSubclasses("A_B").empty());
    EXPECT_TRUE(repository_.classes().empty());
    EXPECT_NO_THROW(repository_.complete());
}

TEST_F(ClassRepositoryTest, ClassesAreFoundWithoutRegardToCase) {
    repository_.loadText("class A_Thing { };", "t");
    ASSERT_NE(repository_.find("a_tHING"), nullptr);
    EXPECT_EQ(repository_.find("a_tHING")->name, "A_Thing");
    EXPECT_EQ(repository_.find("A_Thin"), nullptr);
    EXPECT_EQ(repository_.find(""), nullptr);
}

TEST_F(ClassRepositoryTest, AClassIsItselfAndItsAncestors) {
    repository_.loadText("class A_A{}; class A_B:a_a{}; class A_C:A_B{}; class A_D:A_A{};", "t");
    EXPECT_TRUE(repository_.isA("A_C", "A_A"));
    EXPECT_TRUE(repository_.isA("a_c", "a_b"));
    EXPECT_TRUE(repository_.isA("A_C", "A_C"));
    EXPECT_FALSE(repository_.isA("A_A", "A_C"));
    EXPECT_FALSE(repository_.isA("A_D", "A_B"));
    EXPECT_FALSE(repository_.isA("A_X", "A_A"));
    EXPECT_FALSE(repository_.isA("A_A", "A_X"));
    EXPECT_EQ(repository_.find("A_B")->superclass, "A_A");
}

TEST_F(ClassRepositoryTest, SubclassesComeAfterTheirParentsInTheOrderOfLoading) {
    repository_.loadText(
        "class A_A{}; class A_B:A_A{}; class A_C:A_A{}; class A_D:A_B{}; class A_E:A_B{};", "t");
    EXPECT_EQ(names("a_a"), (std::vector<std::string>{"A_A", "A_B", "A_D", "A_E", "A_C"}));
    EXPECT_EQ(names("A_C"), (std::vector<std::string>{"A_C"}));
    ASSERT_EQ(repository_.classes().size(), 5U);
    EXPECT_EQ(repository_.classes()[3]->name, "A_D");
}

TEST_F(ClassRepositoryTest, DeclarationsStayWhereTheyAreWhileMoreAreLoaded) {
    repository_.loadText("class A_A { string P; };", "t");
    const ClassDeclaration* const first = repository_.find("A_A");
    for (int index = 0; index < 1000; ++index) {
        repository_.loadText("class A_N" + std::to_string(index) + " : A_A { };", "t");
    }
    EXPECT_EQ(repository_.find("A_A"), first);
    EXPECT_EQ(repository_.withSubclasses("A_A").size(), 1001U);
    const ClassRepository moved = std::move(repository_);
    EXPECT_EQ(moved.find("A_A"), first);
}

TEST_F(ClassRepositoryTest, AReferenceMayNameAClassThatComesLater) {
    repository_.loadText(qualifierTypes, "q");
    repository_.loadText("[Association] class A_L {\n [Key] A_X REF L;\n [Key] A_X REF R; };",
                         "links.mof");
    EXPECT_EQ(errorOf([&] { repository_.complete(); }), "links.mof:2:8: class A_X is not known");
    repository_.loadText("class A_X { };", "t");
    EXPECT_NO_THROW(repository_.complete());
}

TEST_F(ClassRepositoryTest, ANarrowedReferenceToALaterClassIsCheckedInTheEnd) {
    repository_.loadText(qualifierTypes, "q");
    repository_.loadText("class A_X { };", "t");
    repository_.loadText("[Association] class A_L { [Key] A_X REF L; [Key] A_X REF R; };", "t");
    repository_.loadText("class A_M : A_L { [Override(\"L\")]\n A_Y REF L; };", "m.mof");
    repository_.loadText("class A_Y { };", "t");
    EXPECT_EQ(errorOf([&] { repository_.complete(); }),
              "m.mof:2:2: A_Y is not a subclass of A_X, which the superclass references");
}

TEST_F(ClassRepositoryTest, WhatCameBeforeAnErrorStays) {
    EXPECT_NE(errorOf([&] { repository_.loadText("class A_A{}; class A_B{", "t"); }), "no error");
    EXPECT_NE(repository_.find("A_A"), nullptr);
    EXPECT_EQ(repository_.find("A_B"), nullptr);
}

TEST_F(ClassRepositoryTest, LoadsAFileLargerThanABlock) {
    const std::string blank(200000, ' ');
    repository_.load(write("big.mof", "class A_A{};" + blank + "class A_B:A_A{};"));
    EXPECT_TRUE(repository_.isA("A_B", "A_A"));
}

TEST_F(ClassRepositoryTest, LoadsADirectoryInTheOrderOfTheNames) {
    write("20-b.mof", "class A_B : A_A { };");
    write("10-a.mof", "class A_A { };");
    write("00-notes.txt", "no MOF");
    repository_.loadDirectory(directory_);
    EXPECT_TRUE(repository_.isA("A_B", "A_A"));
}

TEST_F(ClassRepositoryTest, ErrorsNameTheFileTheLineAndTheColumn) {
    const auto file = write("bad.mof", "class A_A {\n   text P;\n};");
    try {
        repository_.load(file);
        FAIL();
    } catch (const MofError& error) {
        EXPECT_EQ(error.what(), file.string() + ":2:4: \"text\" is not a type");
        EXPECT_EQ(error.file, file.string());
        EXPECT_EQ(error.line, 2U);
        EXPECT_EQ(error.column, 4U);
    }
}

TEST_F(ClassRepositoryTest, FilesThatCannotBeReadAreErrors) {
    const auto missing = directory_ / "missing";
    EXPECT_EQ(errorOf([&] { repository_.load(missing); }),
              missing.string() + ":1:1: cannot be read: No such file or directory");
    EXPECT_EQ(errorOf([&] { repository_.load(directory_); }),
              directory_.string() + ":1:1: cannot be read: Is a directory");
    EXPECT_EQ(errorOf([&] { repository_.loadDirectory(missing); }),
              missing.string() + ":1:1: cannot be read: No such file or directory");
}

TEST_F(ClassRepositoryTest, AnIncludedFileIsRelativeToTheOneThatNamesIt) {
    write("parts/inner/a.mof", "class A_A { };");
    write("parts/all.mof", "#pragma include (\"inner/a.mof\")\nclass A_B : A_A { };");
    repository_.load(write("top.mof", "#PRAGMA INCLUDE (\"parts/all.mof\")\nclass A_C : A_B { };"));
    EXPECT_TRUE(repository_.isA("A_C", "A_A"));
}

TEST_F(ClassRepositoryTest, AnIncludeThatIsMissingIsAnErrorWhereItStands) {
    const auto file = write("top.mof", "class A_A { };\n#pragma include (\"none.mof\")");
    EXPECT_EQ(errorOf([&] { repository_.load(file); }),
              file.string() + ":2:18: " + (directory_ / "none.mof").string() +
                  " cannot be read: No such file or directory");
}

TEST_F(ClassRepositoryTest, IncludesInACircleAreAnError) {
    write("b.mof", "#pragma include (\"a.mof\")");
    const auto file = write("a.mof", "#pragma include (\"b.mof\")");
    EXPECT_EQ(errorOf([&] { repository_.load(file); }),
              (directory_ / "b.mof").string() + ":1:18: " + file.string() + " includes itself");
    // The circle must not be remembered: the same file can be read again.
    write("b.mof", "class A_A { };");
    EXPECT_NO_THROW(repository_.load(file));
}

TEST_F(ClassRepositoryTest, OtherPragmasAreIgnored) {
    repository_.loadText(
        "#pragma locale (\"en_US\")\n#pragma namespace (\"root\")\n#pragma own (\"x\")\nclass "
        "A_A{};",
        "t");
    EXPECT_NE(repository_.find("A_A"), nullptr);
}

/// Whatever the text: it is read, or there is a MofError.
TEST_F(ClassRepositoryTest, NoTextDoesHarm) {
    const std::string seed = std::string(qualifierTypes) +
                             "#pragma locale (\"en\")\n/* c */ class A_A { [Key] string P = "
                             "\"a\\x41\"; uint8 L[3] = { 1, 0x2, 11b, 07 }; char16 C = 'c'; "
                             "real32 R = -1.5e3; };\n[Association] class A_L : A_M { [Key, "
                             "Override ( \"L\" ) : Restricted] A_A REF L = NULL; uint8 M([Key] "
                             "A_A REF J, string K[]); };\n";
    const std::string alphabet = "aA_0x9b.-+\"\\'/*#(){}[];:,=$ \n\xC3\x80";
    // A fixed seed: a text that fails must fail again.
    std::mt19937 random(1);  // NOLINT(cert-msc32-c,cert-msc51-cpp)
    unsigned refused = 0;
    for (int round = 0; round < 20000; ++round) {
        std::string text = seed;
        for (auto change = random() % 5; change > 0; --change) {
            text[random() % text.size()] = alphabet[random() % alphabet.size()];
        }
        text.erase(random() % text.size(), random() % 8);
        ClassRepository repository;
        repository.loadText("class A_M { };", "t");
        try {
            repository.loadText(text, "t");
            repository.complete();
        } catch (const MofError& error) {
            ASSERT_GE(error.line, 1U);
            ASSERT_GE(error.column, 1U);
            ++refused;
        }
    }
    EXPECT_GT(refused, 1000U);
}

TEST(QualifierTypesOfTheRepository, AreFoundInAnyCaseAndListedByName) {
    ClassRepository repository;
    repository.loadText(qualifierTypes, "q");
    repository.loadText("Qualifier Anywhere : uint8[] = {1}, Scope(any);", "q");
    const auto key = repository.findQualifierType("KEY");
    ASSERT_TRUE(key);
    EXPECT_EQ(key->prototype.name, "Key");
    EXPECT_EQ(key->prototype.value, (Value{Type::boolean, false, Scalar(false)}));
    EXPECT_FALSE(key->prototype.overridable);
    EXPECT_EQ(key->scopes, (std::vector<std::string_view>{"property", "reference"}));
    EXPECT_TRUE(key->mayStandAt("REFERENCE"));
    EXPECT_FALSE(key->mayStandAt("method"));
    EXPECT_TRUE(repository.findQualifierType("Anywhere")->mayStandAt("method"));
    EXPECT_FALSE(repository.findQualifierType("Nowhere"));
    std::string names;
    for (const QualifierType& type : repository.qualifierTypes()) {
        names += type.prototype.name + ' ';
    }
    EXPECT_EQ(names, "Anywhere Association Key Override ");
}

}  // namespace
}  // namespace cimom
