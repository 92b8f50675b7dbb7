#pragma once

#include <algorithm>
#include <chrono>

namespace cimom::wbem {

/// A point in time, a while from its construction.
class Deadline {
  public:
    using Clock = std::chrono::steady_clock;

    explicit Deadline(std::chrono::milliseconds patience)
        : patience_(patience), end_(Clock::now() + patience) {}

    [[nodiscard]] std::chrono::milliseconds patience() const noexcept { return patience_; }
    /// Never below zero.
    [[nodiscard]] std::chrono::milliseconds left() const {
        const auto left =
            std::chrono::duration_cast<std::chrono::milliseconds>(end_ - Clock::now());
        return std::max(left, std::chrono::milliseconds::zero());
    }

  private:
    std::chrono::milliseconds patience_;
    Clock::time_point end_;
};

}  // namespace cimom::wbem
