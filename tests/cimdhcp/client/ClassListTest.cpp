#include "client/ClassList.h"

#include <gtest/gtest.h>

#include "kit/SmallSchema.h"

namespace cimdhcp {
namespace {

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

TEST_F(ClassList, IsATable) {
    EXPECT_EQ(classTable(servedClasses(registrations_, repository_), std::nullopt),
              "CLASS       SUPERCLASS  KIND         PROVIDER\n"
              "TEST_Thing  TEST_Base   element      Things\n"
              "TEST_Link   -           association  Links\n");
}

TEST_F(ClassList, IsJson) {
    EXPECT_EQ(classJson(servedClasses({registrations_.back()}, repository_)), R"({
  "classes": [
    {
      "class": "TEST_Link",
      "superclass": null,
      "kind": "association",
      "provider": "Links",
      "namespaces": [
        "root/cimv2"
      ]
    }
  ]
}
)");
}

}  // namespace
}  // namespace cimdhcp
