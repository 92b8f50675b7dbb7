#pragma once

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <systemd/sd-bus.h>

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <memory>
#include <mutex>
#include <stdexcept>
#include <string>
#include <thread>
#include <utility>

#include "kit/Files.h"
#include "zrcommon/UniqueFd.h"

namespace ZR::Live {

/// A system bus with one program on it, for as long as it lives: the library's requests find
/// it by the environment. What the program responds, the test says.
class FakeBus {
  public:
    /// Responds to a request as with sd_bus_reply_method_return(3); a negative errno is an
    /// error that goes back, 0 no response at all.
    using Program = std::function<int(sd_bus_message* request)>;

    explicit FakeBus(Program program)
        : program_(std::move(program)),
          listener_(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
        const std::string path = directory_.path("/bus");
        sockaddr_un name{};
        name.sun_family = AF_UNIX;
        std::memcpy(&name.sun_path[0], path.c_str(),
                    std::min(path.size(), sizeof name.sun_path - 1));
        const auto* const generic = static_cast<const sockaddr*>(static_cast<const void*>(&name));
        if (::bind(listener_.get(), generic, sizeof name) != 0 ||
            ::listen(listener_.get(), 8) != 0 ||
            ::setenv("DBUS_SYSTEM_BUS_ADDRESS", ("unix:path=" + path).c_str(), 1) != 0) {
            throw std::runtime_error("no bus");
        }
        thread_ = std::thread{[this] { serve(); }};
    }
    ~FakeBus() {
        ended_ = true;
        thread_.join();
    }
    FakeBus(const FakeBus&) = delete;
    FakeBus& operator=(const FakeBus&) = delete;

    /// Has the program announce something on the connection that there is, or that comes.
    void announce(std::function<void(sd_bus* bus)> announcement) {
        const std::lock_guard lock(mutex_);
        announcement_ = std::move(announcement);
    }

  private:
    struct Close {
        void operator()(sd_bus* bus) const noexcept { sd_bus_close_unref(bus); }
    };
    static constexpr int moment = 20;  // milliseconds

    void serve() {
        while (!ended_) {
            pollfd waiting{.fd = listener_.get(), .events = POLLIN, .revents = 0};
            if (::poll(&waiting, 1, moment) > 0) {
                serveOne(::accept4(listener_.get(), nullptr, nullptr, SOCK_CLOEXEC));
            }
        }
    }

    void serveOne(int fd) {
        sd_bus* made = nullptr;
        sd_id128_t id{};
        if (sd_id128_randomize(&id) < 0 || sd_bus_new(&made) < 0) {
            return;
        }
        const std::unique_ptr<sd_bus, Close> bus{made};
        if (sd_bus_set_fd(made, fd, fd) < 0 || sd_bus_set_server(made, 1, id) < 0 ||
            sd_bus_add_filter(made, nullptr, respond, this) < 0 || sd_bus_start(made) < 0) {
            return;
        }
        while (!ended_) {
            if (const auto announcement = takeAnnouncement()) {
                announcement(made);
            }
            const int done = sd_bus_process(made, nullptr);
            if (done < 0 || (done == 0 && sd_bus_wait(made, moment * 1000ULL) < 0)) {
                return;  // the other side has closed it
            }
        }
    }

    std::function<void(sd_bus*)> takeAnnouncement() {
        const std::lock_guard lock(mutex_);
        return std::exchange(announcement_, nullptr);
    }

    static int respond(sd_bus_message* request, void* self, sd_bus_error* /*error*/) {
        if (sd_bus_message_is_method_call(request, nullptr, nullptr) <= 0) {
            return 0;  // the library's own word that the other side is gone
        }
        if (sd_bus_message_is_method_call(request, "org.freedesktop.DBus", "Hello") > 0) {
            return sd_bus_reply_method_return(request, "s", ":1.7");
        }
        const int done = static_cast<FakeBus*>(self)->program_(request);
        return done < 0 ? sd_bus_reply_method_errno(request, done, nullptr) : 1;
    }

    Program program_;
    Testing::TemporaryDirectory directory_;
    UniqueFd listener_;
    std::atomic<bool> ended_ = false;
    std::mutex mutex_;
    std::function<void(sd_bus*)> announcement_;
    std::thread thread_;
};

}  // namespace ZR::Live
