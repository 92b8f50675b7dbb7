#pragma once

#include <charconv>
#include <ostream>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "kit/Files.h"
#include "tklogger/TKLogger.h"

namespace ZR::Testing {

/// The fields of one line that the logging service wrote. Those that may hold
/// blanks or control characters are in the escaped form that the line has.
struct LogRecord {
    std::string time;
    int level = 0;
    std::string category;
    std::string file;
    unsigned line = 0;
    std::string function;
    std::string message;

    bool operator==(const LogRecord&) const = default;
};

inline std::ostream& operator<<(std::ostream& out, const LogRecord& record) {
    return out << record.level << ' ' << record.category << ' ' << record.file << ':' << record.line
               << ' ' << record.function << ' ' << record.message;
}

/// Takes a line "TIME LEVEL CATEGORY FILE:LINE FUNCTION MESSAGE" apart. Throws for
/// a line that is not of that form: a torn or mixed line ends the test.
inline LogRecord parseLogLine(std::string_view text) {
    const std::string whole(text);
    const auto field = [&] {
        const std::size_t end = text.find(' ');
        if (end == 0 || end == std::string_view::npos) {
            throw std::runtime_error("not a log line: " + whole);
        }
        const std::string result(text.substr(0, end));
        text.remove_prefix(end + 1);
        return result;
    };
    const auto number = [&](std::string_view digits, auto& value) {
        const char* const end = digits.data() + digits.size();
        const auto result = std::from_chars(digits.data(), end, value);
        if (result.ec != std::errc{} || result.ptr != end) {
            throw std::runtime_error("not a number where one belongs: " + whole);
        }
    };
    LogRecord record;
    record.time = field();
    constexpr std::string_view form = "2026-11-20T08:15:30.123456Z";
    if (record.time.size() != form.size() || record.time.back() != 'Z') {
        throw std::runtime_error("not a time where one belongs: " + whole);
    }
    number(field(), record.level);
    record.category = field();
    const std::string place = field();
    const std::size_t colon = place.rfind(':');
    if (colon == std::string::npos) {
        throw std::runtime_error("no FILE:LINE where one belongs: " + whole);
    }
    record.file = place.substr(0, colon);
    number(std::string_view(place).substr(colon + 1), record.line);
    record.function = field();
    record.message = text;
    return record;
}

/// The lines of a log file; every one of them must end with a line feed.
inline std::vector<LogRecord> parseLog(std::string_view text) {
    std::vector<LogRecord> records;
    while (!text.empty()) {
        const std::size_t end = text.find('\n');
        if (end == std::string_view::npos) {
            throw std::runtime_error("a log line without an end: " + std::string(text));
        }
        records.push_back(parseLogLine(text.substr(0, end)));
        text.remove_prefix(end + 1);
    }
    return records;
}

/// Sends log and trace of this process to files of a test's own. At its end both
/// channels keep nothing.
class LogCapture {
  public:
    explicit LogCapture(int logLevel = 0, int traceLevel = 0) {
        clear();
        TKLog::TKLogger::configure({logLevel, "file:" + logPath_},
                                   {traceLevel, "file:" + tracePath_});
    }
    ~LogCapture() { TKLog::TKLogger::configure({0, "none"}, {0, "none"}); }
    LogCapture(const LogCapture&) = delete;
    LogCapture& operator=(const LogCapture&) = delete;

    [[nodiscard]] std::vector<LogRecord> log() const { return parseLog(readFile(logPath_)); }
    [[nodiscard]] std::vector<LogRecord> trace() const { return parseLog(readFile(tracePath_)); }

    /// The messages alone, for tests of what is said and not of where.
    [[nodiscard]] std::vector<std::string> logMessages() const { return messages(log()); }
    [[nodiscard]] std::vector<std::string> traceMessages() const { return messages(trace()); }

    /// Forgets what was written so far.
    void clear() {
        writeFile(logPath_, "");
        writeFile(tracePath_, "");
    }

  private:
    static std::vector<std::string> messages(const std::vector<LogRecord>& records) {
        std::vector<std::string> texts;
        texts.reserve(records.size());
        for (const LogRecord& record : records) {
            texts.push_back(record.message);
        }
        return texts;
    }

    TemporaryDirectory directory_;
    std::string logPath_ = directory_ / "log";
    std::string tracePath_ = directory_ / "trace";
};

}  // namespace ZR::Testing
