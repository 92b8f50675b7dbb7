#include <gtest/gtest.h>

#include "mof/Schema.h"

namespace cimom::broker {
namespace {

class ClassIndexes : public testing::Test {
  protected:
    ClassIndexes() { repository.load(BROKER_TEST_DIR "/schema/Test.mof"); }
    ClassRepository repository;
};

TEST_F(ClassIndexes, FindEveryPropertyOfEveryClass) {
    const Schema schema(repository);
    for (const ClassDeclaration* const declaration : repository.classes()) {
        const ClassIndex* const index = schema.find(declaration->name);
        ASSERT_NE(index, nullptr);
        for (const PropertyDeclaration& property : declaration->properties) {
            EXPECT_EQ(index->property(property.name), &property);
        }
        EXPECT_EQ(index->property("Nope"), nullptr);
        EXPECT_EQ(index->property(""), nullptr);
    }
}

TEST_F(ClassIndexes, NamesAreFoundInAnyCase) {
    const Schema schema(repository);
    ASSERT_NE(schema.find("TEST_types"), nullptr);
    EXPECT_EQ(schema.find("TEST_types")->property("uINT16a")->name, "Uint16A");
    EXPECT_EQ(schema.find("Nobody_Knows"), nullptr);
}

TEST_F(ClassIndexes, KeysAreThoseOfTheDeclaration) {
    const Schema schema(repository);
    const auto& keys = schema.find("Test_LinkA")->keys();
    ASSERT_EQ(keys.size(), 2U);
    EXPECT_EQ(keys[0]->name, "Near");
    EXPECT_EQ(keys[1]->name, "Far");
}

}  // namespace
}  // namespace cimom::broker
