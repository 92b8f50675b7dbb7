#include "operations/Modification.h"

#include <gtest/gtest.h>

#include "cimom/ObjectPathText.h"
#include "operations/ModificationLog.h"

namespace cimom::wbem {

Modification modification() {
    Modification made;
    made.caller.address = "192.0.2.7";
    made.object = parseObjectPath("root/x:A.k=\"v\"");
    return made;
}

TEST(Modification, TellsWhoDidWhat) {
    Modification made = modification();
    made.caller.user = "ada";
    made.changes = {
        {"Name", Value::ofString("old \"x\""), Value::ofString("new")},
        {"Same", Value::ofString("x"), Value::ofString("x")},
        {"N", std::nullopt, {Type::uint8, true, Array{Scalar(std::uint64_t{1}), Scalar()}}}};
    EXPECT_EQ(modificationText(made),
              R"(modify user="ada" address=192.0.2.7 object=root/x:A.k="v" Name: "old \"x\"" -> )"
              R"("new" N: unknown -> {1, null} status=OK)");
}

TEST(Modification, TellsOfCreationsAndDeletions) {
    Modification made = modification();
    made.kind = Modification::Kind::create;
    made.changes = {{"k", std::nullopt, Value::ofString("v")}};
    EXPECT_EQ(modificationText(made),
              R"(create user=none address=192.0.2.7 object=root/x:A.k="v" k: "v" status=OK)");
    made.kind = Modification::Kind::remove;
    made.changes.clear();
    EXPECT_EQ(modificationText(made),
              R"(delete user=none address=192.0.2.7 object=root/x:A.k="v" status=OK)");
}

TEST(Modification, TellsWhyItWasNotDone) {
    Modification made = modification();
    made.status = 2;
    made.description = "this needs the right to modify";
    EXPECT_EQ(modificationText(made),
              R"(modify user=none address=192.0.2.7 object=root/x:A.k="v" )"
              "status=CIM_ERR_ACCESS_DENIED (this needs the right to modify)");
}

TEST(Modification, ShortensLongValues) {
    Modification made = modification();
    made.changes = {
        {"Name", Value::null(Type::string, false), Value::ofString(std::string(9000, 'x'))}};
    const std::string text = modificationText(made);
    EXPECT_LT(text.size(), 400U);
    EXPECT_NE(text.find("null -> \"xxx"), std::string::npos);
}

}  // namespace cimom::wbem
