#include "wbem/Limits.h"

#include <stdexcept>
#include <string>

namespace cimom::wbem {

namespace {

void checkRange(const char* name, std::size_t value, std::size_t least, std::size_t most) {
    if (value < least || value > most) {
        throw std::invalid_argument(std::string(name) + " is " + std::to_string(value) +
                                    "; it may be " + std::to_string(least) + " to " +
                                    std::to_string(most));
    }
}

void checkSeconds(const char* name, std::chrono::seconds value, std::size_t most) {
    // A negative number is far above any range.
    checkRange(name, static_cast<std::size_t>(value.count()), 1, most);
}

constexpr std::size_t kibi = 1024;
constexpr std::size_t day = 86400;

}  // namespace

void Limits::check() const {
    checkRange("max-header-line", headerLine, 64, 64 * kibi);
    checkRange("max-headers", headers, 256, 256 * kibi);
    checkRange("max-body", body, 1, 1024 * kibi * kibi);
    checkRange("max-depth", depth, 8, 256);
    checkRange("max-connections", connections, 1, 65536);
    checkRange("max-connections-each", connectionsEach, 1, 65536);
    checkRange("max-connection-rate", connectionRate, 1, 65536);
    checkRange("max-checks-each", checksEach, 1, 65536);
    checkRange("max-refusals-each", refusalsEach, 1, 65536);
    checkRange("max-memory", memory, kibi * kibi, std::size_t{1} << 40U);
    checkRange("workers", workers, 1, 256);
    checkRange("max-stuck", stuck, 1, 256);
    checkRange("io-threads", ioThreads, 1, 64);
    checkRange("max-waiting", waiting, 1, 65536);
    checkRange("max-result", result, kibi, std::size_t{1} << 40U);
    checkSeconds("head-timeout", head, day);
    checkSeconds("request-timeout", request, day);
    checkSeconds("answer-timeout", response, day);
    checkRange("max-enumerations", sessions.sessions, 1, 65536);
    checkRange("max-enumerations-each", sessions.each, 1, 65536);
    checkSeconds("enumeration-timeout", sessions.defaultTimeout, day);
    checkSeconds("max-enumeration-timeout", sessions.longestTimeout, day);
    if (connections < ioThreads) {
        throw std::invalid_argument("max-connections is below io-threads");
    }
    // An address has half of the memory, in which one request has to fit: its body, which has up
    // to twice its length while it arrives, and what is read from it.
    constexpr std::size_t timesBody = 40;
    constexpr std::size_t least = kibi * kibi;
    if (memory < least + timesBody * body) {
        throw std::invalid_argument("max-memory is below " +
                                    std::to_string(least + timesBody * body) + ", " +
                                    std::to_string(timesBody) + " times max-body");
    }
}

}  // namespace cimom::wbem
