#pragma once

namespace TKLog::Testing {

/// How often the slow path of each channel was taken so far, by all threads.
unsigned logSlowPathCalls() noexcept;
unsigned traceSlowPathCalls() noexcept;

}  // namespace TKLog::Testing
