#include "commands/Interruption.h"

namespace cimdhcp {

namespace {

std::atomic<bool> wish = false;
static_assert(std::atomic<bool>::is_always_lock_free, "a signal handler may set no other");

extern "C" void noteWish(int /*signal*/) {
    wish = true;
}

}  // namespace

Interruption::Interruption() {
    wish = false;
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
}

const std::atomic<bool>& Interruption::wanted() const noexcept {
    return wish;
}

}  // namespace cimdhcp
