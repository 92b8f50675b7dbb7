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

}  // namespace
}  // namespace cimdhcp
