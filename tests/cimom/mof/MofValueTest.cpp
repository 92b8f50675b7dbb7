#include "cimom/Instance.h"
#include "mof/MofValue.h"

#include <gtest/gtest.h>

#include <limits>

#include "cimom/ClassRepository.h"

namespace cimom {
namespace {

MofInitializer one(MofConstant constant) {
    return {false, {{std::move(constant), {3, 5}}}, {3, 5}};
}

MofConstant ofInteger(std::uint64_t magnitude, bool negative = false) {
    return MofInteger{negative, magnitude};
}

std::string errorOf(const MofInitializer& initializer, Type type, bool isArray = false) {
    try {
        static_cast<void>(typedValue(initializer, type, isArray, "f"));
    } catch (const MofError& error) {
        return error.what();
    }
    return "no error";
}

struct Range {
    Type type;
    std::uint64_t largest;
    std::uint64_t lowest;  ///< magnitude of the smallest value
};

TEST(MofValue, IntegersKeepTheRangeOfTheirType) {
    constexpr std::uint64_t two63 = 1ULL << 63U;
    for (const Range& range :
         {Range{Type::uint8, 255, 0}, Range{Type::uint16, 65535, 0},
          Range{Type::uint32, 4294967295, 0}, Range{Type::sint8, 127, 128},
          Range{Type::sint16, 32767, 32768}, Range{Type::sint32, 2147483647, 2147483648},
          Range{Type::sint64, two63 - 1, two63}}) {
        EXPECT_EQ(errorOf(one(ofInteger(range.largest)), range.type), "no error");
        EXPECT_EQ(errorOf(one(ofInteger(range.lowest, true)), range.type), "no error");
        EXPECT_EQ(errorOf(one(ofInteger(range.largest + 1)), range.type),
                  "f:3:5: " + std::to_string(range.largest + 1) + " does not fit " +
                      std::string(typeName(range.type)));
        EXPECT_EQ(errorOf(one(ofInteger(range.lowest + 1, true)), range.type),
                  "f:3:5: -" + std::to_string(range.lowest + 1) + " does not fit " +
                      std::string(typeName(range.type)));
    }
    EXPECT_EQ(errorOf(one(ofInteger(std::numeric_limits<std::uint64_t>::max())), Type::uint64),
              "no error");
}

TEST(MofValue, IntegersAreHeldInTheSignednessOfTheirType) {
    EXPECT_EQ(typedValue(one(ofInteger(5)), Type::uint8, false, "f"),
              (Value{Type::uint8, false, Scalar(std::uint64_t{5})}));
    EXPECT_EQ(typedValue(one(ofInteger(5)), Type::sint8, false, "f"),
              (Value{Type::sint8, false, Scalar(std::int64_t{5})}));
    EXPECT_EQ(typedValue(one(ofInteger(1ULL << 63U, true)), Type::sint64, false, "f"),
              (Value{Type::sint64, false, Scalar(std::numeric_limits<std::int64_t>::min())}));
}

TEST(MofValue, OtherTypesTakeTheirOwnLiterals) {
    EXPECT_EQ(typedValue(one(true), Type::boolean, false, "f"),
              (Value{Type::boolean, false, Scalar(true)}));
    EXPECT_EQ(typedValue(one(u'x'), Type::char16, false, "f"),
              (Value{Type::char16, false, Scalar(u'x')}));
    EXPECT_EQ(typedValue(one(1.5), Type::real32, false, "f"),
              (Value{Type::real32, false, Scalar(1.5)}));
    EXPECT_EQ(typedValue(one(ofInteger(2, true)), Type::real64, false, "f"),
              (Value{Type::real64, false, Scalar(-2.0)}));
    EXPECT_EQ(typedValue(one(std::string("a")), Type::string, false, "f"), Value::ofString("a"));
}

TEST(MofValue, DatetimesHaveTheirTwentyFiveCharacters) {
    for (const char* good :
         {"20240131093000.000000+060", "00000001000000.000000:000", "202401310930**.******-000"}) {
        EXPECT_EQ(errorOf(one(std::string(good)), Type::datetime), "no error");
    }
    for (const char* bad : {"", "2024", "20240131093000.000000+06*", "20240131093000,000000+060",
                            "20240131093000.000000x060", "2024013109300a.000000+060"}) {
        EXPECT_EQ(errorOf(one(std::string(bad)), Type::datetime),
                  "f:3:5: this is not a value of type datetime");
    }
}

TEST(MofValue, NullFitsEverything) {
    for (unsigned index = 0; index <= static_cast<unsigned>(Type::instance); ++index) {
        const auto type = static_cast<Type>(index);
        EXPECT_EQ(typedValue(one({}), type, false, "f"), Value::null(type, false));
        EXPECT_EQ(typedValue(one({}), type, true, "f"), Value::null(type, true));
    }
}

TEST(MofValue, ListsAreForArraysAndTheirElementsMayBeNull) {
    const MofInitializer list{true, {{ofInteger(1), {4, 1}}, {{}, {4, 4}}}, {3, 9}};
    EXPECT_EQ(typedValue(list, Type::uint8, true, "f"),
              (Value{Type::uint8, true, Array{std::uint64_t{1}, std::monostate()}}));
    EXPECT_EQ(typedValue({true, {}, {}}, Type::uint8, true, "f"),
              (Value{Type::uint8, true, Array()}));
    EXPECT_EQ(errorOf(list, Type::uint8), "f:3:9: one value is needed here, not a list");
    EXPECT_EQ(errorOf(one(ofInteger(1)), Type::uint8, true),
              "f:3:5: a list in braces is needed here");
    EXPECT_EQ(errorOf(list, Type::string, true), "f:4:1: this is not a value of type string");
}

TEST(MofValue, ValuesOfAnotherTypeAreRefused) {
    EXPECT_EQ(errorOf(one(true), Type::uint8), "f:3:5: this is not a value of type uint8");
    EXPECT_EQ(errorOf(one(1.5), Type::uint8), "f:3:5: this is not a value of type uint8");
    EXPECT_EQ(errorOf(one(ofInteger(1)), Type::string),
              "f:3:5: this is not a value of type string");
    EXPECT_EQ(errorOf(one(ofInteger(1)), Type::boolean),
              "f:3:5: this is not a value of type boolean");
    EXPECT_EQ(errorOf(one(std::string("a")), Type::char16),
              "f:3:5: this is not a value of type char16");
    EXPECT_EQ(errorOf(one(u'a'), Type::string), "f:3:5: this is not a value of type string");
    EXPECT_EQ(errorOf(one(std::string("a")), Type::real32),
              "f:3:5: this is not a value of type real32");
    EXPECT_EQ(errorOf(one(1e39), Type::real32), "f:3:5: this number does not fit real32");
    EXPECT_EQ(errorOf(one(std::string("X.A=1")), Type::reference),
              "f:3:5: a reference can have no default value but NULL");
}

}  // namespace
}  // namespace cimom
