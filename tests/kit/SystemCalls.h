#pragma once

#include <sys/socket.h>
#include <sys/types.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "kit/CallOrigin.h"

namespace ZR::Testing {

/// The functions of the C library by which the platform asks something of the system.
/// A program that links this has definitions of its own of them, which come before
/// those of the C library also for the libraries that the program loads.
enum class Call : std::uint8_t {
    access,
    bind,
    close,
    epoll_ctl,
    fallocate,
    fcntl,
    fstat,
    fstatat,
    ftruncate,
    gethostname,
    getsockname,
    inotify_add_watch,
    inotify_init1,
    inotify_rm_watch,
    ioctl,
    lstat,
    open,
    openat,
    opendir,
    poll,
    pwrite,
    read,
    readdir,
    readlink,
    readlinkat,
    recv,
    recvmsg,
    sendto,
    socket,
    stat,
    syscall,
    write,
    count,  ///< how many there are
};

[[nodiscard]] const char* nameOf(Call call) noexcept;

/// The calls of this thread as long as the object lives. Each is counted and passed on
/// to the system, but for what is told otherwise. One at a time per thread.
class SystemCalls {
  public:
    /// Counts the calls that come from the origin.
    explicit SystemCalls(const CallOrigin& origin = {});
    ~SystemCalls();
    SystemCalls(const SystemCalls&) = delete;
    SystemCalls& operator=(const SystemCalls&) = delete;

    /// An "error" of a transfer: it takes place, of half of the bytes asked for.
    static constexpr int halfTransferred = -1;

    /// Lets the n-th call (from 1) from now on fail with an errno, or `times` calls
    /// from there on. What frees or closes something does so first, as Linux does.
    void fail(Call call, unsigned number, int error, unsigned times = 1);

    /// Whether the failure that was asked for has come.
    [[nodiscard]] bool failed() const noexcept { return failed_; }

    /// How many of that kind were made since the beginning.
    [[nodiscard]] unsigned count(Call call) const noexcept {
        return counts_.at(static_cast<std::size_t>(call));
    }

    /// Takes the place of the system, or calls it and changes its result: given
    /// the arguments, with errno as the caller will see it.
    using Receive = std::function<ssize_t(int fd, msghdr* message, int flags)>;
    void onReceive(Receive receive) { receive_ = std::move(receive); }
    using Send = std::function<ssize_t(int fd, const void* bytes, std::size_t size)>;
    void onSend(Send send) { send_ = std::move(send); }

    /// The function of the system, for those that stand in its place.
    static ssize_t reallyReceive(int fd, msghdr* message, int flags);
    static ssize_t reallySend(int fd, const void* bytes, std::size_t size);

    // For the functions that stand before the C library's.

    /// The object of this thread, if a call with that return address counts.
    [[nodiscard]] static SystemCalls* watching(const void* returnAddress) noexcept;
    /// Counts a call; the errno that it is to fail with, 0 for none.
    [[nodiscard]] int meet(Call call) noexcept;
    [[nodiscard]] const Receive& receive() const noexcept { return receive_; }
    [[nodiscard]] const Send& send() const noexcept { return send_; }

  private:
    const CallOrigin origin_;
    std::array<unsigned, static_cast<std::size_t>(Call::count)> counts_{};
    Call failing_ = Call::count;
    unsigned firstFailing_ = 0;
    unsigned lastFailing_ = 0;
    int error_ = 0;
    bool failed_ = false;
    Receive receive_;
    Send send_;
};

}  // namespace ZR::Testing
