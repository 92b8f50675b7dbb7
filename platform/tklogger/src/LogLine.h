#pragma once

#include <chrono>
#include <string>

#include "tklogger/TKLogger.h"

namespace TKLog {

/// "TIME LEVEL CATEGORY FILE:LINE FUNCTION MESSAGE" and a line feed. TIME is UTC
/// with microseconds (ISO 8601). Control characters in the message become \n or
/// \xNN, blanks in the fields before it \x20: a message is always one line, and
/// its fields can be told apart.
[[nodiscard]] std::string formatLine(const TKLogger::Line& line,
                                     std::chrono::system_clock::time_point time);

/// The same without TIME, LEVEL and line feed: what syslog is given.
[[nodiscard]] std::string formatSyslog(const TKLogger::Line& line);

}  // namespace TKLog
