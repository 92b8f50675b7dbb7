#include "clients/SdBus.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/resource.h>

#include <cstdlib>
#include <iostream>
#include <string>

namespace ZR::Live {
namespace {

using testing::HasSubstr;

/// Ends the process with what get() says while there is no descriptor left, and then.
[[noreturn]] void tellTwice() {
    struct rlimit usual {};
    struct rlimit none {};
    if (::getrlimit(RLIMIT_NOFILE, &usual) != 0) {
        std::_Exit(1);
    }
    none.rlim_max = usual.rlim_max;
    ::setrlimit(RLIMIT_NOFILE, &none);
    const std::string first = SdBus::get()->missing();
    ::setrlimit(RLIMIT_NOFILE, &usual);
    std::cerr << first << '|' << SdBus::get()->missing() << '|' << std::endl;
    std::_Exit(0);
}

/// In a process that is started anew: any other test may have loaded the library here.
TEST(SdBus, IsTriedAgainWhileItCannotBeLoaded) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    EXPECT_EXIT(tellTwice(), testing::ExitedWithCode(0),
                "libsystemd.so.0: .*Too many open files\\|\\|");
}

TEST(SdBus, HasItsFunctionsOnThisMachine) {
    const auto functions = SdBus::get();
    EXPECT_EQ(functions->missing(), "");
    EXPECT_EQ(SdBus::get(), functions);
    ASSERT_NE(functions->errorHasName, nullptr);
    const sd_bus_error error{"a.b", "text", 0};
    EXPECT_NE(functions->errorHasName(&error, "a.b"), 0);
    EXPECT_EQ(functions->errorHasName(&error, "a.c"), 0);
}

TEST(SdBus, SaysThatTheLibraryIsMissing) {
    EXPECT_THAT(SdBus("libnobody-has.so.0").missing(), HasSubstr("libnobody-has.so.0"));
}

TEST(SdBus, SaysWhichFunctionALibraryLacks) {
    EXPECT_THAT(SdBus("libc.so.6").missing(), HasSubstr("sd_bus_open_system"));
}

}  // namespace
}  // namespace ZR::Live
