#include "include/Exceptions.h"

#include <gtest/gtest.h>

#include <optional>
#include <stdexcept>
#include <string>
#include <type_traits>

namespace ZR {

namespace {

template <typename Exception>
class ExceptionsTest : public testing::Test {};

using All = testing::Types<FrameworkException, InstrumentationException, ProviderException>;
TYPED_TEST_SUITE(ExceptionsTest, All);

TYPED_TEST(ExceptionsTest, WhatIsTheMessage) {
    const TypeParam exception("Could not find 'Name' key in Moniker");
    EXPECT_STREQ(exception.what(), "Could not find 'Name' key in Moniker");
}

TYPED_TEST(ExceptionsTest, WhatOfAnEmptyMessageIsEmptyAndNotNull) {
    const TypeParam exception("");
    ASSERT_NE(exception.what(), nullptr);
    EXPECT_STREQ(exception.what(), "");
}

TYPED_TEST(ExceptionsTest, CopyHasAMessageOfItsOwn) {
    std::optional<TypeParam> original(std::in_place, std::string(100, 'x'));
    const TypeParam copy(*original);
    TypeParam assigned("other");
    assigned = *original;
    original.reset();
    EXPECT_EQ(copy.what(), std::string(100, 'x'));
    EXPECT_EQ(assigned.what(), std::string(100, 'x'));
}

TYPED_TEST(ExceptionsTest, IsCaughtAsAStandardException) {
    try {
        throw TypeParam("thrown");
    } catch (const std::exception& exception) {
        EXPECT_STREQ(exception.what(), "thrown");
        EXPECT_NE(dynamic_cast<const TypeParam*>(&exception), nullptr);
    }
}

TYPED_TEST(ExceptionsTest, TextDoesNotTurnIntoOneByItself) {
    EXPECT_FALSE((std::is_convertible_v<std::string, TypeParam>));
}

TEST(Exceptions, NoneDerivesFromAnother) {
    EXPECT_FALSE((std::is_base_of_v<FrameworkException, InstrumentationException>));
    EXPECT_FALSE((std::is_base_of_v<FrameworkException, ProviderException>));
    EXPECT_FALSE((std::is_base_of_v<InstrumentationException, FrameworkException>));
    EXPECT_FALSE((std::is_base_of_v<InstrumentationException, ProviderException>));
    EXPECT_FALSE((std::is_base_of_v<ProviderException, FrameworkException>));
    EXPECT_FALSE((std::is_base_of_v<ProviderException, InstrumentationException>));
    EXPECT_FALSE((std::is_base_of_v<std::runtime_error, ProviderException>));
}

}  // namespace

}  // namespace ZR
