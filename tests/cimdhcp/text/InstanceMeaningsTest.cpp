#include "text/InstanceMeanings.h"

#include <gtest/gtest.h>

#include <memory>

#include "cimom/ObjectPathText.h"
#include "kit/SmallSchema.h"

namespace cimdhcp {
namespace {

using cimom::Array;
using cimom::NamedValue;
using cimom::Scalar;
using cimom::Type;

const NamedValue state{"State", {Type::sint32, false, Scalar(std::int64_t{2})}};
const NamedValue options{
    "options", {Type::uint16, true, Array{std::uint64_t{8}, std::uint64_t{9}, std::uint64_t{14}}}};
const NamedValue bytes{"Byte", {Type::uint8, true, Array{std::uint64_t{8}}}};

class InstanceMeanings : public ::testing::Test {
  protected:
    const cimom::ClassRepository repository_ = test::smallRepository();
    const cimom::ClassDeclaration* thing_ = repository_.find("TEST_Thing");
};

TEST_F(InstanceMeanings, StandAlone) {
    EXPECT_EQ(meaningOf(thing_, state), "Enabled");
    EXPECT_EQ(meaningOf(thing_, options), "Eight, 9, Fourteen");
    EXPECT_EQ(meaningOf(thing_, bytes), "");
}

TEST_F(InstanceMeanings, StandBehindTheirValues) {
    EXPECT_EQ(valueWithMeaning(thing_, state), "2 (Enabled)");
    EXPECT_EQ(valueWithMeaning(thing_, options), "{8 (Eight), 9, 14 (Fourteen)}");
    EXPECT_EQ(valueWithMeaning(thing_, bytes), "{8}");
}

TEST_F(InstanceMeanings, AreMissingForAnUnknownClass) {
    EXPECT_EQ(meaningOf(nullptr, state), "");
    EXPECT_EQ(valueWithMeaning(nullptr, state), "2");
}

TEST_F(InstanceMeanings, ShowReferencesAsPlainPaths) {
    const std::string text = "root/cimv2:TEST_Base.Id=\"a\"";
    const NamedValue other{
        "Other",
        {Type::reference, false,
         Scalar(std::make_shared<const cimom::ObjectPath>(cimom::parseObjectPath(text)))}};
    EXPECT_EQ(valueWithMeaning(thing_, other), text);
}

TEST_F(InstanceMeanings, ShowNull) {
    EXPECT_EQ(valueWithMeaning(thing_, {"State", cimom::Value::null(Type::sint32, false)}), "NULL");
    EXPECT_EQ(meaningOf(thing_, {"State", cimom::Value::null(Type::sint32, false)}), "");
}

}  // namespace
}  // namespace cimdhcp
