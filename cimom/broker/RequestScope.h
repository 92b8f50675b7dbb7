#pragma once

#include <memory>
#include <vector>

#include "broker/Arena.h"

namespace cimom::broker {

/// The lifetime of what one provider call makes: objects that the broker hands
/// out on this thread live in the scope's memory until the scope ends.
///
/// Scopes nest when a provider asks the broker for another provider's objects.
/// Used by one thread only.
class RequestScope {
  public:
    /// How many requests may be nested in each other by way of the broker.
    static constexpr unsigned deepest = 16;

    /// Makes the scope the current one of this thread, until it ends.
    RequestScope();
    ~RequestScope();
    RequestScope(const RequestScope&) = delete;
    RequestScope& operator=(const RequestScope&) = delete;

    /// The innermost scope of this thread. A thread that neither runs a request
    /// nor has attached itself gets one that ends with the thread: calling the
    /// broker from it is against the rules, but costs memory and no crash.
    static RequestScope& current();

    /// How many requests this thread is inside of; 0 outside of any.
    static unsigned depthOfThread() noexcept;

    /// Gives a thread of a provider a scope of its own; `depth` is that of the
    /// request it works for. False when the thread has one already.
    static bool attachThread(unsigned depth);
    /// Ends that scope. False when the thread has none.
    static bool detachThread() noexcept;

    /// Where new objects go: the innermost level.
    [[nodiscard]] Arena& arena() noexcept { return levels_.empty() ? base_ : *levels_.back(); }

    /// Opens a nested level; the pointer names it.
    const void* mark();
    /// Ends the level and those opened after it. False for an unknown one.
    bool release(const void* level) noexcept;

  private:
    struct OfThread;
    struct Detached {
        unsigned depth;
    };

  public:
    /// The scope of a thread outside of any request; only this class can name
    /// the parameter.
    explicit RequestScope(Detached detached) noexcept : depth_(detached.depth) {}

  private:
    Arena base_;
    std::vector<std::unique_ptr<Arena>> levels_;
    RequestScope* outer_ = nullptr;
    unsigned depth_ = 0;
};

}  // namespace cimom::broker
