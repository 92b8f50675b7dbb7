// A server that is to serve until it is told to end.
#include <gtest/gtest.h>
#include <poll.h>

#include "commands/Interruption.h"
#include "commands/Serve.h"
#include "kit/ChildProcess.h"
#include "text/Failure.h"

namespace cimdhcp {

TEST(Serve, ListensWhereItIsTold) {
    EXPECT_EQ(readListening("127.0.0.1"), (Listening{"127.0.0.1", std::nullopt}));
    EXPECT_EQ(readListening("127.0.0.1:5988"), (Listening{"127.0.0.1", 5988}));
    EXPECT_EQ(readListening("::1"), (Listening{"::1", std::nullopt}));
    EXPECT_EQ(readListening("[::1]"), (Listening{"::1", std::nullopt}));
    EXPECT_EQ(readListening("[::1]:0"), (Listening{"::1", 0}));
}

TEST(Serve, RefusesWhatIsNoPlaceToListen) {
    for (const char* text : {"127.0.0.1:", "127.0.0.1:x", "127.0.0.1:65536", "127.0.0.1:-1", "[::1",
                             "[::1]5988", "[::1]:"}) {
        EXPECT_THROW(static_cast<void>(readListening(text)), Failure) << text;
    }
}

}  // namespace cimdhcp

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
