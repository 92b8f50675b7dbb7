#include <gtest/gtest.h>

#include <set>
#include <string>

#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimom/Status.h"
#include "model/NameKey.h"

namespace cimom {
namespace {

Value reference(ObjectPath path) {
    return Value{Type::reference, false,
                 Scalar(std::make_shared<const ObjectPath>(std::move(path)))};
}

Value number(std::uint64_t content, Type type = Type::uint16) {
    return Value{type, false, Scalar(content)};
}

ObjectPath setting(std::string instanceId) {
    return {"", "root/cimv2", "CIM_X", {{"InstanceID", Value::ofString(std::move(instanceId))}}};
}

TEST(Cim, EveryTypeHasANameThatGivesTheTypeBack) {
    for (unsigned index = 0; index <= static_cast<unsigned>(Type::instance); ++index) {
        const auto type = static_cast<Type>(index);
        EXPECT_FALSE(typeName(type).empty());
        EXPECT_EQ(typeFromName(typeName(type)), type);
    }
    EXPECT_EQ(typeName(Type::uint16), "uint16");
    EXPECT_EQ(typeName(Type::reference), "reference");
    EXPECT_EQ(typeFromName("UInt16"), Type::uint16);
    EXPECT_EQ(typeFromName("uint128"), std::nullopt);
    EXPECT_EQ(typeFromName(""), std::nullopt);
}

TEST(Cim, NamesCompareWithoutRegardToAsciiCase) {
    EXPECT_TRUE(sameName("InstanceID", "INSTANCEid"));
    EXPECT_TRUE(sameName("", ""));
    EXPECT_FALSE(sameName("InstanceID", "InstanceI"));
    EXPECT_FALSE(sameName("a[", "a{"));
    EXPECT_FALSE(sameName("\xC3\x84", "\xC3\xA4"));
}

TEST(Value, NullHasSeveralFormsThatAreEqual) {
    const Value empty = Value::null(Type::uint16, false);
    const Value scalar{Type::uint16, false, Scalar(std::monostate())};
    EXPECT_TRUE(empty.isNull());
    EXPECT_TRUE(scalar.isNull());
    EXPECT_EQ(empty, scalar);
    EXPECT_FALSE(number(0).isNull());
    EXPECT_NE(empty, number(0));
    EXPECT_NE(empty, Value::null(Type::uint32, false));
    EXPECT_NE(empty, Value::null(Type::uint16, true));
}

TEST(Value, AnEmptyArrayIsNotNull) {
    const Value array{Type::uint16, true, Array()};
    EXPECT_FALSE(array.isNull());
    EXPECT_NE(array, Value::null(Type::uint16, true));
}

TEST(Value, ArraysCompareElementByElement) {
    const Value array{Type::uint16, true, Array{std::uint64_t{1}, std::monostate()}};
    EXPECT_EQ(array, (Value{Type::uint16, true, Array{std::uint64_t{1}, std::monostate()}}));
    EXPECT_NE(array, (Value{Type::uint16, true, Array{std::uint64_t{1}}}));
    EXPECT_NE(array, (Value{Type::uint16, true, Array{std::monostate(), std::uint64_t{1}}}));
}

TEST(Value, TypeCountsInEquality) {
    EXPECT_EQ(number(5), number(5));
    EXPECT_NE(number(5), number(5, Type::uint32));
    EXPECT_NE(number(5), number(6));
}

TEST(Value, ReferencesCompareByThePathTheyHold) {
    EXPECT_EQ(reference(setting("a")), reference(setting("a")));
    EXPECT_NE(reference(setting("a")), reference(setting("b")));
}

TEST(Value, EmbeddedInstancesCompareByWhatTheyHold) {
    const auto embedded = [](std::uint64_t content) {
        Instance instance{setting("a"), {{"P", number(content)}}};
        return Value{Type::instance, false,
                     Scalar(std::make_shared<const Instance>(std::move(instance)))};
    };
    EXPECT_EQ(embedded(1), embedded(1));
    EXPECT_NE(embedded(1), embedded(2));
}

TEST(ObjectPath, EqualityIgnoresTheCaseOfNamesAndTheOrderOfKeys) {
    const ObjectPath path{"host", "root/cimv2", "CIM_X", {{"A", number(1)}, {"B", number(2)}}};
    const ObjectPath same{"HOST", "Root/CIMV2", "cim_x", {{"b", number(2)}, {"a", number(1)}}};
    EXPECT_EQ(path, same);
    EXPECT_EQ(same, path);
}

TEST(ObjectPath, EqualityRespectsTheCaseOfValues) {
    EXPECT_NE(setting("eth0"), setting("ETH0"));
}

TEST(ObjectPath, AnEmptyHostEqualsAnyOther) {
    ObjectPath here = setting("a");
    ObjectPath there = setting("a");
    here.host = "one";
    EXPECT_EQ(here, there);
    there.host = "two";
    EXPECT_NE(here, there);
}

TEST(ObjectPath, DifferentKeysMakeDifferentPaths) {
    ObjectPath more = setting("a");
    more.keys.push_back({"Other", number(1)});
    EXPECT_NE(more, setting("a"));
    EXPECT_NE(setting("a"), more);
    const ObjectPath twice{"", "", "C", {{"A", number(1)}, {"A", number(1)}}};
    const ObjectPath once{"", "", "C", {{"A", number(1)}, {"B", number(1)}}};
    EXPECT_NE(twice, once);
}

TEST(ObjectPath, KeysAreFoundWithoutRegardToCase) {
    const ObjectPath path = setting("a");
    ASSERT_NE(path.key("instanceid"), nullptr);
    EXPECT_EQ(*path.key("instanceid"), Value::ofString("a"));
    EXPECT_EQ(path.key("Name"), nullptr);
}

TEST(Instance, PropertiesAreFoundWithoutRegardToCase) {
    const Instance instance{setting("a"), {{"State", number(2)}}};
    ASSERT_NE(instance.property("STATE"), nullptr);
    EXPECT_EQ(*instance.property("STATE"), number(2));
    EXPECT_EQ(instance.property("Missing"), nullptr);
}

TEST(Status, NamesAreThoseOfTheCimStatusCodes) {
    EXPECT_EQ(statusName(CMPI_RC_OK), "OK");
    EXPECT_EQ(statusName(CMPI_RC_ERR_FAILED), "CIM_ERR_FAILED");
    EXPECT_EQ(statusName(CMPI_RC_ERR_INVALID_CLASS), "CIM_ERR_INVALID_CLASS");
    EXPECT_EQ(statusName(CMPI_RC_ERR_NOT_FOUND), "CIM_ERR_NOT_FOUND");
    EXPECT_EQ(statusName(CMPI_RC_ERR_NO_SUCH_PROPERTY), "CIM_ERR_NO_SUCH_PROPERTY");
    EXPECT_EQ(statusName(CMPI_RC_ERR_METHOD_NOT_FOUND), "CIM_ERR_METHOD_NOT_FOUND");
}

TEST(Status, CodesOfCmpiAloneAreFailures) {
    EXPECT_EQ(statusName(CMPI_RC_DO_NOT_UNLOAD), "CIM_ERR_FAILED");
    EXPECT_EQ(statusName(CMPI_RC_ERROR), "CIM_ERR_FAILED");
}

}  // namespace
}  // namespace cimom

using cimom::NameKey;

TEST(NameKey, CasesOfANameHaveOneHash) {
    const NameKey key("SystemCreationClassName");
    EXPECT_EQ(key.hash(), NameKey("systemcreationclassname").hash());
    EXPECT_TRUE(key.is("SYSTEMCREATIONCLASSNAME", NameKey("SYSTEMCREATIONCLASSNAME").hash()));
    EXPECT_FALSE(key.is("SystemCreationClassNames", NameKey("SystemCreationClassNames").hash()));
}

TEST(NameKey, EqualHashesAreNotEnough) {
    // "@" and "`" differ in the bit of the case, but are no letters.
    const NameKey key("a@");
    EXPECT_EQ(key.hash(), NameKey("a`").hash());
    EXPECT_FALSE(key.is("a`", NameKey("a`").hash()));
}

TEST(NameKey, HashesOfSimilarNamesDiffer) {
    std::set<std::uint64_t> hashes;
    for (int number = 0; number < 1000; ++number) {
        hashes.insert(NameKey("Property" + std::to_string(number)).hash());
    }
    EXPECT_EQ(hashes.size(), 1000U);
    EXPECT_NE(NameKey("").hash(), NameKey("a").hash());
}
