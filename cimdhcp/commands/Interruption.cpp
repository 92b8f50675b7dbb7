#include "commands/Interruption.h"

#include <sys/eventfd.h>
#include <unistd.h>

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <string>

#include "text/Failure.h"

namespace cimdhcp {

namespace {

std::atomic<bool> wish = false;
std::atomic<int> wishDescriptor = -1;
static_assert(std::atomic<bool>::is_always_lock_free && std::atomic<int>::is_always_lock_free,
              "a signal handler may touch no other");

extern "C" void noteWish(int /*signal*/) {
    const int error = errno;
    wish = true;
    constexpr std::uint64_t one = 1;
    // It cannot fail: the sum of two signals is far from the counter's end.
    static_cast<void>(::write(wishDescriptor, &one, sizeof one) == sizeof one);
    errno = error;
}

}  // namespace

Interruption::Interruption() : descriptor_(::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {
    if (!descriptor_) {
        throw Failure(ExitStatus::notLoaded,
                      std::string("cannot wait for signals: ") + std::strerror(errno));
    }
    wish = false;
    wishDescriptor = descriptor_.get();
    struct ::sigaction action {};
    action.sa_handler = &noteWish;
    // The second signal finds what was there before.
    action.sa_flags = static_cast<int>(SA_RESETHAND);
    ::sigemptyset(&action.sa_mask);
    ::sigaction(SIGINT, &action, &beforeInterrupt_);
    ::sigaction(SIGTERM, &action, &beforeTermination_);
}

Interruption::~Interruption() {
    ::sigaction(SIGINT, &beforeInterrupt_, nullptr);
    ::sigaction(SIGTERM, &beforeTermination_, nullptr);
    wishDescriptor = -1;
}

const std::atomic<bool>& Interruption::wanted() const noexcept {
    return wish;
}

}  // namespace cimdhcp
