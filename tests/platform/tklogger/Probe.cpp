// Logs what its arguments say, in the order given:
//
//   log:LEVEL:COUNT:TEXT    COUNT lines "TEXT NUMBER" for the log
//   trace:LEVEL:COUNT:TEXT  the same for the trace
//   late:LEVEL:TEXT         one line for the log after main() and the service have ended
#include <cstdlib>
#include <iostream>
#include <sstream>
#include <string>

#include "tklogger/TKLogger.h"

namespace {

const std::string category = "Probe";

/// Speaks from its destructor. Constructed before the service is used, and thus
/// destroyed after it.
struct LateLine {
    int level = -1;
    std::string text;

    LateLine() = default;
    LateLine(const LateLine&) = delete;
    LateLine& operator=(const LateLine&) = delete;
    ~LateLine() {
        if (level >= 0) {
            TKLog::TKLogger::logLevelMessage("Probe", "late", 1, category, level, nullptr, 0, 0,
                                             text);
            TKLog::TKLogger::traceLevelMessage("Probe", "late", 1, category, level, nullptr, 0, 0,
                                               text);
        }
    }
};

LateLine lateLine;

bool obey(const std::string& argument) {
    std::istringstream words(argument);
    std::string verb;
    std::string level;
    std::getline(words, verb, ':');
    std::getline(words, level, ':');
    if (verb == "late") {
        lateLine.level = std::stoi(level);
        std::getline(words, lateLine.text);
        return true;
    }
    std::string count;
    std::string text;
    std::getline(words, count, ':');
    std::getline(words, text);
    const auto write = verb == "log"     ? &TKLog::TKLogger::logLevelMessage
                       : verb == "trace" ? &TKLog::TKLogger::traceLevelMessage
                                         : nullptr;
    if (write == nullptr) {
        return false;
    }
    for (int i = 0; i < std::stoi(count); ++i) {
        write("Probe", "main", 1, category, std::stoi(level), nullptr, 0, 0,
              text + " " + std::to_string(i));
    }
    return true;
}

}  // namespace

int main(int argc, char** argv) {
    for (int i = 1; i < argc; ++i) {
        if (!obey(argv[i])) {
            std::cerr << "no such order: " << argv[i] << '\n';
            return EXIT_FAILURE;
        }
    }
    return EXIT_SUCCESS;
}
