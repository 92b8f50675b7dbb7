#pragma once

#include <atomic>
#include <csignal>

#include "zrcommon/UniqueFd.h"

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

    /// Can be read from poll(2)'s point of view as soon as wanted() is true.
    [[nodiscard]] int descriptor() const noexcept { return descriptor_.get(); }

  private:
    ZR::UniqueFd descriptor_;
    struct ::sigaction beforeInterrupt_ {};
    struct ::sigaction beforeTermination_ {};
};

}  // namespace cimdhcp
