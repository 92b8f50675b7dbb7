#include "ipmi/IpmiReader.h"

#include <cerrno>
#include <iterator>
#include <system_error>
#include <utility>

namespace ZR::Live {

IpmiReader::IpmiReader(std::unique_ptr<IpmiTransport> transport, Clock clock)
    : transport_(std::move(transport)), clock_(std::move(clock)) {}

bool IpmiReader::changed() {
    advance();
    return known_ != given_;
}

std::optional<ServiceProcessor> IpmiReader::read(std::vector<std::string>& complaints) {
    advance();
    given_ = known_;
    complaints.insert(complaints.end(), known_.complaints.begin(), known_.complaints.end());
    return known_.processor;
}

void IpmiReader::advance() {
    const auto now = clock_();
    if (conversation_ && conversation_->continue_(now) != IpmiConversation::State::Underway) {
        settle();
    }
    if (!conversation_ && (!due_ || now >= *due_)) {
        begin(now);
    }
}

void IpmiReader::begin(std::chrono::steady_clock::time_point now) {
    due_ = now + interval;
    const int error = transport_->open();
    if (error == ENOENT) {
        known_ = {};
        failures_ = 0;
        return;
    }
    if (!known_.processor) {
        known_.processor.emplace();
    }
    if (error != 0) {
        fail({"cannot open: " + std::generic_category().message(error)});
        return;
    }
    // Where the channel was, it will be.
    const std::uint8_t expected =
        known_.processor->lan ? known_.processor->lan->channel : IpmiConversation::usualChannel;
    conversation_.emplace(*transport_, lastId_, expected, now);
    if (conversation_->state() != IpmiConversation::State::Underway) {
        settle();
    }
}

void IpmiReader::settle() {
    if (conversation_->state() == IpmiConversation::State::Failed) {
        fail(conversation_->complaints());
    } else {
        failures_ = 0;
        known_ = {.processor = ServiceProcessor{conversation_->lan()}, .complaints = {}};
        for (const std::string& complaint : conversation_->complaints()) {
            known_.complaints.push_back("service processor: " + complaint);
        }
    }
    conversation_.reset();
    transport_->close();
}

void IpmiReader::fail(std::vector<std::string> complaints) {
    known_.complaints.clear();
    for (std::string& complaint : complaints) {
        known_.complaints.push_back("service processor: " + std::move(complaint));
    }
    if (++failures_ > toleratedFailures) {
        known_.processor->lan.reset();
    }
}

}  // namespace ZR::Live
