#pragma once

namespace ZR::Testing {

/// Whether this build is one of the address or thread sanitizer, which make
/// everything some ten times as slow, and memory no measure of the code's.
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
inline constexpr bool sanitized = true;
#elif defined(__has_feature)
inline constexpr bool sanitized =
    __has_feature(address_sanitizer) || __has_feature(thread_sanitizer);
#else
inline constexpr bool sanitized = false;
#endif

}  // namespace ZR::Testing
