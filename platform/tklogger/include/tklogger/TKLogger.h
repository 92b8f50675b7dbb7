#pragma once

#include <atomic>
#include <climits>
#include <string>
#include <string_view>

namespace TKLog {

/// Where one of the two channels of the service leads, and from which level on.
struct Channel {
    int level = 0;     ///< lines of this level or above are kept
    std::string sink;  ///< none, stderr, syslog or file:PATH

    bool operator==(const Channel&) const = default;
};

/// The logging service: two channels, log and trace, that keep or discard each line
/// by its level. Set up from the platform settings when the first line arrives,
/// after which what is wrong with the settings is written first of all.
///
/// All operations are safe on any thread and never throw. A discarded line costs
/// one relaxed atomic load. A kept one is written whole by one call, so that
/// lines of concurrent threads and processes never mix.
class TKLogger {
  public:
    /// One line for the log. `file` is a source path without its extension,
    /// `category` names the part of the system. The null text and the two zeros
    /// have no meaning to this service.
    static void logLevelMessage(const char* file, const char* function, unsigned line,
                                const std::string& category, int level, const char* text, int a,
                                int b, std::string_view message) noexcept {
        if (level >= logThreshold.load(std::memory_order_relaxed)) {
            keepLog({file, function, line, category, level, message});
        }
        static_cast<void>(text), static_cast<void>(a), static_cast<void>(b);
    }

    /// The same for the trace.
    static void traceLevelMessage(const char* file, const char* function, unsigned line,
                                  const std::string& category, int level, const char* text, int a,
                                  int b, std::string_view message) noexcept {
        if (level >= traceThreshold.load(std::memory_order_relaxed)) {
            keepTrace({file, function, line, category, level, message});
        }
        static_cast<void>(text), static_cast<void>(a), static_cast<void>(b);
    }

    /// Sets up both channels anew, in place of the platform settings.
    static void configure(const Channel& log, const Channel& trace) noexcept;

    /// One line on its way to a sink. Borrows everything for the call.
    struct Line {
        const char* file;
        const char* function;
        unsigned line;
        std::string_view category;
        int level;
        std::string_view message;
    };

  private:
    static void keepLog(const Line& line) noexcept;
    static void keepTrace(const Line& line) noexcept;

    // INT_MIN until the service is set up: the first line, whatever its level,
    // then takes the slow path, which sets it up.
    static inline std::atomic<int> logThreshold{INT_MIN};
    static inline std::atomic<int> traceThreshold{INT_MIN};

    friend class Service;
};

}  // namespace TKLog
