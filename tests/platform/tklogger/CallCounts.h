#pragma once

#include <cstddef>

namespace TKLog::Testing {

/// Whether this build counts: the thread sanitizer of clang does not let a program replace
/// operator new.
#ifdef ALLOCATIONS_NOT_COUNTED
inline constexpr bool countsAllocations = false;
#else
inline constexpr bool countsAllocations = true;
#endif

/// How often this thread has called operator new so far.
std::size_t allocationsOfThisThread() noexcept;

/// How often the slow path of each channel was taken so far, by all threads.
unsigned logSlowPathCalls() noexcept;
unsigned traceSlowPathCalls() noexcept;

}  // namespace TKLog::Testing
