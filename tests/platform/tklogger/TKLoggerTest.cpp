#include "tklogger/TKLogger.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <vector>

#include "CallCounts.h"
#include "kit/LogCapture.h"

namespace TKLog {

namespace {

using ZR::Testing::LogCapture;
using ZR::Testing::LogRecord;
using Messages = std::vector<std::string>;

const std::string category = "Merrow.Test";

void log(int level, std::string_view message) {
    TKLogger::logLevelMessage("Some/File", "someFunction", 17, category, level, nullptr, 0, 0,
                              message);
}

void trace(int level, std::string_view message) {
    TKLogger::traceLevelMessage("Some/File", "someFunction", 17, category, level, nullptr, 0, 0,
                                message);
}

TEST(TKLogger, LineArrivesWithAllItsParts) {
    const LogCapture capture;
    log(4000, "said");
    trace(3000, "whispered");
    const auto logged = capture.log();
    const auto traced = capture.trace();
    ASSERT_EQ(logged.size(), 1U);
    ASSERT_EQ(traced.size(), 1U);
    EXPECT_EQ(logged[0],
              (LogRecord{logged[0].time, 4000, category, "Some/File", 17, "someFunction", "said"}));
    EXPECT_EQ(traced[0], (LogRecord{traced[0].time, 3000, category, "Some/File", 17, "someFunction",
                                    "whispered"}));
}

TEST(TKLogger, ChannelsDoNotMeet) {
    const LogCapture capture;
    log(1, "log");
    EXPECT_EQ(capture.logMessages(), Messages{"log"});
    EXPECT_EQ(capture.traceMessages(), Messages{});
    trace(1, "trace");
    EXPECT_EQ(capture.logMessages(), Messages{"log"});
    EXPECT_EQ(capture.traceMessages(), Messages{"trace"});
}

TEST(TKLogger, EachChannelKeepsLinesOfItsOwnLevelOrAbove) {
    const LogCapture capture(4000, 3000);
    for (const int level : {2999, 3000, 3999, 4000, 6000}) {
        log(level, std::to_string(level));
        trace(level, std::to_string(level));
    }
    EXPECT_EQ(capture.logMessages(), (Messages{"4000", "6000"}));
    EXPECT_EQ(capture.traceMessages(), (Messages{"3000", "3999", "4000", "6000"}));
}

TEST(TKLogger, LevelsMayBeNegative) {
    const LogCapture capture(-5, INT_MIN);
    log(-6, "below");
    log(-5, "kept");
    trace(INT_MIN + 1, "kept");
    EXPECT_EQ(capture.logMessages(), Messages{"kept"});
    EXPECT_EQ(capture.traceMessages(), Messages{"kept"});
}

TEST(TKLogger, ChannelWithoutASinkKeepsNothing) {
    const LogCapture capture;
    TKLogger::configure({0, "none"}, {0, "none"});
    log(INT_MAX, "to no sink");
    trace(INT_MAX, "to no sink");
    EXPECT_EQ(capture.logMessages(), Messages{});
    EXPECT_EQ(capture.traceMessages(), Messages{});
}

TEST(TKLogger, ChannelsCanBeSetUpAnew) {
    const LogCapture first;
    log(1, "first");
    const LogCapture second(5000);
    log(4999, "discarded");
    log(5000, "second");
    EXPECT_EQ(first.logMessages(), Messages{"first"});
    EXPECT_EQ(second.logMessages(), Messages{"second"});
}

TEST(TKLogger, NullNamesAndEmptyMessagesAreNoTrouble) {
    const LogCapture capture;
    TKLogger::logLevelMessage(nullptr, nullptr, 0, std::string(), 1, nullptr, 0, 0, {});
    const auto logged = capture.log();
    ASSERT_EQ(logged.size(), 1U);
    EXPECT_EQ(logged[0], (LogRecord{logged[0].time, 1, "-", "-", 0, "-", ""}));
}

TEST(TKLogger, TheTextAndTheNumbersInTheMiddleMeanNothing) {
    const LogCapture capture;
    TKLogger::logLevelMessage("f", "g", 1, category, 1, "text", 7, 8, "message");
    EXPECT_EQ(capture.logMessages(), Messages{"message"});
}

TEST(TKLogger, DiscardedLineDoesNotReachTheSlowPath) {
    const LogCapture capture(4000, 4000);
    log(4000, "sets up");
    const unsigned logCalls = Testing::logSlowPathCalls();
    const unsigned traceCalls = Testing::traceSlowPathCalls();
    const std::size_t allocations = Testing::allocationsOfThisThread();
    for (int i = 0; i < 1000; ++i) {
        log(3999, "discarded");
        trace(3999, "discarded");
    }
    EXPECT_EQ(Testing::logSlowPathCalls(), logCalls);
    EXPECT_EQ(Testing::traceSlowPathCalls(), traceCalls);
    EXPECT_EQ(Testing::allocationsOfThisThread(), allocations);

    // And a kept one does, which shows that the counters count.
    log(4000, "kept");
    trace(4000, "kept");
    EXPECT_EQ(Testing::logSlowPathCalls(), logCalls + 1);
    EXPECT_EQ(Testing::traceSlowPathCalls(), traceCalls + 1);
}

TEST(TKLogger, LineForAChannelWithoutASinkDoesNotReachTheSlowPath) {
    TKLogger::configure({0, "none"}, {0, "none"});
    const unsigned logCalls = Testing::logSlowPathCalls();
    const unsigned traceCalls = Testing::traceSlowPathCalls();
    log(6000, "to no sink");
    trace(6000, "to no sink");
    EXPECT_EQ(Testing::logSlowPathCalls(), logCalls);
    EXPECT_EQ(Testing::traceSlowPathCalls(), traceCalls);
}

}  // namespace

}  // namespace TKLog
