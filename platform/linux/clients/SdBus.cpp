#include "clients/SdBus.h"

#include <dlfcn.h>

#include <algorithm>
#include <cerrno>
#include <mutex>
#include <type_traits>

namespace ZR::Live {

std::shared_ptr<const SdBus> SdBus::get() {
    static std::mutex mutex;
    static std::shared_ptr<const SdBus> functions;
    const std::lock_guard lock(mutex);
    // The reason of a failure, such as a lack of descriptors, may be gone.
    if (!functions || !functions->missing().empty()) {
        functions = std::make_shared<const SdBus>("libsystemd.so.0");
    }
    return functions;
}

SdBus::SdBus(const char* library) : handle_(::dlopen(library, RTLD_NOW | RTLD_LOCAL)) {
    const auto tellWhy = [this] {
        const char* const reason = ::dlerror();
        missing_ = reason == nullptr ? "the library cannot be loaded" : reason;
    };
    if (!handle_) {
        tellWhy();
        return;
    }
    const auto find = [&](auto& function, const char* name) {
        void* const symbol = ::dlsym(handle_.get(), name);
        if (symbol == nullptr && missing_.empty()) {
            tellWhy();
        }
        function = reinterpret_cast<std::remove_reference_t<decltype(function)>>(symbol);
    };
    find(openSystem, "sd_bus_open_system");
    find(closeUnref, "sd_bus_close_unref");
    find(isReady, "sd_bus_is_ready");
    find(process, "sd_bus_process");
    find(wait, "sd_bus_wait");
    find(getFd, "sd_bus_get_fd");
    find(addMatchAsync, "sd_bus_add_match_async");
    find(call, "sd_bus_call");
    find(newMethodCall, "sd_bus_message_new_method_call");
    find(setAutoStart, "sd_bus_message_set_auto_start");
    find(appendBasic, "sd_bus_message_append_basic");
    find(peekType, "sd_bus_message_peek_type");
    find(enterContainer, "sd_bus_message_enter_container");
    find(exitContainer, "sd_bus_message_exit_container");
    find(readBasic, "sd_bus_message_read_basic");
    find(isSignal, "sd_bus_message_is_signal");
    find(messageUnref, "sd_bus_message_unref");
    find(errorHasName, "sd_bus_error_has_name");
    find(errorFree, "sd_bus_error_free");
}

int SdBus::awaitReady(sd_bus* bus, std::chrono::steady_clock::time_point deadline) const {
    for (;;) {
        const int ready = isReady(bus);
        if (ready != 0) {
            return ready < 0 ? -ready : 0;
        }
        const int done = process(bus, nullptr);
        if (done < 0) {
            return -done;
        }
        if (done == 0) {
            const std::uint64_t time = microsecondsTo(deadline);
            if (time == 0) {
                return ETIMEDOUT;
            }
            if (const int waited = wait(bus, time); waited < 0 && waited != -EINTR) {
                return -waited;
            }
        }
    }
}

void SdBus::Close::operator()(void* handle) const noexcept {
    ::dlclose(handle);
}

std::uint64_t microsecondsTo(std::chrono::steady_clock::time_point deadline) {
    const auto time = std::chrono::duration_cast<std::chrono::microseconds>(
        deadline - std::chrono::steady_clock::now());
    return static_cast<std::uint64_t>(std::max<std::int64_t>(time.count(), 0));
}

}  // namespace ZR::Live
