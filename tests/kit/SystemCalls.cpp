#include "kit/SystemCalls.h"

#include <dirent.h>
#include <dlfcn.h>
#include <fcntl.h>
#include <linux/netlink.h>
#include <poll.h>
#include <sys/epoll.h>
#include <sys/inotify.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <cstdarg>
#include <utility>

namespace ZR::Testing {
namespace {

// Plain, so that it is there from the first instruction of a thread to its last.
thread_local SystemCalls* current = nullptr;

constexpr std::array<const char*, static_cast<std::size_t>(Call::count)> names{
    "access",        "bind",
    "close",         "epoll_ctl",
    "fallocate",     "fcntl",
    "fstat",         "fstatat",
    "ftruncate",     "gethostname",
    "getsockname",   "inotify_add_watch",
    "inotify_init1", "inotify_rm_watch",
    "ioctl",         "lstat",
    "open",          "openat",
    "opendir",       "poll",
    "pwrite",        "read",
    "readdir",       "readlink",
    "readlinkat",    "recv",
    "recvmsg",       "sendto",
    "socket",        "stat",
    "syscall",       "write"};

}  // namespace

const char* nameOf(Call call) noexcept {
    return names.at(static_cast<std::size_t>(call));
}

SystemCalls::SystemCalls(const CallOrigin& origin) : origin_(origin) {
    current = this;
}

SystemCalls::~SystemCalls() {
    current = nullptr;
}

void SystemCalls::fail(Call call, unsigned number, int error, unsigned times) {
    failing_ = call;
    firstFailing_ = count(call) + number;
    lastFailing_ = firstFailing_ + times - 1;
    error_ = error;
    failed_ = false;
}

SystemCalls* SystemCalls::watching(const void* returnAddress) noexcept {
    // Taken away while it looks, should looking call something.
    SystemCalls* const here = std::exchange(current, nullptr);
    if (here == nullptr) {
        return nullptr;
    }
    const bool counts = here->origin_.includes(returnAddress);
    current = here;
    return counts ? here : nullptr;
}

int SystemCalls::meet(Call call) noexcept {
    const unsigned number = ++counts_.at(static_cast<std::size_t>(call));
    if (call != failing_ || number < firstFailing_ || number > lastFailing_) {
        return 0;
    }
    failed_ = true;
    return error_;
}

namespace {

/// The C library's function of that name.
template <typename Function>
Function next(const char* name) {
    return reinterpret_cast<Function>(::dlsym(RTLD_NEXT, name));
}

using Kernel = long (*)(long, ...);
Kernel askKernel() {
    static const auto real = next<Kernel>("syscall");
    return real;
}

}  // namespace

ssize_t SystemCalls::reallyReceive(int fd, msghdr* message, int flags) {
    return askKernel()(SYS_recvmsg, fd, message, flags);
}

ssize_t SystemCalls::reallySend(int fd, const void* bytes, std::size_t size) {
    sockaddr_nl kernel{};
    kernel.nl_family = AF_NETLINK;
    return askKernel()(SYS_sendto, fd, bytes, size, 0, &kernel, sizeof kernel);
}

namespace {

/// Meets a call: returns the failure if it is due, else what the real one returns.
template <typename Result, typename Real>
Result meet(Call call, const void* returnAddress, Result failure, const Real& real) {
    if (SystemCalls* const watching = SystemCalls::watching(returnAddress)) {
        if (const int error = watching->meet(call); error > 0) {
            errno = error;
            return failure;
        }
    }
    return real();
}

/// The same for a transfer of bytes, which may also be of half of them.
template <typename Real>
ssize_t transfer(Call call, const void* returnAddress, std::size_t size, const Real& real) {
    if (SystemCalls* const watching = SystemCalls::watching(returnAddress)) {
        const int error = watching->meet(call);
        if (error > 0) {
            errno = error;
            return -1;
        }
        if (error == SystemCalls::halfTransferred) {
            return real((size + 1) / 2);
        }
    }
    return real(size);
}

/// The same for what takes place whether it returns a failure or not.
template <typename Real>
int complete(Call call, const void* returnAddress, const Real& real) {
    SystemCalls* const watching = SystemCalls::watching(returnAddress);
    const int error = watching == nullptr ? 0 : watching->meet(call);
    const int result = real();
    if (error > 0) {
        errno = error;
        return -1;
    }
    return result;
}

}  // namespace
}  // namespace ZR::Testing

// These take the place of the C library's functions in the whole process, and so have
// their names, their linkage and their arguments.
// NOLINTBEGIN
#define ZR_REPLACES extern "C" __attribute__((visibility("default")))
#define ZR_CALLER __builtin_return_address(0)

using ZR::Testing::askKernel;
using ZR::Testing::Call;
using ZR::Testing::complete;
using ZR::Testing::meet;
using ZR::Testing::next;
using ZR::Testing::SystemCalls;
using ZR::Testing::transfer;

