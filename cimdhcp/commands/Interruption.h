#pragma once

#include <atomic>
#include <csignal>

namespace cimdhcp {

/// While it lives, the first SIGINT or SIGTERM is a wish to end, which can be asked
/// for; a second one ends the process. There is one at a time.
class Interruption {
  public:
    Interruption();
    ~Interruption();
    Interruption(const Interruption&) = delete;
    Interruption& operator=(const Interruption&) = delete;

    [[nodiscard]] const std::atomic<bool>& wanted() const noexcept;

  private:
    struct ::sigaction beforeInterrupt_ {};
    struct ::sigaction beforeTermination_ {};
};

}  // namespace cimdhcp
