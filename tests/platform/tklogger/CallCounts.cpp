#include <atomic>
#include <cstdlib>
#include <new>

#include "CallCounts.h"
#include "tklogger/TKLogger.h"

namespace {

thread_local std::size_t allocations = 0;

}  // namespace

#ifndef ALLOCATIONS_NOT_COUNTED

namespace {

void* allocate(std::size_t size) {
    ++allocations;
    void* const memory = std::malloc(size == 0 ? 1 : size);
    if (memory == nullptr) {
        throw std::bad_alloc();
    }
    return memory;
}

}  // namespace

// These replace the standard ones in the whole test program; those that do not
// throw come down to them.
void* operator new(std::size_t size) {
    return allocate(size);
}
void* operator new[](std::size_t size) {
    return allocate(size);
}
void operator delete(void* memory) noexcept {
    std::free(memory);
}
void operator delete[](void* memory) noexcept {
    std::free(memory);
}
void operator delete(void* memory, std::size_t /*size*/) noexcept {
    std::free(memory);
}
void operator delete[](void* memory, std::size_t /*size*/) noexcept {
    std::free(memory);
}

#endif

namespace TKLog::Testing {

std::size_t allocationsOfThisThread() noexcept {
    return allocations;
}

}  // namespace TKLog::Testing

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
