#include "client/ClassLookup.h"

#include <gtest/gtest.h>

#include "cimom/ClassDeclaration.h"
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

}  // namespace
}  // namespace cimdhcp
