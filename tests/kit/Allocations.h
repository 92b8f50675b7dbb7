#pragma once

#include <cstdint>

#include "kit/CallOrigin.h"

namespace ZR::Testing {

/// The heap of a program that links this: counts what is taken, and fails what it is
/// told to. Every `operator new` is met, and, where no sanitizer owns them, malloc(),
/// calloc() and realloc(), so that the C library's own and other libraries' are too.
class Allocations {
  public:
    /// Watches the allocations of this thread that come from the origin, and lets the
    /// one of that number fail: `operator new` throws std::bad_alloc, the others return
    /// null. None is number 0. One at a time per thread.
    explicit Allocations(const CallOrigin& origin, unsigned failing = 0) noexcept;
    ~Allocations();
    Allocations(const Allocations&) = delete;
    Allocations& operator=(const Allocations&) = delete;

    /// How many were asked for since the beginning.
    [[nodiscard]] unsigned count() const noexcept { return count_; }

    /// Blocks that this program holds at the moment, of all threads and origins.
    [[nodiscard]] static std::int64_t blocksHeld() noexcept;

    /// For the functions that allocate: whether this one is to fail.
    [[nodiscard]] static bool fails(const void* returnAddress) noexcept;

  private:
    const CallOrigin& origin_;
    unsigned failing_;
    unsigned count_ = 0;
};

}  // namespace ZR::Testing
