#include "ipmi/IpmiConversation.h"

#include <array>
#include <cerrno>
#include <utility>
#include <variant>

#include "formats/Files.h"

namespace ZR::Live {
namespace {

// Stands for the channel over which the request comes, whatever its number. The numbers
// below 0xC are those that a medium can be assigned to (IPMI 2.0, table 6-1).
constexpr std::uint8_t presentChannel = 0xE;
constexpr std::array<std::uint8_t, 12> channels{1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, presentChannel};

// More messages than there are requests. What comes beyond is taken at the next call, so
// that a flood of messages cannot keep a caller here.
constexpr int mostMessages = 64;

}  // namespace

IpmiConversation::IpmiConversation(IpmiTransport& transport, long& lastId, std::uint8_t expected,
                                   Time now)
    : transport_(transport), lastId_(lastId), begun_(now), missed_(now), channel_(expected) {
    begin(Round::Expected, now);
}

IpmiConversation::State IpmiConversation::continue_(Time now) {
    for (int i = 0; i < mostMessages && state_ == State::Underway; ++i) {
        const IpmiReceived received = transport_.receive();
        if (received.error == EAGAIN) {
            break;
        }
        if (received.error != 0) {
            fail("cannot receive: " + reasonOf(received.error));
            break;
        }
        // A message with another number is not for this conversation, or is a second
        // response to one request.
        if (const auto request = open_.extract(received.id)) {
            take(request.mapped(), received.response);
            if (open_.empty()) {
                endRound(now);
            }
        }
    }
    if (state_ == State::Underway) {
        checkPatience(now);
    }
    return state_;
}

void IpmiConversation::begin(Round round, Time now) {
    waited_ += missed_ - begun_;
    begun_ = now;
    missed_ = now;
    round_ = round;
    if (round == Round::Search) {
        for (const std::uint8_t channel : channels) {
            if (channel != channel_) {
                ask(Topic::Channel, channel);
            }
        }
        return;
    }
    if (round == Round::Expected) {
        ask(Topic::Channel, channel_);
    }
    ask(Topic::AddressSource, channel_);
    ask(Topic::Address, channel_);
}

void IpmiConversation::ask(Topic topic, std::uint8_t channel) {
    if (state_ != State::Underway) {
        return;
    }
    IpmiRequest request;
    switch (topic) {
        case Topic::Channel:
            request = getChannelInfo(channel);
            break;
        case Topic::Address:
            request = getLanAddress(channel);
            break;
        case Topic::AddressSource:
            request = getLanAddressSource(channel);
            break;
    }
    const long id = ++lastId_;
    if (const int error = transport_.send(id, request); error != 0) {
        fail("cannot ask: " + reasonOf(error));
        return;
    }
    open_.emplace(id, OpenRequest{topic, channel});
}

void IpmiConversation::take(const OpenRequest& request, const IpmiResponse& response) {
    switch (request.topic) {
        case Topic::Address:
            address_ = decodeLanAddress(response);
            break;
        case Topic::AddressSource:
            addressSource_ = decodeLanAddressSource(response);
            break;
        case Topic::Channel: {
            const auto decoded = decodeChannelInfo(response);
            // A channel that does not exist is refused, by a code of the maker's choice.
            if (const auto* const refusal = std::get_if<IpmiRefusal>(&decoded)) {
                if (refusal->passing()) {
                    passing_ = *refusal;
                }
            } else if (const auto& info = std::get<ChannelInfo>(decoded); info.isLan()) {
                // A response about another channel than the request's tells nothing.
                if (info.channel == request.channel || request.channel == presentChannel) {
                    lanChannels_.emplace(request.channel, info.channel);
                }
            }
            break;
        }
    }
}

void IpmiConversation::endRound(Time now) {
    if (round_ == Round::Found) {
        conclude(channel_);
    } else if (!lanChannels_.empty()) {
        const std::uint8_t channel = lanChannels_.begin()->second;
        if (round_ == Round::Expected) {
            conclude(channel);
        } else {
            channel_ = channel;
            begin(Round::Found, now);
        }
    } else if (round_ == Round::Expected) {
        begin(Round::Search, now);
    } else if (passing_) {
        fail("channels: " + passing_->reason);
    } else {
        state_ = State::Finished;
    }
}

/// Where one parameter is not usable, the other and the channel itself still count.
void IpmiConversation::conclude(std::uint8_t channel) {
    LanChannel lan{.channel = channel, .addressSource = std::nullopt, .address = {}};
    const auto take = [this](auto& decoded, auto& value, const char* subject) {
        auto* const refusal = std::get_if<IpmiRefusal>(&*decoded);
        if (refusal == nullptr) {
            value = std::get<0>(*std::move(decoded));
        } else if (refusal->passing()) {
            fail(subject + (": " + refusal->reason));
        } else if (!refusal->unsupported()) {
            diagnostics_.push_back(subject + (": " + refusal->reason));
        }
    };
    take(addressSource_, lan.addressSource, "address source");
    if (state_ == State::Underway) {
        take(address_, lan.address, "address");
    }
    if (state_ == State::Underway) {
        lan_ = lan;
        state_ = State::Finished;
    }
}

void IpmiConversation::checkPatience(Time now) {
    missed_ = now;
    if (waited_ + (missed_ - begun_) > patience) {
        fail("no response within one second");
    }
}

void IpmiConversation::fail(const std::string& reason) {
    state_ = State::Failed;
    diagnostics_.assign(1, reason);
}

}  // namespace ZR::Live
