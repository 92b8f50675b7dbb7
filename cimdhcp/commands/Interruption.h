#pragma once

#include <atomic>
#include <csignal>

namespace cimdhcp {

/// While it exists, the first SIGINT or SIGTERM only sets wanted(), and the second one
/// ends the process. At most one exists at a time.
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
