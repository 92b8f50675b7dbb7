#include "SdBus.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace ZR::Live {
namespace {

using testing::HasSubstr;

TEST(SdBus, HasItsFunctionsOnThisMachine) {
    const SdBus& functions = SdBus::get();
    EXPECT_EQ(functions.missing(), "");
    ASSERT_NE(functions.errorHasName, nullptr);
    const sd_bus_error error{"a.b", "text", 0};
    EXPECT_NE(functions.errorHasName(&error, "a.b"), 0);
    EXPECT_EQ(functions.errorHasName(&error, "a.c"), 0);
}

TEST(SdBus, SaysThatTheLibraryIsMissing) {
    EXPECT_THAT(SdBus("libnobody-has.so.0").missing(), HasSubstr("libnobody-has.so.0"));
}

TEST(SdBus, SaysWhichFunctionALibraryLacks) {
    EXPECT_THAT(SdBus("libc.so.6").missing(), HasSubstr("sd_bus_open_system"));
}

}  // namespace
}  // namespace ZR::Live
