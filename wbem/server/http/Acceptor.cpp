#include "http/Acceptor.h"

#include <poll.h>
#include <sys/eventfd.h>

#include <array>
#include <cerrno>
#include <system_error>
#include <utility>

namespace cimom::wbem {

namespace {

/// After that, the system may have descriptors or memory again.
constexpr int pauseMilliseconds = 100;
/// Then it is looked again whether the thread has to end: clients may come without end.
constexpr int mostAtOnce = 64;

ZR::UniqueFd newEvent() {
    ZR::UniqueFd event(::eventfd(0, EFD_CLOEXEC));
    if (!event) {
        throw std::system_error(errno, std::generic_category(), "eventfd");
    }
    return event;
}

/// What the next client in the queue has met with, and not the server.
bool isOfTheClient(int reason) noexcept {
    return reason == EINTR || reason == ECONNABORTED || reason == EPROTO || reason == EPERM ||
           reason == ENETDOWN || reason == EHOSTDOWN || reason == EHOSTUNREACH ||
           reason == ENETUNREACH;
}

}  // namespace

Acceptor::Acceptor(ListeningSocket socket, Take take)
    : socket_(std::move(socket)), take_(std::move(take)), end_(newEvent()) {
    thread_ = std::thread([this] { run(); });
}

Acceptor::~Acceptor() {
    const eventfd_t once = 1;
    // Cannot fail: the counter is far from its end.
    static_cast<void>(::eventfd_write(end_.get(), once));
    thread_.join();
}

void Acceptor::run() {
    std::array<pollfd, 2> ready{pollfd{end_.get(), POLLIN, 0}, pollfd{socket_.get(), POLLIN, 0}};
    bool resting = false;
    for (;;) {
        // While it rests, only the end wakes it: the socket stays readable.
        const int count =
            ::poll(ready.data(), resting ? 1 : ready.size(), resting ? pauseMilliseconds : -1);
        if (count > 0 && ready[0].revents != 0) {
            return;
        }
        resting = !takeSome();
    }
}

bool Acceptor::takeSome() {
    for (int count = 0; count < mostAtOnce; ++count) {
        sockaddr_storage client{};
        socklen_t length = sizeof client;
        const int taken = ::accept4(socket_.get(), reinterpret_cast<sockaddr*>(&client), &length,
                                    SOCK_NONBLOCK | SOCK_CLOEXEC);
        if (taken >= 0) {
            take_(taken, reinterpret_cast<const sockaddr*>(&client), length);
        } else if (!isOfTheClient(errno)) {
            return errno == EAGAIN;
        }
    }
    return true;
}

}  // namespace cimom::wbem
