#pragma once

#include <systemd/sd-bus.h>

#include <chrono>
#include <cstdint>
#include <memory>
#include <string>

namespace ZR::Live {

/// The functions of libsystemd that a request over the system bus needs. The library is
/// loaded with the first request, not with this code: with the libraries that it needs
/// (compression, ciphers) it would double what the provider costs a process, and most
/// machines have no manager to be asked.
class SdBus {
  public:
    /// Those of this process, kept until this code itself is unloaded. While they cannot
    /// be had, each call tries again. Any thread.
    [[nodiscard]] static std::shared_ptr<const SdBus> get();

    /// Those of a library, by the name that the loader finds it by.
    explicit SdBus(const char* library);

    /// Why the functions cannot be had; empty when they can. Only then may they be called.
    [[nodiscard]] const std::string& missing() const noexcept { return missing_; }

    /// Waits until the bus has accepted a connection, until the deadline at the latest: the
    /// library's own calls would wait for that without a limit. Returns an errno, 0 for none.
    [[nodiscard]] int awaitReady(sd_bus* bus, std::chrono::steady_clock::time_point deadline) const;

    decltype(&::sd_bus_open_system) openSystem = nullptr;
    decltype(&::sd_bus_close_unref) closeUnref = nullptr;
    decltype(&::sd_bus_is_ready) isReady = nullptr;
    decltype(&::sd_bus_process) process = nullptr;
    decltype(&::sd_bus_wait) wait = nullptr;
    decltype(&::sd_bus_get_fd) getFd = nullptr;
    decltype(&::sd_bus_add_match_async) addMatchAsync = nullptr;
    decltype(&::sd_bus_call) call = nullptr;
    decltype(&::sd_bus_message_new_method_call) newMethodCall = nullptr;
    decltype(&::sd_bus_message_set_auto_start) setAutoStart = nullptr;
    decltype(&::sd_bus_message_append_basic) appendBasic = nullptr;
    decltype(&::sd_bus_message_peek_type) peekType = nullptr;
    decltype(&::sd_bus_message_enter_container) enterContainer = nullptr;
    decltype(&::sd_bus_message_exit_container) exitContainer = nullptr;
    decltype(&::sd_bus_message_read_basic) readBasic = nullptr;
    decltype(&::sd_bus_message_is_signal) isSignal = nullptr;
    decltype(&::sd_bus_message_unref) messageUnref = nullptr;
    decltype(&::sd_bus_error_has_name) errorHasName = nullptr;
    decltype(&::sd_bus_error_free) errorFree = nullptr;

  private:
    struct Close {
        void operator()(void* handle) const noexcept;
    };
    std::unique_ptr<void, Close> handle_;
    std::string missing_;
};

/// Has the functions itself: a connection may outlive those of this process, at its end.
struct CloseBus {
    std::shared_ptr<const SdBus> functions;

    void operator()(sd_bus* bus) const noexcept { functions->closeUnref(bus); }
};
using BusConnection = std::unique_ptr<sd_bus, CloseBus>;

struct UnrefMessage {
    void operator()(sd_bus_message* message) const noexcept { SdBus::get()->messageUnref(message); }
};
using BusMessage = std::unique_ptr<sd_bus_message, UnrefMessage>;

/// Microseconds to a deadline; 0 when it has passed.
[[nodiscard]] std::uint64_t microsecondsTo(std::chrono::steady_clock::time_point deadline);

}  // namespace ZR::Live
