#include "commands/Interruption.h"

#include <gtest/gtest.h>
#include <poll.h>

#include "kit/ChildProcess.h"

namespace cimdhcp {
namespace {

TEST(Interruption, TheFirstSignalIsAWish) {
    for (const int signal : {SIGINT, SIGTERM}) {
        const Interruption interruption;
        EXPECT_FALSE(interruption.wanted());
        std::raise(signal);
        EXPECT_TRUE(interruption.wanted());
    }
}

TEST(Interruption, CanBeWaitedFor) {
    const Interruption interruption;
    pollfd waited{interruption.descriptor(), POLLIN, 0};
    EXPECT_EQ(::poll(&waited, 1, 0), 0);
    std::raise(SIGTERM);
    EXPECT_EQ(::poll(&waited, 1, 0), 1);
}

TEST(Interruption, TheSecondSignalEndsTheProcess) {
    const auto child = ZR::Testing::inChild([] {
        const Interruption interruption;
        std::raise(SIGINT);
        std::raise(SIGINT);
        return std::string("still here");
    });
    EXPECT_EQ(child.signal, SIGINT);
}

TEST(Interruption, SignalsAreAgainWhatTheyWere) {
    const auto child = ZR::Testing::inChild([] {
        { const Interruption interruption; }
        std::raise(SIGTERM);
        return std::string("still here");
    });
    EXPECT_EQ(child.signal, SIGTERM);
}

}  // namespace
}  // namespace cimdhcp
