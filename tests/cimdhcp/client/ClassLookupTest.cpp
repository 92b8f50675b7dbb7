// Which classes there are, and what they are like.
#include <gtest/gtest.h>

#include "cimom/ClassDeclaration.h"
#include "client/ClassList.h"
#include "client/ClassLookup.h"
#include "kit/SmallSchema.h"

namespace cimdhcp {
namespace {

TEST(ClassLookup, ARepositoryIsOne) {
    const cimom::ClassRepository repository = test::smallRepository();
    const ClassLookup classes = repository;
    EXPECT_EQ(classes.find("test_thing"), repository.find("TEST_Thing"));
    EXPECT_EQ(classes.find("TEST_Other"), nullptr);
}

TEST(ClassLookup, AnyFunctionIsOne) {
    const cimom::ClassDeclaration declaration;
    const ClassLookup classes([&](std::string_view name) -> const cimom::ClassDeclaration* {
        return name == "A" ? &declaration : nullptr;
    });
    EXPECT_EQ(classes.find("A"), &declaration);
    EXPECT_EQ(classes.find("B"), nullptr);
}

class ClassList : public ::testing::Test {
  protected:
    const cimom::ClassRepository repository_ = test::smallRepository();
    const std::vector<cimom::Registration> registrations_{
        {"test_thing", "Things", "Library", true, false, {"root/cimv2", "root/b"}},
        {"TEST_Link", "Links", "Library", true, true, {"root/cimv2"}}};
};

TEST_F(ClassList, KnowsSuperclassAndKind) {
    EXPECT_EQ(servedClasses(registrations_, repository_),
              (std::vector<ClassEntry>{
                  {"TEST_Thing", "TEST_Base", false, "Things", {"root/cimv2", "root/b"}},
                  {"TEST_Link", "", true, "Links", {"root/cimv2"}}}));
}

}  // namespace
}  // namespace cimdhcp
