#pragma once

#include <unistd.h>

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "formats/Files.h"
#include "ipmi/IpmiConversation.h"
#include "ipmi/IpmiDevice.h"
#include "ipmi/IpmiTransport.h"
#include "ipmi/ServiceProcessor.h"
#include "zrclient/Diagnostic.h"

namespace ZR::Live {

/// Knows the service processor, as far as that is possible without ever waiting for
/// it: the response to a request of one call is taken at a later one. At first, therefore,
/// the processor is there without its LAN channel; and a change of its address shows at
/// the second call that is more than a minute after the last request.
///
/// The processor is asked at most once a minute; whether the machine has one is looked at
/// equally often. Where responses are missing, what was known stays; after the third time
/// in a row the LAN channel counts as unknown. Used by one thread at a time.
class IpmiReader {
  public:
    using Clock = std::function<std::chrono::steady_clock::time_point()>;

    static constexpr std::chrono::minutes interval{1};
    static constexpr int toleratedFailures = 2;

    /// `clock` never goes back.
    explicit IpmiReader(std::unique_ptr<IpmiTransport> transport,
                        Clock clock = std::chrono::steady_clock::now);

    /// Whether there is something that the last read() did not give. Does what can be
    /// done at once: one system call while responses are awaited, otherwise none, except
    /// once a minute.
    [[nodiscard]] bool changed();

    /// Whether requests are out whose responses may still come.
    [[nodiscard]] bool awaiting() const noexcept { return conversation_.has_value(); }

    /// How long until changed() may have something to do again.
    [[nodiscard]] std::chrono::steady_clock::duration rest() const;

    /// What is known; nullopt when the machine has no service processor. Adds the reasons
    /// why no more is known to the diagnostics.
    [[nodiscard]] std::optional<ServiceProcessor> read(std::vector<Diagnostic>& diagnostics);

  private:
    struct Knowledge {
        std::optional<ServiceProcessor> processor;
        std::vector<Diagnostic> diagnostics;

        bool operator==(const Knowledge&) const = default;
    };

    void advance();
    void begin(std::chrono::steady_clock::time_point now);
    void settle();
    void fail(const std::vector<std::string>& reasons);

    std::unique_ptr<IpmiTransport> transport_;
    Clock clock_;
    long lastId_ = 0;
    std::optional<IpmiConversation> conversation_;
    std::optional<std::chrono::steady_clock::time_point> due_;  // nullopt: at once
    Knowledge known_;
    Knowledge given_;
    int failures_ = 0;  // in a row
};

/// In its place in a build that does not read service processors.
class NoIpmiReader {
  public:
    explicit NoIpmiReader(Roots roots) : roots_(std::move(roots)) {}

    [[nodiscard]] static bool changed() noexcept { return false; }
    [[nodiscard]] static bool awaiting() noexcept { return false; }
    [[nodiscard]] static std::chrono::steady_clock::duration rest() noexcept {
        return std::chrono::hours{1};
    }
    /// Always nullopt; with a note where the machine has one.
    [[nodiscard]] std::optional<ServiceProcessor> read(std::vector<Diagnostic>& diagnostics) const {
        for (const std::string_view device : ipmiDevices) {
            const std::string path = roots_.path(device);
            if (::access(path.c_str(), F_OK) == 0) {
                diagnostics.emplace_back(
                    "this build does not read service processors, and there is " + path,
                    Diagnostic::Kind::Note);
            }
        }
        return std::nullopt;
    }

  private:
    Roots roots_;
};

}  // namespace ZR::Live
