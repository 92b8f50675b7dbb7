#include "broker/RequestScope.h"

#include <algorithm>

namespace cimom::broker {

namespace {

/// The innermost running request; plain so that reading it needs no guard.
thread_local constinit RequestScope* innermost = nullptr;

}  // namespace

/// What a thread has when it runs no request: ended with the thread.
struct RequestScope::OfThread {
    std::unique_ptr<RequestScope> scope;
    bool attached = false;

    static OfThread& get() {
        thread_local OfThread instance;
        return instance;
    }
    RequestScope& make(unsigned depth) {
        scope = std::make_unique<RequestScope>(Detached{depth});
        return *scope;
    }
};

RequestScope::RequestScope() : outer_(innermost), depth_(depthOfThread() + 1) {
    innermost = this;
}

RequestScope::~RequestScope() {
    if (innermost == this) {
        innermost = outer_;
    }
}

RequestScope& RequestScope::current() {
    if (innermost != nullptr) {
        return *innermost;
    }
    OfThread& own = OfThread::get();
    return own.scope ? *own.scope : own.make(0);
}

unsigned RequestScope::depthOfThread() noexcept {
    if (innermost != nullptr) {
        return innermost->depth_;
    }
    const OfThread& own = OfThread::get();
    return own.scope ? own.scope->depth_ : 0;
}

bool RequestScope::attachThread(unsigned depth) {
    OfThread& own = OfThread::get();
    if (innermost != nullptr || own.attached) {
        return false;
    }
    // What the thread made before it attached stays valid.
    if (own.scope) {
        own.scope->depth_ = depth;
    } else {
        own.make(depth);
    }
    own.attached = true;
    return true;
}

bool RequestScope::detachThread() noexcept {
    OfThread& own = OfThread::get();
    if (innermost != nullptr || !own.attached) {
        return false;
    }
    own.scope.reset();
    own.attached = false;
    return true;
}

const void* RequestScope::mark() {
    levels_.push_back(std::make_unique<Arena>());
    return levels_.back().get();
}

bool RequestScope::release(const void* level) noexcept {
    const auto found = std::find_if(levels_.begin(), levels_.end(),
                                    [level](const auto& one) { return one.get() == level; });
    if (found == levels_.end()) {
        return false;
    }
    levels_.erase(found, levels_.end());
    return true;
}

}  // namespace cimom::broker
