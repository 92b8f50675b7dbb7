#include "kernel/NetlinkTransport.h"

#include <libmnl/libmnl.h>
#include <poll.h>
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>

namespace ZR::Live {
namespace {

struct CloseSocket {
    void operator()(mnl_socket* socket) const noexcept {
        // There is nothing to be done about a failing close, and nothing is lost.
        static_cast<void>(::mnl_socket_close(socket));
    }
};

/// Waits until the socket is readable. Returns an errno, 0 when it is.
int awaitReadable(int fd, Deadline deadline) {
    for (;;) {
        const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(
            deadline - std::chrono::steady_clock::now());
        if (left.count() <= 0) {
            return ETIMEDOUT;
        }
        pollfd descriptor{.fd = fd, .events = POLLIN, .revents = 0};
        const int ready =
            ::poll(&descriptor, 1, static_cast<int>(std::min<std::int64_t>(left.count(), 1000)));
        if (ready > 0) {
            return 0;
        }
        if (ready < 0 && errno != EINTR) {
            return errno;
        }
    }
}

class KernelTransport final : public NetlinkTransport {
  public:
    int open() override {
        socket_.reset(::mnl_socket_open2(NETLINK_ROUTE, SOCK_NONBLOCK | SOCK_CLOEXEC));
        if (!socket_) {
            return errno;
        }
        if (::mnl_socket_bind(socket_.get(), 0, MNL_SOCKET_AUTOPID) != 0) {
            const int error = errno;
            socket_.reset();
            return error;
        }
        // Has the kernel heed which link is asked for. One that does not know the option
        // (before Linux 4.20) sends more, which is left out later.
        int strictly = 1;
        static_cast<void>(::mnl_socket_setsockopt(socket_.get(), NETLINK_GET_STRICT_CHK, &strictly,
                                                  sizeof strictly));
        return 0;
    }

    int send(std::span<const std::byte> message) override {
        if (!socket_) {
            return ENOTCONN;
        }
        ssize_t sent = 0;
        do {
            sent = ::mnl_socket_sendto(socket_.get(), message.data(), message.size());
        } while (sent < 0 && errno == EINTR);
        if (sent < 0) {
            return errno;
        }
        // The kernel does not respond to a part of a request.
        return static_cast<std::size_t>(sent) == message.size() ? 0 : EMSGSIZE;
    }

    Datagram receive(std::span<std::byte> buffer, Deadline deadline) override {
        if (!socket_) {
            return {.error = ENOTCONN};
        }
        const int fd = ::mnl_socket_get_fd(socket_.get());
        for (;;) {
            sockaddr_nl sender{};
            iovec part{.iov_base = buffer.data(), .iov_len = buffer.size()};
            msghdr message{};
            message.msg_name = &sender;
            message.msg_namelen = sizeof sender;
            message.msg_iov = &part;
            message.msg_iovlen = 1;
            const ssize_t got = ::recvmsg(fd, &message, MSG_DONTWAIT);
            if (got >= 0) {
                return {.error = 0,
                        .size = static_cast<std::size_t>(got),
                        .truncated = (message.msg_flags & MSG_TRUNC) != 0,
                        .sender = sender.nl_pid};
            }
            if (errno == EAGAIN) {
                if (const int error = awaitReadable(fd, deadline); error != 0) {
                    return {.error = error};
                }
            } else if (errno != EINTR) {
                return {.error = errno};
            }
        }
    }

  private:
    std::unique_ptr<mnl_socket, CloseSocket> socket_;
};

}  // namespace

std::unique_ptr<NetlinkTransport> kernelTransport() {
    return std::make_unique<KernelTransport>();
}

}  // namespace ZR::Live
