#pragma once

#include <mutex>
#include <string>
#include <string_view>

#include "tklogger/TKLogger.h"
#include "zrcommon/UniqueFd.h"

namespace TKLog {

/// Where the lines of one channel go. Safe on any thread.
class LogSink {
  public:
    /// "none", "stderr", "syslog" or "file:PATH"; anything else counts as "none".
    explicit LogSink(std::string_view name);

    [[nodiscard]] bool keepsNothing() const noexcept { return kind_ == Kind::none; }

    void write(const TKLogger::Line& line);

  private:
    enum class Kind { none, standardError, syslog, file };

    void writeFile(const TKLogger::Line& line);
    [[nodiscard]] bool isStillNamed() const;

    Kind kind_ = Kind::none;
    std::string path_;
    std::mutex mutex_;  // guards the descriptor, not the write: one write is whole by itself
    ZR::UniqueFd fd_;
    bool failed_ = false;
};

}  // namespace TKLog
