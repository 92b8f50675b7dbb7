#pragma once

#include <chrono>
#include <string>

#include "clients/SdBus.h"
#include "facts/ClientFacts.h"

namespace ZR::Live {

/// Hears on the system bus what managers announce. NetworkManager and connman tell there alone
/// that they ask for a lease, and of much else sooner than in their files. systemd-networkd is
/// not listened to: it writes a file with each change that it announces.
///
/// It has a connection of its own, only while one of them runs and someone waits for changes,
/// and no thread. One thread.
class ManagerSignals {
  public:
    using Time = std::chrono::steady_clock::time_point;

    ManagerSignals() = default;

    /// Listens to those that run from the next connect() on. Where none does, the connection
    /// ends.
    void follow(const ClientFacts& facts);

    /// Connects to the bus where there is anything to hear and no connection, for a moment at
    /// most, and not soon after a failure. True when there is one that was not there before:
    /// what was announced until then has not been heard. `now` is by whatever clock.
    [[nodiscard]] bool connect(Time now);

    /// What becomes readable when heard() may be true; -1 without a connection. Owned by this
    /// object, until heard(), follow() or its end.
    [[nodiscard]] int descriptor() const noexcept { return descriptor_; }

    /// Whether something was announced since the last call, or the connection has broken. Never
    /// blocks; makes no system call without a connection.
    [[nodiscard]] bool heard();

  private:
    void disconnect() noexcept;
    [[nodiscard]] bool open();

    bool wanted_ = false;
    Time rest_{};  ///< not to be tried again before
    BusConnection bus_;
    int descriptor_ = -1;
};

/// In its place in a build that does not use the bus: nothing is ever heard.
struct NoManagerSignals {
    static void follow(const ClientFacts& /*facts*/) noexcept {}
    [[nodiscard]] static bool connect(ManagerSignals::Time /*now*/) noexcept { return false; }
    [[nodiscard]] static int descriptor() noexcept { return -1; }
    [[nodiscard]] static bool heard() noexcept { return false; }
};

}  // namespace ZR::Live
