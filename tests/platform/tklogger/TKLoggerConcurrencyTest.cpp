#include <gtest/gtest.h>

#include <atomic>
#include <map>
#include <string>
#include <thread>
#include <vector>

#include "kit/Files.h"
#include "kit/LogCapture.h"
#include "tklogger/TKLogger.h"

namespace TKLog {

namespace {

using ZR::Testing::LogCapture;
using ZR::Testing::LogRecord;

const std::string sharedCategory = "Merrow.Test";
constexpr unsigned threadCount = 16;
constexpr unsigned linesOfEach = 1000;

/// Lines of many lengths, so that mixed ones would show.
std::string payload(unsigned number) {
    return std::to_string(number) + " " + std::string(number % 300, 'x');
}

void expectEveryLineInOrder(const std::vector<LogRecord>& records) {
    std::map<std::string, unsigned> next;
    for (const LogRecord& record : records) {
        EXPECT_EQ(record.message, payload(next[record.function]++)) << record.function;
    }
    EXPECT_EQ(next.size(), threadCount);
    for (const auto& [function, count] : next) {
        EXPECT_EQ(count, linesOfEach) << function;
    }
}

TEST(TKLoggerThreads, LinesNeverMixAndNoneIsLost) {
    const LogCapture capture;
    std::vector<std::thread> threads;
    for (unsigned id = 0; id < threadCount; ++id) {
        threads.emplace_back([id] {
            const std::string name = "thread" + std::to_string(id);
            for (unsigned i = 0; i < linesOfEach; ++i) {
                TKLogger::logLevelMessage("F", name.c_str(), id, sharedCategory, 1, nullptr, 0, 0,
                                          payload(i));
                TKLogger::traceLevelMessage("F", name.c_str(), id, sharedCategory, 1, nullptr, 0, 0,
                                            payload(i));
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    expectEveryLineInOrder(capture.log());
    expectEveryLineInOrder(capture.trace());
}

TEST(TKLoggerThreads, FileIsRotatedUnderTheirHandsAndNoLineIsLost) {
    const ZR::Testing::TemporaryDirectory directory;
    const std::string path = directory / "log";
    TKLogger::configure({0, "file:" + path}, {0, "none"});
    std::vector<std::thread> threads;
    std::atomic<unsigned> running{4};
    for (unsigned id = 0; id < 4; ++id) {
        threads.emplace_back([&running] {
            for (unsigned i = 0; i < linesOfEach; ++i) {
                TKLogger::logLevelMessage("F", "f", 1, sharedCategory, 1, nullptr, 0, 0,
                                          payload(i));
            }
            --running;
        });
    }
    unsigned rotations = 0;
    while (running > 0) {
        std::error_code notThereYet;
        std::filesystem::rename(path, path + "." + std::to_string(rotations), notThereYet);
        rotations += notThereYet ? 0U : 1U;
        std::this_thread::yield();
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    TKLogger::configure({0, "none"}, {0, "none"});
    EXPECT_GT(rotations, 0U);
    std::size_t lines = 0;
    for (const auto& entry : std::filesystem::directory_iterator(directory.path())) {
        lines += ZR::Testing::parseLog(ZR::Testing::readFile(entry.path().string())).size();
    }
    EXPECT_EQ(lines, std::size_t{4} * linesOfEach);
}

TEST(TKLoggerThreads, ChannelsAreSetUpAnewMeanwhile) {
    const ZR::Testing::TemporaryDirectory directory;
    const auto setUp = [&directory](int i) {
        const std::string number = std::to_string(i % 3);
        TKLogger::configure({i % 2, "file:" + (directory / ("log" + number))},
                            {1, i % 5 == 0 ? "none" : "file:" + (directory / ("trace" + number))});
    };
    setUp(0);  // else the threads might be through before anything keeps their lines
    std::vector<std::thread> threads;
    std::atomic<unsigned> running{4};
    for (unsigned id = 0; id < 4; ++id) {
        threads.emplace_back([&running] {
            for (unsigned i = 0; i < linesOfEach; ++i) {
                TKLogger::logLevelMessage("F", "f", 1, sharedCategory, 1, nullptr, 0, 0,
                                          payload(i));
                TKLogger::traceLevelMessage("F", "f", 1, sharedCategory, 1, nullptr, 0, 0,
                                            payload(i));
            }
            --running;
        });
    }
    for (int i = 1; running > 0; ++i) {
        setUp(i);
        std::this_thread::yield();
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    TKLogger::configure({0, "none"}, {0, "none"});
    std::size_t lines = 0;
    for (const auto& entry : std::filesystem::directory_iterator(directory.path())) {
        // Throws for a line that is not whole.
        lines += ZR::Testing::parseLog(ZR::Testing::readFile(entry.path().string())).size();
    }
    EXPECT_GT(lines, 0U);
}

}  // namespace

}  // namespace TKLog
