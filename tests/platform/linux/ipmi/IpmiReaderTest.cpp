#include "ipmi/IpmiReader.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "LinuxSupport.h"
#include "ScriptedProcessor.h"
#include "kit/Diagnostics.h"

namespace ZR::Live {
namespace {

using namespace std::chrono_literals;
using testing::ElementsAre;
using testing::IsEmpty;

const ServiceProcessor knownProcessor{.lan = LanChannel{1, std::uint8_t{2}, "198.51.100.77"_ip}};

class IpmiReaderTest : public testing::Test {
  protected:
    std::optional<ServiceProcessor> read() {
        diagnostics_.clear();
        return reader_.read(diagnostics_);
    }
    /// What is known once the responses to the requests of this moment have come.
    std::optional<ServiceProcessor> settled() {
        static_cast<void>(reader_.changed());
        return read();
    }

    ScriptedProcessor processor_ = ScriptedProcessor::withLan(1, 2, leased);
    std::chrono::steady_clock::time_point now_{1000h};
    std::vector<ZR::Diagnostic> diagnostics_;
    IpmiReader reader_{std::make_unique<ScriptedIpmi>(processor_), [this] { return now_; }};
};

TEST_F(IpmiReaderTest, WithoutADeviceThereIsNoProcessor) {
    processor_.openError = ENOENT;
    EXPECT_FALSE(reader_.changed());
    EXPECT_EQ(read(), std::nullopt);
    EXPECT_THAT(ZR::Testing::textsOf(diagnostics_), IsEmpty());
    EXPECT_EQ(processor_.opened, 1);
    EXPECT_EQ(processor_.received, 0);
}

TEST_F(IpmiReaderTest, TheProcessorIsThereAtOnceAndItsChannelLater) {
    EXPECT_EQ(read(), ServiceProcessor{});
    EXPECT_TRUE(reader_.changed());
    EXPECT_TRUE(reader_.changed()) << "until it was read";
    EXPECT_EQ(read(), knownProcessor);
    EXPECT_FALSE(reader_.changed());
    EXPECT_FALSE(processor_.isOpen) << "nothing stays open in between";
}

TEST_F(IpmiReaderTest, TellsWhetherResponsesAreAwaited) {
    EXPECT_FALSE(reader_.awaiting()) << "nothing was asked yet";
    EXPECT_EQ(read(), ServiceProcessor{});
    EXPECT_TRUE(reader_.awaiting());
    EXPECT_EQ(settled(), knownProcessor);
    EXPECT_FALSE(reader_.awaiting());
}

TEST_F(IpmiReaderTest, IsAskedAtMostOnceAMinute) {
    EXPECT_EQ(settled(), knownProcessor);
    const auto calls = processor_.asked.size();
    processor_.parameter(1, 3, {192, 0, 2, 7});
    const int received = processor_.received;
    now_ += 59s;
    for (int i = 0; i < 100; ++i) {
        EXPECT_FALSE(reader_.changed());
    }
    EXPECT_EQ(processor_.asked.size(), calls);
    EXPECT_EQ(processor_.received, received) << "nor is the transport touched";
    now_ += 1s;
    EXPECT_FALSE(reader_.changed()) << "asked, and no response yet";
    EXPECT_EQ(processor_.asked.size(), 2 * calls);
    EXPECT_TRUE(reader_.changed());
    EXPECT_EQ(read()->lan->address, "192.0.2.7"_ip);
}

TEST_F(IpmiReaderTest, AMachineWithoutADeviceIsLookedAtOnceAMinuteToo) {
    processor_.openError = ENOENT;
    for (int i = 0; i < 120; ++i) {
        static_cast<void>(reader_.changed());
        now_ += 1s;
    }
    EXPECT_EQ(processor_.opened, 2);
    processor_.openError = 0;
    EXPECT_TRUE(reader_.changed()) << "its driver was loaded";
    EXPECT_EQ(settled(), knownProcessor);
}

TEST_F(IpmiReaderTest, AnUnchangedResponseIsNotAChange) {
    EXPECT_EQ(settled(), knownProcessor);
    for (int i = 0; i < 5; ++i) {
        now_ += 1min;
        EXPECT_FALSE(reader_.changed());
        EXPECT_FALSE(reader_.changed());
    }
    EXPECT_EQ(processor_.opened, 6);
}

TEST_F(IpmiReaderTest, RareCallsTakeTheOldResponsesAndAskAnew) {
    EXPECT_EQ(read(), ServiceProcessor{});
    now_ += 1h;
    EXPECT_EQ(read(), knownProcessor);
    EXPECT_EQ(processor_.opened, 2);
    processor_.parameter(1, 3, {192, 0, 2, 7});
    now_ += 1h;
    EXPECT_EQ(read(), knownProcessor) << "what was true an hour ago";
    now_ += 1h;
    EXPECT_EQ(read()->lan->address, "192.0.2.7"_ip);
}

TEST_F(IpmiReaderTest, SilenceLeavesWhatWasKnownUntilTheThirdTime) {
    EXPECT_EQ(settled(), knownProcessor);
    processor_.silent = true;
    for (int failure = 1; failure <= 2; ++failure) {
        now_ += 1min;
        static_cast<void>(reader_.changed());
        now_ += 2s;
        EXPECT_EQ(read(), knownProcessor) << failure;
        EXPECT_THAT(ZR::Testing::textsOf(diagnostics_),
                    ElementsAre("service processor: no response within one second"));
    }
    now_ += 1min;
    static_cast<void>(reader_.changed());
    now_ += 2s;
    EXPECT_TRUE(reader_.changed());
    EXPECT_EQ(read(), ServiceProcessor{});
    processor_.silent = false;
    now_ += 1min;
    static_cast<void>(reader_.changed());
    EXPECT_EQ(settled(), knownProcessor);
    EXPECT_THAT(ZR::Testing::textsOf(diagnostics_), IsEmpty());
}

TEST_F(IpmiReaderTest, OneResponseMakesUpForFailures) {
    EXPECT_EQ(settled(), knownProcessor);
    for (int i = 0; i < 5; ++i) {
        for (const bool silent : {true, true, false}) {
            processor_.silent = silent;
            now_ += 1min;
            static_cast<void>(reader_.changed());
            now_ += 2s;
            EXPECT_EQ(read(), knownProcessor);
        }
    }
}

TEST_F(IpmiReaderTest, ANewDiagnosticIsAChangeAndALastingOneIsNot) {
    processor_.silent = true;
    EXPECT_EQ(read(), ServiceProcessor{});
    now_ += 2s;
    EXPECT_TRUE(reader_.changed());
    EXPECT_EQ(read(), ServiceProcessor{});
    EXPECT_EQ(diagnostics_.size(), 1U);
    now_ += 1min;
    EXPECT_FALSE(reader_.changed());
    now_ += 2s;
    EXPECT_FALSE(reader_.changed());
}

TEST_F(IpmiReaderTest, ADeviceThatMayNotBeOpenedIsAProcessorOfWhichNothingIsKnown) {
    processor_.openError = EACCES;
    EXPECT_EQ(read(), ServiceProcessor{});
    EXPECT_THAT(ZR::Testing::textsOf(diagnostics_),
                ElementsAre("service processor: cannot open: Permission denied"));
    EXPECT_FALSE(reader_.changed());
    EXPECT_TRUE(processor_.asked.empty());
}

TEST_F(IpmiReaderTest, ADeviceThatTakesNoRequestsIsAskedAgainNextMinute) {
    processor_.sendError = ENOTTY;
    EXPECT_EQ(read(), ServiceProcessor{});
    EXPECT_EQ(diagnostics_.size(), 1U);
    EXPECT_FALSE(processor_.isOpen);
    processor_.sendError = 0;
    EXPECT_FALSE(reader_.changed());
    now_ += 1min;
    static_cast<void>(reader_.changed());
    EXPECT_EQ(settled(), knownProcessor);
}

TEST_F(IpmiReaderTest, ADeviceThatGoesTakesTheProcessorAlong) {
    EXPECT_EQ(settled(), knownProcessor);
    processor_.openError = ENOENT;
    now_ += 1min;
    EXPECT_TRUE(reader_.changed());
    EXPECT_EQ(read(), std::nullopt);
}

TEST_F(IpmiReaderTest, WhereTheChannelWasItIsAskedForFirst) {
    processor_ = ScriptedProcessor::withLan(8, 1, leased);
    EXPECT_EQ(settled()->lan->channel, 8);
    const auto calls = processor_.asked.size();
    now_ += 1min;
    static_cast<void>(reader_.changed());
    EXPECT_EQ(settled()->lan->channel, 8);
    EXPECT_EQ(processor_.asked.size(), calls + 3);
    EXPECT_EQ(processor_.asked.at(calls).second, getChannelInfo(8));
}

}  // namespace
}  // namespace ZR::Live
