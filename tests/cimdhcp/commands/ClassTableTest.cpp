#include "commands/ClassTable.h"

#include <gtest/gtest.h>

namespace cimdhcp {
namespace {

const ClassEntry thing{"TEST_Thing", "TEST_Base", false, "Things", {"root/cimv2", "root/b"}};
const ClassEntry linkEntry{"TEST_Link", "", true, "Links", {"root/cimv2"}};

TEST(ClassTable, IsATable) {
    EXPECT_EQ(classTable({thing, linkEntry}, std::nullopt),
              "CLASS       SUPERCLASS  KIND         PROVIDER\n"
              "TEST_Thing  TEST_Base   element      Things\n"
              "TEST_Link   -           association  Links\n");
}

TEST(ClassTable, IsJson) {
    EXPECT_EQ(classJson({linkEntry}), R"({
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
