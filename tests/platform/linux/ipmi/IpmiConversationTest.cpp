#include "ipmi/IpmiConversation.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

#include "LinuxSupport.h"
#include "ScriptedProcessor.h"

namespace ZR::Live {
namespace {

using namespace std::chrono_literals;
using State = IpmiConversation::State;
using testing::ElementsAre;
using testing::IsEmpty;

class IpmiConversationTest : public testing::Test {
  protected:
    void begin(ScriptedProcessor processor) {
        processor_ = std::move(processor);
        ASSERT_EQ(transport_.open(), 0);
        conversation_.emplace(transport_, lastId_, IpmiConversation::usualChannel, now_);
    }
    State later(std::chrono::milliseconds time) {
        now_ += time;
        return conversation_->continue_(now_);
    }
    std::vector<IpmiRequest> asked() const {
        std::vector<IpmiRequest> requests;
        for (const auto& [id, request] : processor_.asked) {
            requests.push_back(request);
        }
        return requests;
    }

    ScriptedProcessor processor_;
    ScriptedIpmi transport_{processor_};
    IpmiConversation::Time now_{1000h};
    long lastId_ = 0;
    std::optional<IpmiConversation> conversation_;
};

TEST_F(IpmiConversationTest, UsualChannelTakesOneRound) {
    begin(ScriptedProcessor::withLan(1, 2, leased));
    EXPECT_EQ(processor_.received, 0) << "no caller waits for responses that cannot be there";
    EXPECT_EQ(later(1ms), State::Finished);
    EXPECT_EQ(conversation_->lan(), (LanChannel{1, std::uint8_t{2}, "198.51.100.77"_ip}));
    EXPECT_THAT(conversation_->diagnostics(), IsEmpty());
    EXPECT_THAT(asked(), ElementsAre(getChannelInfo(1), getLanAddressSource(1), getLanAddress(1)));
}

TEST_F(IpmiConversationTest, AnotherChannelIsFoundAmongAll) {
    ScriptedProcessor processor = ScriptedProcessor::withLan(8, 1, leased);
    processor.channel(1, 5);
    processor.channel(7, 1);
    begin(std::move(processor));
    EXPECT_EQ(later(1ms), State::Finished);
    EXPECT_EQ(conversation_->lan(), (LanChannel{8, std::uint8_t{1}, "198.51.100.77"_ip}));
    EXPECT_THAT(conversation_->diagnostics(), IsEmpty());
    EXPECT_EQ(asked().size(), 3U + 11U + 2U);
}

TEST_F(IpmiConversationTest, OfSeveralChannelsTheFirstCountsInWhateverOrderTheyRespond) {
    ScriptedProcessor processor = ScriptedProcessor::withLan(8, 2, leased);
    processor.channel(3, 4);
    processor.parameter(3, 4, {1});
    processor.parameter(3, 3, {192, 0, 2, 3});
    begin(std::move(processor));
    processor_.silent = true;
    EXPECT_EQ(later(1ms), State::Underway);
    processor_.silent = false;
    // The requests of the search had no response so far: give them now, last first.
    const auto search = processor_.asked;
    for (std::size_t i = search.size(); i-- > 3;) {
        ASSERT_EQ(transport_.send(search[i].first, search[i].second), 0);
    }
    EXPECT_EQ(later(1ms), State::Finished);
    EXPECT_EQ(conversation_->lan(), (LanChannel{3, std::uint8_t{1}, "192.0.2.3"_ip}));
}

TEST_F(IpmiConversationTest, ThePresentChannelIsAskedForByItsOwnNumber) {
    ScriptedProcessor processor = ScriptedProcessor::withLan(0xd, 2, leased);
    processor.responses[{0x06, 0x42, 0x0e}] = processor.responses[{0x06, 0x42, 0x0d}];
    begin(std::move(processor));
    EXPECT_EQ(later(1ms), State::Finished);
    EXPECT_EQ(conversation_->lan(), (LanChannel{0xd, std::uint8_t{2}, "198.51.100.77"_ip}));
}

TEST_F(IpmiConversationTest, AResponseAboutAnotherChannelIsNotBelieved) {
    ScriptedProcessor processor = ScriptedProcessor::withLan(1, 2, leased);
    processor.responses[{0x06, 0x42, 1}][1] = 2;
    begin(std::move(processor));
    EXPECT_EQ(later(1ms), State::Finished);
    EXPECT_EQ(conversation_->lan(), std::nullopt);
}

TEST_F(IpmiConversationTest, NoLanChannelIsAResponseToo) {
    ScriptedProcessor processor;
    processor.channel(1, 1);
    begin(std::move(processor));
    EXPECT_EQ(later(1ms), State::Finished);
    EXPECT_EQ(conversation_->lan(), std::nullopt);
    EXPECT_THAT(conversation_->diagnostics(), IsEmpty());
}

TEST_F(IpmiConversationTest, SourcesOfFirmwareAndOtherProtocols) {
    for (const std::uint8_t source : Bytes{3, 4}) {
        begin(ScriptedProcessor::withLan(1, source, leased));
        EXPECT_EQ(later(1ms), State::Finished);
        EXPECT_EQ(conversation_->lan(), (LanChannel{1, source, "198.51.100.77"_ip}));
    }
}

TEST_F(IpmiConversationTest, DhcpWithoutALease) {
    begin(ScriptedProcessor::withLan(1, 2, {0, 0, 0, 0}));
    EXPECT_EQ(later(1ms), State::Finished);
    EXPECT_EQ(conversation_->lan(), (LanChannel{1, std::uint8_t{2}, std::nullopt}));
}

TEST_F(IpmiConversationTest, AnUnsupportedParameterIsJustNotTold) {
    ScriptedProcessor processor = ScriptedProcessor::withLan(1, 2, leased);
    processor.refuseParameter(1, 4, 0x80);
    begin(std::move(processor));
    EXPECT_EQ(later(1ms), State::Finished);
    EXPECT_EQ(conversation_->lan(), (LanChannel{1, std::nullopt, "198.51.100.77"_ip}));
    EXPECT_THAT(conversation_->diagnostics(), IsEmpty());
}

TEST_F(IpmiConversationTest, OtherRefusalsAndBrokenResponsesAreReported) {
    ScriptedProcessor processor = ScriptedProcessor::withLan(1, 2, leased);
    processor.refuseParameter(1, 4, 0xd4);
    processor.parameter(1, 3, {198, 51});
    begin(std::move(processor));
    EXPECT_EQ(later(1ms), State::Finished);
    EXPECT_EQ(conversation_->lan(), (LanChannel{1, std::nullopt, std::nullopt}));
    EXPECT_THAT(conversation_->diagnostics(), ElementsAre("address source: completion code 0xd4",
                                                          "address: the response is too short"));
}

TEST_F(IpmiConversationTest, ABusyProcessorIsNotOneWithoutALanChannel) {
    ScriptedProcessor busy;
    for (std::uint8_t channel = 0; channel < 16; ++channel) {
        busy.responses[{0x06, 0x42, channel}] = {0xc0};
    }
    begin(std::move(busy));
    EXPECT_EQ(later(1ms), State::Failed);
    EXPECT_THAT(conversation_->diagnostics(), ElementsAre("channels: completion code 0xc0"));
}

TEST_F(IpmiConversationTest, ABusyProcessorsParametersAreNotUnknown) {
    ScriptedProcessor busy = ScriptedProcessor::withLan(1, 2, leased);
    busy.refuseParameter(1, 3, 0xc3);
    begin(std::move(busy));
    EXPECT_EQ(later(1ms), State::Failed);
    EXPECT_EQ(conversation_->lan(), std::nullopt);
    EXPECT_THAT(conversation_->diagnostics(), ElementsAre("address: completion code 0xc3"));
}

TEST_F(IpmiConversationTest, AFailureHasOneReasonWhateverElseCame) {
    ScriptedProcessor busy = ScriptedProcessor::withLan(1, 2, leased);
    busy.refuseParameter(1, 4, 0xc3);
    busy.parameter(1, 3, {198, 51});
    begin(std::move(busy));
    EXPECT_EQ(later(1ms), State::Failed);
    EXPECT_THAT(conversation_->diagnostics(), ElementsAre("address source: completion code 0xc3"));
}

TEST_F(IpmiConversationTest, SilenceIsGivenUpAfterOneSecond) {
    ScriptedProcessor processor;
    processor.silent = true;
    begin(std::move(processor));
    EXPECT_EQ(later(400ms), State::Underway);
    EXPECT_EQ(later(600ms), State::Underway);
    EXPECT_EQ(later(1ms), State::Failed);
    EXPECT_THAT(conversation_->diagnostics(), ElementsAre("no response within one second"));
    EXPECT_EQ(later(1ms), State::Failed) << "and stays so";
}

TEST_F(IpmiConversationTest, OneResponseOfThreeIsNotEnough) {
    begin(ScriptedProcessor::withLan(1, 2, leased));
    processor_.ready.erase(processor_.ready.begin() + 1);
    EXPECT_EQ(later(1ms), State::Underway);
    EXPECT_EQ(later(1000ms), State::Failed);
}

TEST_F(IpmiConversationTest, TheSecondIsForAllRoundsTogether) {
    ScriptedProcessor processor = ScriptedProcessor::withLan(8, 2, leased);
    processor.silent = true;
    begin(std::move(processor));
    EXPECT_EQ(later(600ms), State::Underway);
    processor_.silent = false;
    const auto first = processor_.asked;
    for (const auto& [id, request] : first) {
        ASSERT_EQ(transport_.send(id, request), 0);
    }
    processor_.silent = true;
    EXPECT_EQ(later(0ms), State::Underway) << "now it searches";
    EXPECT_GT(processor_.asked.size(), 2 * first.size());
    EXPECT_EQ(later(400ms), State::Underway);
    EXPECT_EQ(later(1ms), State::Failed);
}

TEST_F(IpmiConversationTest, ResponsesThatWaitedLongForTheirReaderWereNotLate) {
    begin(ScriptedProcessor::withLan(1, 2, leased));
    EXPECT_EQ(later(10min), State::Finished);
    EXPECT_EQ(conversation_->lan(), (LanChannel{1, std::uint8_t{2}, "198.51.100.77"_ip}));
}

TEST_F(IpmiConversationTest, ResponsesComeInAnyOrder) {
    begin(ScriptedProcessor::withLan(1, 2, leased));
    std::reverse(processor_.ready.begin(), processor_.ready.end());
    EXPECT_EQ(later(1ms), State::Finished);
    EXPECT_EQ(conversation_->lan(), (LanChannel{1, std::uint8_t{2}, "198.51.100.77"_ip}));
}

TEST_F(IpmiConversationTest, ForeignMessagesDoNotCount) {
    begin(ScriptedProcessor::withLan(1, 2, leased));
    const IpmiResponse lie{0x0d, 0x02, {0, 0x11, 203, 0, 113, 9}};
    const long last = processor_.ready.back().id;
    processor_.ready.push_front({.id = 0, .response = lie});
    processor_.ready.push_front({.id = -1, .response = lie});
    processor_.ready.push_front({.id = last + 1, .response = lie});
    EXPECT_EQ(later(1ms), State::Finished);
    EXPECT_EQ(conversation_->lan(), (LanChannel{1, std::uint8_t{2}, "198.51.100.77"_ip}));
}

TEST_F(IpmiConversationTest, ASecondResponseToOneRequestDoesNotCount) {
    begin(ScriptedProcessor::withLan(1, 2, leased));
    const IpmiReceived source = processor_.ready.at(1);
    IpmiReceived again = source;
    again.response.data.back() = 1;
    processor_.ready.insert(processor_.ready.begin() + 2, again);
    EXPECT_EQ(later(1ms), State::Finished);
    EXPECT_EQ(conversation_->lan(), (LanChannel{1, std::uint8_t{2}, "198.51.100.77"_ip}));
}

TEST_F(IpmiConversationTest, AFloodOfForeignMessagesKeepsNoCaller) {
    begin(ScriptedProcessor::withLan(1, 2, leased));
    for (int i = 0; i < 1000; ++i) {
        processor_.ready.push_front({.id = 0, .response = {}});
    }
    EXPECT_EQ(later(1ms), State::Underway);
    EXPECT_LE(processor_.received, 64);
    EXPECT_EQ(later(1s), State::Failed);
}

TEST_F(IpmiConversationTest, ARefusingTransportEndsItAtOnce) {
    ScriptedProcessor processor;
    processor.sendError = EINVAL;
    begin(std::move(processor));
    EXPECT_EQ(conversation_->state(), State::Failed);
    EXPECT_THAT(conversation_->diagnostics(), ElementsAre("cannot ask: Invalid argument"));
    EXPECT_EQ(later(1ms), State::Failed);
    EXPECT_EQ(processor_.received, 0);
}

TEST_F(IpmiConversationTest, ATransportThatBreaksEndsIt) {
    ScriptedProcessor processor;
    processor.silent = true;
    processor.receiveError = ENODEV;
    begin(std::move(processor));
    EXPECT_EQ(later(1ms), State::Failed);
    EXPECT_THAT(conversation_->diagnostics(), ElementsAre("cannot receive: No such device"));
}

TEST_F(IpmiConversationTest, NumbersOfRequestsAreNeverUsedAgain) {
    begin(ScriptedProcessor::withLan(1, 2, leased));
    ASSERT_EQ(later(1ms), State::Finished);
    const long last = lastId_;
    begin(ScriptedProcessor::withLan(1, 2, leased));
    EXPECT_EQ(processor_.asked.front().first, last + 1);
}

}  // namespace
}  // namespace ZR::Live
