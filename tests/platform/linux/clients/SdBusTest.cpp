#include "clients/SdBus.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/resource.h>

#include "kit/ChildProcess.h"

namespace ZR::Live {
namespace {

using testing::HasSubstr;
using testing::MatchesRegex;

/// In a process of its own, and before any other test has loaded the library.
TEST(SdBus, IsTriedAgainWhileItCannotBeLoaded) {
    const auto child = Testing::inChild([] {
        struct rlimit usual {};
        struct rlimit none {};
        if (::getrlimit(RLIMIT_NOFILE, &usual) != 0) {
            return std::string("no limit");
        }
        none.rlim_max = usual.rlim_max;
        ::setrlimit(RLIMIT_NOFILE, &none);
        const std::string first = SdBus::get()->missing();
        ::setrlimit(RLIMIT_NOFILE, &usual);
        return first + '|' + SdBus::get()->missing();
    });
    EXPECT_THAT(child.output, MatchesRegex("libsystemd.so.0: .*Too many open files\\|"));
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
