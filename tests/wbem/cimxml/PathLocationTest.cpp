#include "cimxml/PathLocation.h"

#include <gtest/gtest.h>

#include <memory>

#include "cimom/Instance.h"

namespace cimom::wbem {

NamedValue reference(const std::string& name, const ObjectPath& path) {
    return {name, {Type::reference, false, Scalar(std::make_shared<const ObjectPath>(path))}};
}

TEST(PathLocation, FillsWhatIsNotWritten) {
    ObjectPath path{"", "", "A", {}};
    locate(path, "root/a");
    EXPECT_EQ(path.nameSpace, "root/a");
    locate(path, "root/b");
    EXPECT_EQ(path.nameSpace, "root/a");
}

TEST(PathLocation, AReferenceIsOfTheNamespaceAroundIt) {
    const ObjectPath inner{"", "", "C", {}};
    const ObjectPath middle{"", "root/b", "B", {reference("R", inner)}};
    ObjectPath path{"", "", "A", {reference("R", middle), reference("S", inner)}};
    locate(path, "root/a");
    const ObjectPath innerOfB{"", "root/b", "C", {}};
    const ObjectPath innerOfA{"", "root/a", "C", {}};
    EXPECT_EQ(path, (ObjectPath{"",
                                "root/a",
                                "A",
                                {reference("R", {"", "root/b", "B", {reference("R", innerOfB)}}),
                                 reference("S", innerOfA)}}));
}

TEST(PathLocation, PropertiesOfInstancesAreLocatedToo) {
    Instance instance{{"", "", "A", {}},
                      {reference("R", {"", "", "B", {}}), {"T", Value::ofString("x")}}};
    locate(instance, "root/a");
    EXPECT_EQ(instance,
              (Instance{{"", "root/a", "A", {}},
                        {reference("R", {"", "root/a", "B", {}}), {"T", Value::ofString("x")}}}));
}

}  // namespace cimom::wbem
