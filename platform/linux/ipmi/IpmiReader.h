#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "ipmi/IpmiConversation.h"
#include "ipmi/IpmiTransport.h"
#include "ipmi/ServiceProcessor.h"

namespace ZR::Live {

/// Knows the service processor, as far as that is possible without ever waiting for
/// it: a question of one call is answered at a later one. At first the processor is
/// there without its LAN channel, therefore; and a change of its address shows at
/// the second call that is more than a minute after the last question.
///
/// At most once a minute it is asked, and it is looked whether the machine has one at
/// all. Answers that fail to come leave what was known; the third time in a row the
/// LAN channel counts as unknown. Used by one thread at a time.
class IpmiReader {
  public:
    using Clock = std::function<std::chrono::steady_clock::time_point()>;

    static constexpr std::chrono::minutes interval{1};
    static constexpr int toleratedFailures = 2;

    /// `clock` never goes back.
    explicit IpmiReader(std::unique_ptr<IpmiTransport> transport,
                        Clock clock = std::chrono::steady_clock::now);

    /// Whether there is something that the last read() did not give. Does what can be
    /// done at once: one system call while answers are awaited, none otherwise but
    /// once a minute.
    [[nodiscard]] bool changed();

    /// Whether questions are out that may still be answered.
    [[nodiscard]] bool awaiting() const noexcept { return conversation_.has_value(); }

    /// What is known; nullopt when the machine has no service processor. Adds what
    /// stands in the way of knowing more.
    [[nodiscard]] std::optional<ServiceProcessor> read(std::vector<std::string>& diagnostics);

  private:
    struct Knowledge {
        std::optional<ServiceProcessor> processor;
        std::vector<std::string> diagnostics;

        bool operator==(const Knowledge&) const = default;
    };

    void advance();
    void begin(std::chrono::steady_clock::time_point now);
    void settle();
    void fail(std::vector<std::string> diagnostics);

    std::unique_ptr<IpmiTransport> transport_;
    Clock clock_;
    long lastId_ = 0;
    std::optional<IpmiConversation> conversation_;
    std::optional<std::chrono::steady_clock::time_point> due_;  // nullopt: at once
    Knowledge known_;
    Knowledge given_;
    int failures_ = 0;  // in a row
};

}  // namespace ZR::Live
