#include "cimom/ClassDeclaration.h"

#include <gtest/gtest.h>

#include "cimom/ClassRepository.h"

namespace cimom {
namespace {

class ClassDeclarations : public testing::Test {
  protected:
    ClassDeclarations() { repository.load(BROKER_TEST_DIR "/schema/Test.mof"); }
    ClassRepository repository;
};

TEST_F(ClassDeclarations, FindEveryProperty) {
    for (const ClassDeclaration* const declaration : repository.classes()) {
        for (const PropertyDeclaration& property : declaration->properties) {
            EXPECT_EQ(declaration->property(property.name), &property);
        }
        EXPECT_EQ(declaration->property("Nope"), nullptr);
        EXPECT_EQ(declaration->property(""), nullptr);
    }
}

TEST_F(ClassDeclarations, NamesAreFoundInAnyCase) {
    ASSERT_NE(repository.find("TEST_types"), nullptr);
    EXPECT_EQ(repository.find("TEST_types")->property("uINT16a")->name, "Uint16A");
}

TEST_F(ClassDeclarations, KeysAreInTheOrderOfTheDeclaration) {
    const ClassDeclaration& link = *repository.find("Test_LinkA");
    const auto& keys = link.index.keys();
    ASSERT_EQ(keys.size(), 2U);
    EXPECT_EQ(link.properties[keys[0]].name, "Near");
    EXPECT_EQ(link.properties[keys[1]].name, "Far");
}

TEST_F(ClassDeclarations, CopiesFindTheirOwnProperties) {
    ClassDeclaration copy = *repository.find("Test_Types");
    EXPECT_EQ(copy.property("Uint16A"), &copy.properties[static_cast<std::size_t>(
                                            repository.find("Test_Types")->property("Uint16A") -
                                            repository.find("Test_Types")->properties.data())]);
    // Without an index, as a class has that the repository did not make.
    copy.index = {};
    EXPECT_EQ(copy.property("uINT16a")->name, "Uint16A");
    EXPECT_EQ(copy.property("Nope"), nullptr);
}

}  // namespace
}  // namespace cimom
