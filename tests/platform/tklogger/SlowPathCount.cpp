#include "SlowPathCount.h"

#include <atomic>

#include "tklogger/TKLogger.h"

// The linker hands every call of keepLog and keepTrace that a test makes to the
// functions here, and gives their real selves the names with "real" in them.

namespace {

std::atomic<unsigned> logCalls{0};
std::atomic<unsigned> traceCalls{0};

}  // namespace

extern "C" {

void __real__ZN5TKLog8TKLogger7keepLogERKNS0_4LineE(const TKLog::TKLogger::Line& line);
void __real__ZN5TKLog8TKLogger9keepTraceERKNS0_4LineE(const TKLog::TKLogger::Line& line);
void __wrap__ZN5TKLog8TKLogger7keepLogERKNS0_4LineE(const TKLog::TKLogger::Line& line);
void __wrap__ZN5TKLog8TKLogger9keepTraceERKNS0_4LineE(const TKLog::TKLogger::Line& line);

void __wrap__ZN5TKLog8TKLogger7keepLogERKNS0_4LineE(const TKLog::TKLogger::Line& line) {
    logCalls.fetch_add(1, std::memory_order_relaxed);
    __real__ZN5TKLog8TKLogger7keepLogERKNS0_4LineE(line);
}

void __wrap__ZN5TKLog8TKLogger9keepTraceERKNS0_4LineE(const TKLog::TKLogger::Line& line) {
    traceCalls.fetch_add(1, std::memory_order_relaxed);
    __real__ZN5TKLog8TKLogger9keepTraceERKNS0_4LineE(line);
}

}  // extern "C"

namespace TKLog::Testing {

unsigned logSlowPathCalls() noexcept {
    return logCalls.load(std::memory_order_relaxed);
}
unsigned traceSlowPathCalls() noexcept {
    return traceCalls.load(std::memory_order_relaxed);
}

}  // namespace TKLog::Testing