namespace {
/// What nothing but the kernel need be asked for.
template <typename... Arguments>
auto kernel(long number, Arguments... arguments) {
    return [=] { return static_cast<int>(askKernel()(number, arguments...)); };
}
}  // namespace

ZR_REPLACES int access(const char* path, int mode) noexcept {
    static const auto real = next<int (*)(const char*, int)>("access");
    return meet(Call::access, ZR_CALLER, -1, [&] { return real(path, mode); });
}
ZR_REPLACES int bind(int fd, const sockaddr* address, socklen_t size) noexcept {
    return meet(Call::bind, ZR_CALLER, -1, kernel(SYS_bind, fd, address, size));
}
ZR_REPLACES int close(int fd) {
    return complete(Call::close, ZR_CALLER, kernel(SYS_close, fd));
}
ZR_REPLACES int epoll_ctl(int set, int operation, int fd, epoll_event* event) noexcept {
    return meet(Call::epoll_ctl, ZR_CALLER, -1, kernel(SYS_epoll_ctl, set, operation, fd, event));
}
ZR_REPLACES int fcntl(int fd, int command, ...) {
    va_list arguments;
    va_start(arguments, command);
    const long argument = va_arg(arguments, long);
    va_end(arguments);
    return meet(Call::fcntl, ZR_CALLER, -1, kernel(SYS_fcntl, fd, command, argument));
}
ZR_REPLACES int fallocate(int fd, int mode, off_t offset, off_t size) {
    return meet(Call::fallocate, ZR_CALLER, -1, kernel(SYS_fallocate, fd, mode, offset, size));
}
ZR_REPLACES int fstat(int fd, struct stat* status) noexcept {
    return meet(Call::fstat, ZR_CALLER, -1, kernel(SYS_fstat, fd, status));
}
ZR_REPLACES int fstatat(int directory, const char* path, struct stat* status, int flags) noexcept {
    static const auto real = next<int (*)(int, const char*, struct stat*, int)>("fstatat");
    return meet(Call::fstatat, ZR_CALLER, -1, [&] { return real(directory, path, status, flags); });
}
ZR_REPLACES int ftruncate(int fd, off_t size) noexcept {
    return meet(Call::ftruncate, ZR_CALLER, -1, kernel(SYS_ftruncate, fd, size));
}
ZR_REPLACES int gethostname(char* name, std::size_t size) noexcept {
    static const auto real = next<int (*)(char*, std::size_t)>("gethostname");
    return meet(Call::gethostname, ZR_CALLER, -1, [&] { return real(name, size); });
}
ZR_REPLACES int getsockname(int fd, sockaddr* address, socklen_t* size) noexcept {
    return meet(Call::getsockname, ZR_CALLER, -1, kernel(SYS_getsockname, fd, address, size));
}
ZR_REPLACES int inotify_add_watch(int fd, const char* path, std::uint32_t events) noexcept {
    return meet(Call::inotify_add_watch, ZR_CALLER, -1,
                kernel(SYS_inotify_add_watch, fd, path, events));
}
ZR_REPLACES int inotify_init1(int flags) noexcept {
    return meet(Call::inotify_init1, ZR_CALLER, -1, kernel(SYS_inotify_init1, flags));
}
ZR_REPLACES int inotify_rm_watch(int fd, int watch) noexcept {
    return complete(Call::inotify_rm_watch, ZR_CALLER, kernel(SYS_inotify_rm_watch, fd, watch));
}
ZR_REPLACES int ioctl(int fd, unsigned long request, ...) noexcept {
    va_list rest;
    va_start(rest, request);
    void* const argument = va_arg(rest, void*);
    va_end(rest);
    return meet(Call::ioctl, ZR_CALLER, -1, kernel(SYS_ioctl, fd, request, argument));
}
ZR_REPLACES int lstat(const char* path, struct stat* status) noexcept {
    static const auto real = next<int (*)(const char*, struct stat*)>("lstat");
    return meet(Call::lstat, ZR_CALLER, -1, [&] { return real(path, status); });
}
ZR_REPLACES int open(const char* path, int flags, ...) {
    va_list rest;
    va_start(rest, flags);
    const unsigned mode = (flags & (O_CREAT | __O_TMPFILE)) != 0 ? va_arg(rest, unsigned) : 0U;
    va_end(rest);
    return meet(Call::open, ZR_CALLER, -1, kernel(SYS_openat, AT_FDCWD, path, flags, mode));
}
ZR_REPLACES int openat(int directory, const char* path, int flags, ...) {
    va_list rest;
    va_start(rest, flags);
    const unsigned mode = (flags & (O_CREAT | __O_TMPFILE)) != 0 ? va_arg(rest, unsigned) : 0U;
    va_end(rest);
    return meet(Call::openat, ZR_CALLER, -1, kernel(SYS_openat, directory, path, flags, mode));
}
ZR_REPLACES DIR* opendir(const char* path) {
    static const auto real = next<DIR* (*)(const char*)>("opendir");
    return meet(Call::opendir, ZR_CALLER, static_cast<DIR*>(nullptr), [&] { return real(path); });
}
ZR_REPLACES int poll(pollfd* descriptors, nfds_t count, int timeout) {
    static const auto real = next<int (*)(pollfd*, nfds_t, int)>("poll");
    return meet(Call::poll, ZR_CALLER, -1, [&] { return real(descriptors, count, timeout); });
}
ZR_REPLACES ssize_t pwrite(int fd, const void* bytes, std::size_t size, off_t offset) {
    return transfer(Call::pwrite, ZR_CALLER, size, [=](std::size_t part) {
        return askKernel()(SYS_pwrite64, fd, bytes, part, offset);
    });
}
ZR_REPLACES ssize_t read(int fd, void* bytes, std::size_t size) {
    return transfer(Call::read, ZR_CALLER, size,
                    [=](std::size_t part) { return askKernel()(SYS_read, fd, bytes, part); });
}
ZR_REPLACES dirent* readdir(DIR* directory) {
    static const auto real = next<dirent* (*)(DIR*)>("readdir");
    return meet(Call::readdir, ZR_CALLER, static_cast<dirent*>(nullptr),
                [&] { return real(directory); });
}
ZR_REPLACES ssize_t readlink(const char* path, char* target, std::size_t size) noexcept {
    static const auto real = next<ssize_t (*)(const char*, char*, std::size_t)>("readlink");
    return meet(Call::readlink, ZR_CALLER, ssize_t{-1}, [&] { return real(path, target, size); });
}
ZR_REPLACES ssize_t readlinkat(int directory, const char* path, char* target,
                               std::size_t size) noexcept {
    return meet(Call::readlinkat, ZR_CALLER, ssize_t{-1},
                [&] { return ssize_t{kernel(SYS_readlinkat, directory, path, target, size)()}; });
}
ZR_REPLACES ssize_t recv(int fd, void* bytes, std::size_t size, int flags) {
    return meet(Call::recv, ZR_CALLER, ssize_t{-1}, [&] {
        return ssize_t{kernel(SYS_recvfrom, fd, bytes, size, flags, nullptr, nullptr)()};
    });
}
ZR_REPLACES ssize_t recvmsg(int fd, msghdr* message, int flags) {
    if (SystemCalls* const watching = SystemCalls::watching(ZR_CALLER)) {
        if (const int error = watching->meet(Call::recvmsg); error > 0) {
            errno = error;
            return -1;
        }
        if (watching->receive()) {
            return watching->receive()(fd, message, flags);
        }
    }
    return SystemCalls::reallyReceive(fd, message, flags);
}
ZR_REPLACES ssize_t sendto(int fd, const void* bytes, std::size_t size, int flags,
                           const sockaddr* address, socklen_t addressSize) {
    SystemCalls* const watching = SystemCalls::watching(ZR_CALLER);
    const int error = watching == nullptr ? 0 : watching->meet(Call::sendto);
    if (error > 0) {
        errno = error;
        return -1;
    }
    if (watching != nullptr && watching->send()) {
        return watching->send()(fd, bytes, size);
    }
    return kernel(SYS_sendto, fd, bytes,
                  error == SystemCalls::halfTransferred ? (size + 1) / 2 : size, flags, address,
                  addressSize)();
}
ZR_REPLACES int socket(int domain, int type, int protocol) noexcept {
    return meet(Call::socket, ZR_CALLER, -1, kernel(SYS_socket, domain, type, protocol));
}
ZR_REPLACES int stat(const char* path, struct stat* status) noexcept {
    static const auto real = next<int (*)(const char*, struct stat*)>("stat");
    return meet(Call::stat, ZR_CALLER, -1, [&] { return real(path, status); });
}
ZR_REPLACES long syscall(long number, ...) noexcept {
    va_list rest;
    va_start(rest, number);
    std::array<long, 6> arguments{};
    for (long& argument : arguments) {
        argument = va_arg(rest, long);
    }
    va_end(rest);
    return meet(Call::syscall, ZR_CALLER, -1L, [&] {
        return askKernel()(number, arguments[0], arguments[1], arguments[2], arguments[3],
                           arguments[4], arguments[5]);
    });
}
ZR_REPLACES ssize_t write(int fd, const void* bytes, std::size_t size) {
    return transfer(Call::write, ZR_CALLER, size,
                    [=](std::size_t part) { return askKernel()(SYS_write, fd, bytes, part); });
}
// NOLINTEND
