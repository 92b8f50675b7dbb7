#include "tklogger/TKLogger.h"

#include <algorithm>
#include <atomic>
#include <memory>
#include <mutex>

#include "LogSink.h"
#include "zrcommon/LogLevel.h"
#include "zrcommon/PlatformSettings.h"

namespace TKLog {

/// The state behind TKLogger. One per process (per library, when linked into one).
class Service {
  public:
    static Service& instance() {
        static Service service;
        return service;
    }

    Service() = default;
    Service(const Service&) = delete;
    Service& operator=(const Service&) = delete;

    /// At the end of the process, or of the library, other objects may still log. Their
    /// lines are discarded, since the sinks are gone.
    ~Service() {
        TKLogger::logThreshold.store(INT_MAX, std::memory_order_relaxed);
        TKLogger::traceThreshold.store(INT_MAX, std::memory_order_relaxed);
    }

    void keep(const TKLogger::Line& line, const std::atomic<int>& threshold,
              std::shared_ptr<LogSink> Service::*sink) {
        std::call_once(setUp_, [this] { setUpFromSettings(); });
        // Once set up, the threshold decides about the line that came first, too.
        if (line.level < threshold.load(std::memory_order_relaxed)) {
            return;
        }
        std::shared_ptr<LogSink> target;
        {
            const std::lock_guard lock(mutex_);
            target = this->*sink;
        }
        if (target) {
            target->write(line);
        }
    }

    void configure(const Channel& log, const Channel& trace) {
        std::call_once(setUp_, [] {});
        apply(log, log_, TKLogger::logThreshold);
        apply(trace, trace_, TKLogger::traceThreshold);
    }

    std::shared_ptr<LogSink> log_;
    std::shared_ptr<LogSink> trace_;

  private:
    // INT_MAX discards everything, since no line has that level; INT_MIN is what
    // a channel holds before it is set up, so none is ever set to it again.
    void apply(const Channel& channel, std::shared_ptr<LogSink>& sink,
               std::atomic<int>& threshold) {
        auto target = std::make_shared<LogSink>(channel.sink);
        const int level = target->keepsNothing() ? INT_MAX : std::max(channel.level, INT_MIN + 1);
        // Both under the lock, so that of two threads that set up a channel at once one wins whole.
        const std::lock_guard lock(mutex_);
        sink = std::move(target);
        threshold.store(level, std::memory_order_relaxed);
    }

    void setUpFromSettings() {
        const ZR::PlatformSettings& settings = ZR::PlatformSettings::process();
        apply({settings.logLevel, settings.logSink}, log_, TKLogger::logThreshold);
        apply({settings.traceLevel, settings.traceSink}, trace_, TKLogger::traceThreshold);
        for (const std::string& diagnostic : settings.diagnostics) {
            constexpr int failure = ZR::LogLevel::failure;
            if (failure >= TKLogger::logThreshold.load(std::memory_order_relaxed)) {
                log_->write({"tklogger/TKLogger", "settings", __LINE__, "ZR.Platform", failure,
                             diagnostic});
            }
        }
    }

    std::once_flag setUp_;
    std::mutex mutex_;  // guards the pointers; a sink in use outlives its replacement
};

// A line that cannot be written for lack of memory is dropped: logging must never
// bring down the process that it reports on.

void TKLogger::keepLog(const Line& line) noexcept {
    try {
        Service::instance().keep(line, logThreshold, &Service::log_);
    } catch (const std::exception&) {  // NOLINT(bugprone-empty-catch)
    }
}

void TKLogger::keepTrace(const Line& line) noexcept {
    try {
        Service::instance().keep(line, traceThreshold, &Service::trace_);
    } catch (const std::exception&) {  // NOLINT(bugprone-empty-catch)
    }
}

void TKLogger::configure(const Channel& log, const Channel& trace) noexcept {
    try {
        Service::instance().configure(log, trace);
    } catch (const std::exception&) {  // NOLINT(bugprone-empty-catch)
    }
}

}  // namespace TKLog
