#include "wbem/Limits.h"

#include <cstdint>
#include <stdexcept>
#include <string>

namespace cimom::wbem {

namespace {

// All numbers have 64 bits, as sums and bounds may be beyond what a size can be.
void checkRange(const char* name, std::uint64_t value, std::uint64_t least, std::uint64_t most) {
    if (value < least || value > most) {
        throw std::invalid_argument(std::string(name) + " is " + std::to_string(value) +
                                    "; it may be " + std::to_string(least) + " to " +
                                    std::to_string(most));
    }
}

void checkSeconds(const char* name, std::chrono::seconds value, std::uint64_t most) {
    // A negative number is far above any range.
    checkRange(name, static_cast<std::uint64_t>(value.count()), 1, most);
}

constexpr std::uint64_t kibi = 1024;
constexpr std::uint64_t tebi = kibi * kibi * kibi * kibi;
constexpr std::uint64_t day = 86400;

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
    checkRange("max-memory", memory, kibi * kibi, tebi);
    checkRange("workers", workers, 1, 256);
    checkRange("max-stuck", stuck, 1, 256);
    checkRange("io-threads", ioThreads, 1, 64);
    checkRange("max-waiting", waiting, 1, 65536);
    checkRange("max-result", result, kibi, tebi);
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
    constexpr std::uint64_t timesBody = 40;
    constexpr std::uint64_t least = kibi * kibi;
    if (memory < least + timesBody * body) {
        throw std::invalid_argument("max-memory is below " +
                                    std::to_string(least + timesBody * body) + ", " +
                                    std::to_string(timesBody) + " times max-body");
    }
}

}  // namespace cimom::wbem
