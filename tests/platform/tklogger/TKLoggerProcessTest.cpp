// What only a fresh process shows: the first line sets the service up from the
// platform settings. Each test runs the probe, a program that logs as it is told.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>
#include <map>
#include <string>
#include <thread>
#include <vector>

#include "kit/ChildProcess.h"
#include "kit/Files.h"
#include "kit/LogCapture.h"

namespace TKLog {

namespace {

using ZR::Testing::ChildResult;
using ZR::Testing::LogRecord;
using ZR::Testing::parseLog;
using ZR::Testing::readFile;
using ZR::Testing::writeFile;

using Messages = std::vector<std::string>;

class TKLoggerProcessTest : public testing::Test {
  protected:
    void SetUp() override { writeFile(config_, ""); }

    /// Runs the probe with our settings file and environment; its standard error
    /// goes to a file.
    void run(const std::vector<std::string>& orders) const {
        const ChildResult result = ZR::Testing::inChild([&] {
            ::setenv("ZR_CONFIG", config_.c_str(), 1);
            for (const auto& [name, value] : variables_) {
                ::setenv(name.c_str(), value.c_str(), 1);
            }
            ::dup2(::open(errors_.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0600), STDERR_FILENO);
            std::vector<std::string> words = orders;
            words.insert(words.begin(), TKLOGGER_PROBE);
            std::vector<char*> arguments;
            for (std::string& word : words) {
                arguments.push_back(word.data());
            }
            arguments.push_back(nullptr);
            ::execv(TKLOGGER_PROBE, arguments.data());
            return std::string("cannot run the probe");
        });
        EXPECT_EQ(result, (ChildResult{"", 0, 0}));
    }

    static Messages messagesIn(const std::string& path) {
        Messages messages;
        for (const LogRecord& record : parseLog(readFile(path))) {
            messages.push_back(record.message);
        }
        return messages;
    }

    ZR::Testing::TemporaryDirectory directory_;
    std::string config_ = directory_ / "platform.conf";
    std::string errors_ = directory_ / "errors";
    std::string log_ = directory_ / "log";
    std::map<std::string, std::string> variables_;
};

TEST_F(TKLoggerProcessTest, SettingsOfTheFileAreInForceFromTheFirstLine) {
    writeFile(config_,
              "LOG_SINK=stderr\nLOG_LEVEL=4000\nTRACE_SINK=file:" + log_ + "\nTRACE_LEVEL=3000\n");
    run({"log:3999:1:no", "log:4000:1:yes", "trace:2999:1:no", "trace:3000:1:yes"});
    EXPECT_EQ(messagesIn(errors_), Messages{"yes 0"});
    EXPECT_EQ(messagesIn(log_), Messages{"yes 0"});
}

TEST_F(TKLoggerProcessTest, VariablesOverrideTheFile) {
    writeFile(config_, "LOG_SINK=none\nLOG_LEVEL=6000\n");
    variables_ = {{"ZR_LOG_SINK", "stderr"}, {"ZR_LOG_LEVEL", "1"}};
    run({"log:1:1:yes"});
    EXPECT_EQ(messagesIn(errors_), Messages{"yes 0"});
}

TEST_F(TKLoggerProcessTest, FirstLineMayBeOneThatIsDiscarded) {
    writeFile(config_, "LOG_SINK=stderr\nLOG_LEVEL=6000\nTRACE_SINK=none\n");
    run({"trace:6000:1:no", "log:-2147483648:1:no", "log:6000:1:yes"});
    EXPECT_EQ(messagesIn(errors_), Messages{"yes 0"});
}

TEST_F(TKLoggerProcessTest, DiagnosticsAreWrittenFirstOfAll) {
    writeFile(config_, "LOG_SINK=stderr\nTRACE_LEVEL=high\nLOGLEVEL=1\n");
    run({"log:6000:2:line"});
    EXPECT_EQ(messagesIn(errors_),
              (Messages{config_ + ":2: TRACE_LEVEL=\"high\": not a level (a number from 0)",
                        config_ + ":3: LOGLEVEL=\"1\": no such setting", "line 0", "line 1"}));
    const LogRecord diagnostic = parseLog(readFile(errors_)).at(0);
    EXPECT_EQ(diagnostic.level, 6000);
    EXPECT_EQ(diagnostic.category, "ZR.Platform");
}

TEST_F(TKLoggerProcessTest, DiagnosticsAreWrittenEvenWhenTheFirstLineIsForTheTrace) {
    writeFile(config_, "LOG_SINK=stderr\nTRACE_LEVEL=high\n");
    run({"trace:1:1:discarded", "log:6000:1:line"});
    EXPECT_EQ(
        messagesIn(errors_),
        (Messages{config_ + ":2: TRACE_LEVEL=\"high\": not a level (a number from 0)", "line 0"}));
}

TEST_F(TKLoggerProcessTest, DiagnosticsFollowTheLevelOfTheLog) {
    writeFile(config_, "LOG_SINK=stderr\nLOG_LEVEL=6001\nTRACE_LEVEL=high\n");
    run({"log:6001:1:line"});
    EXPECT_EQ(messagesIn(errors_), Messages{"line 0"});
}

TEST_F(TKLoggerProcessTest, ProcessThatSaysNothingWritesNoDiagnostics) {
    writeFile(config_, "LOG_SINK=stderr\nTRACE_LEVEL=high\n");
    run({});
    EXPECT_EQ(readFile(errors_), "");
}

TEST_F(TKLoggerProcessTest, LinesOfSeveralProcessesNeverMixAndNoneIsLost) {
    writeFile(config_, "LOG_SINK=file:" + log_ + "\nLOG_LEVEL=0\n");
    constexpr int processes = 4;
    constexpr int linesOfProcess = 1000;
    std::vector<std::thread> runners;
    for (int id = 0; id < processes; ++id) {
        runners.emplace_back([this, id] {
            run({"log:1:" + std::to_string(linesOfProcess) + ":" + std::string(200, 'x') +
                 " process" + std::to_string(id)});
        });
    }
    for (std::thread& runner : runners) {
        runner.join();
    }
    std::map<std::string, int> next;
    for (const std::string& message : messagesIn(log_)) {
        const std::size_t number = message.rfind(' ');
        const std::string process = message.substr(0, number);
        EXPECT_EQ(message.substr(number + 1), std::to_string(next[process]++)) << process;
    }
    EXPECT_EQ(next.size(), static_cast<std::size_t>(processes));
    for (const auto& [process, count] : next) {
        EXPECT_EQ(count, linesOfProcess) << process;
    }
}

TEST_F(TKLoggerProcessTest, LineThatComesAfterTheServiceIsDiscarded) {
    // A static object's destructor may still have something to say.
    writeFile(config_, "LOG_SINK=stderr\nTRACE_SINK=stderr\nLOG_LEVEL=0\nTRACE_LEVEL=0\n");
    run({"log:1:1:line", "trace:1:1:line", "late:6000:too late"});
    EXPECT_EQ(messagesIn(errors_), (Messages{"line 0", "line 0"}));
}

TEST_F(TKLoggerProcessTest, ServiceMayBeUsedForTheFirstTimeAtTheVeryEnd) {
    writeFile(config_, "LOG_SINK=stderr\nLOG_LEVEL=0\n");
    run({"late:6000:just in time"});
    EXPECT_EQ(messagesIn(errors_), Messages{"just in time"});
}

}  // namespace

}  // namespace TKLog
