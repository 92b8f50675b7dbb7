#include "ipmi/IpmiReader.h"

#include <algorithm>
#include <cerrno>
#include <iterator>
#include <utility>

#include "formats/Files.h"

namespace ZR::Live {

IpmiReader::IpmiReader(std::unique_ptr<IpmiTransport> transport, Clock clock)
    : transport_(std::move(transport)), clock_(std::move(clock)) {}

bool IpmiReader::changed() {
    advance();
    return known_ != given_;
}

std::chrono::steady_clock::duration IpmiReader::rest() const {
    // A conversation is over within some seconds, and begins once a minute at most.
    constexpr std::chrono::milliseconds pause(100);
    using Duration = std::chrono::steady_clock::duration;
    if (conversation_) {
        return pause;
    }
    return due_ ? std::max<Duration>(*due_ - clock_(), pause) : pause;
}

std::optional<ServiceProcessor> IpmiReader::read(std::vector<Diagnostic>& diagnostics) {
    advance();
    given_ = known_;
    diagnostics.insert(diagnostics.end(), known_.diagnostics.begin(), known_.diagnostics.end());
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
        fail({"cannot open: " + reasonOf(error)});
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
        fail(conversation_->diagnostics());
    } else {
        failures_ = 0;
        known_ = {.processor = ServiceProcessor{conversation_->lan()}, .diagnostics = {}};
        for (const std::string& reason : conversation_->diagnostics()) {
            known_.diagnostics.emplace_back("service processor: " + reason);
        }
    }
    conversation_.reset();
    transport_->close();
}

void IpmiReader::fail(const std::vector<std::string>& reasons) {
    known_.diagnostics.clear();
    for (const std::string& reason : reasons) {
        known_.diagnostics.emplace_back("service processor: " + reason);
    }
    if (++failures_ > toleratedFailures) {
        known_.processor->lan.reset();
    }
}

}  // namespace ZR::Live
