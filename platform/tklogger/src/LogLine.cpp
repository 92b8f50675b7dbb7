#include "LogLine.h"

#include <array>
#include <cstdint>
#include <ctime>

#include "tklogger/TKMessageBuffer.h"

namespace TKLog {

namespace {

enum class Blanks { keep, escape };

void escape(std::string_view text, Blanks blanks, std::string& out) {
    constexpr std::string_view digits = "0123456789abcdef";
    for (const char character : text) {
        const auto byte = static_cast<std::uint8_t>(character);
        if (character == '\n') {
            out += "\\n";
        } else if (byte < 0x20 || byte == 0x7F || (byte == 0x20 && blanks == Blanks::escape)) {
            out += "\\x";
            out += digits[byte >> 4U];
            out += digits[byte & 0x0FU];
        } else {
            out += character;
        }
    }
}

void appendNumber(std::string& out, std::integral auto number) {
    std::array<char, 24> digits{};
    out.append(digits.data(),
               std::to_chars(digits.data(), digits.data() + digits.size(), number).ptr);
}

void appendTime(std::string& out, std::chrono::system_clock::time_point time) {
    using std::chrono::microseconds;
    using std::chrono::seconds;
    const auto whole = std::chrono::floor<seconds>(time);
    const std::time_t clock = std::chrono::system_clock::to_time_t(whole);
    std::tm utc{};
    ::gmtime_r(&clock, &utc);
    std::array<char, 32> text{};
    out.append(text.data(), std::strftime(text.data(), text.size(), "%Y-%m-%dT%H:%M:%S", &utc));
    const auto micros = std::chrono::duration_cast<microseconds>(time - whole).count();
    std::string fraction = std::to_string(1'000'000 + micros);
    fraction.front() = '.';
    out += fraction;
    out += 'Z';
}

/// An absent file or function name is written as "-", so that no field is empty.
std::string_view named(const char* name) {
    return name == nullptr || *name == '\0' ? "-" : name;
}

void appendFields(std::string& out, const TKLogger::Line& line) {
    escape(line.category.empty() ? "-" : line.category, Blanks::escape, out);
    out += ' ';
    escape(named(line.file), Blanks::escape, out);
    out += ':';
    appendNumber(out, line.line);
    out += ' ';
    escape(named(line.function), Blanks::escape, out);
    out += ' ';
    escape(line.message, Blanks::keep, out);
}

}  // namespace

std::string formatLine(const TKLogger::Line& line, std::chrono::system_clock::time_point time) {
    std::string out;
    out.reserve(128 + line.message.size());
    appendTime(out, time);
    out += ' ';
    appendNumber(out, line.level);
    out += ' ';
    appendFields(out, line);
    out += '\n';
    return out;
}

std::string formatSyslog(const TKLogger::Line& line) {
    std::string out;
    appendFields(out, line);
    return out;
}

}  // namespace TKLog
