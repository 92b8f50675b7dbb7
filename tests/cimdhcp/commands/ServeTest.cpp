#include "commands/Serve.h"

#include <gtest/gtest.h>

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
