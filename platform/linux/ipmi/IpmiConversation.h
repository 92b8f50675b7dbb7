#pragma once

#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "ipmi/IpmiTransport.h"
#include "ipmi/ServiceProcessor.h"

namespace ZR::Live {

/// Asks a service processor for its LAN channel, and for the address of that channel and
/// the source of the address. Never waits: every continue_() does what can be done at once.
///
/// continue_() may be called rarely, so that the requests are sent in few rounds: all
/// three of the channel where LAN is expected; if LAN is not there, one for each other
/// channel; then the two that are left, of the channel that was found.
///
/// It is given up after one second of waiting in all. Waiting is measured at the calls of
/// continue_() which find that a response is still missing: a response that is there at
/// the first call after it came is never late, however long ago the request was sent.
class IpmiConversation {
  public:
    using Time = std::chrono::steady_clock::time_point;
    enum class State : std::uint8_t { Underway, Finished, Failed };

    static constexpr std::chrono::seconds patience{1};
    static constexpr std::uint8_t usualChannel = 1;

    /// Sends the first requests. `transport` is open, and stays so as long as this;
    /// `lastId` is the last number of a request on it, and is counted on.
    IpmiConversation(IpmiTransport& transport, long& lastId, std::uint8_t expected, Time now);

    /// Takes the responses that have come, and sends what is to be sent next.
    State continue_(Time now);

    [[nodiscard]] State state() const noexcept { return state_; }

    /// Once finished: the LAN channel, nullopt when there is none.
    [[nodiscard]] const std::optional<LanChannel>& lan() const noexcept { return lan_; }

    /// Once failed: why. Once finished: which responses were not usable.
    [[nodiscard]] const std::vector<std::string>& diagnostics() const noexcept {
        return diagnostics_;
    }

  private:
    enum class Round : std::uint8_t { Expected, Search, Found };
    enum class Topic : std::uint8_t { Channel, Address, AddressSource };
    struct OpenRequest {
        Topic topic{};
        std::uint8_t channel = 0;
    };

    void begin(Round round, Time now);
    void ask(Topic topic, std::uint8_t channel);
    void take(const OpenRequest& request, const IpmiResponse& response);
    void endRound(Time now);
    void conclude(std::uint8_t channel);
    void checkPatience(Time now);
    void fail(const std::string& reason);

    IpmiTransport& transport_;
    long& lastId_;
    State state_ = State::Underway;
    Round round_ = Round::Expected;
    std::map<long, OpenRequest> open_;  // by the number of the request
    Time begun_;                        // when the requests of this round were sent
    Time missed_;                       // when a response to one of them was last missing
    std::chrono::steady_clock::duration waited_{};      // in earlier rounds
    std::uint8_t channel_;                              // that is asked about, or was expected
    std::map<std::uint8_t, std::uint8_t> lanChannels_;  // by the number asked for
    std::optional<IpmiRefusal> passing_;  // why the channels that were heard may not be all
    std::optional<IpmiDecoded<std::optional<IpAddress>>> address_;
    std::optional<IpmiDecoded<std::uint8_t>> addressSource_;
    std::optional<LanChannel> lan_;
    std::vector<std::string> diagnostics_;
};

}  // namespace ZR::Live
