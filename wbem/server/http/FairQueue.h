#pragma once

#include <cstddef>
#include <deque>
#include <functional>
#include <map>
#include <mutex>
#include <utility>

#include "http/AddressShares.h"

namespace cimom::wbem {

/// Tasks of many addresses, which take turns however many tasks one of them has; known
/// addresses before others. Safe for concurrent use.
class FairQueue {
  public:
    using Task = std::function<void()>;

    /// Holds so many tasks at most.
    explicit FairQueue(std::size_t most) : most_(most) {}

    /// False when too many wait.
    [[nodiscard]] bool push(const AddressKey& key, bool known, Task task) {
        const std::lock_guard lock(mutex_);
        if (size_ >= most_) {
            return false;
        }
        (known ? known_ : strangers_)[key].push_back(std::move(task));
        ++size_;
        return true;
    }

    /// The next task, which must be there.
    [[nodiscard]] Task pop() {
        const std::lock_guard lock(mutex_);
        Waiting& waiting = known_.empty() ? strangers_ : known_;
        auto turn = waiting.upper_bound(last_);
        if (turn == waiting.end()) {
            turn = waiting.begin();
        }
        last_ = turn->first;
        Task task = std::move(turn->second.front());
        turn->second.pop_front();
        if (turn->second.empty()) {
            waiting.erase(turn);
        }
        --size_;
        return task;
    }

  private:
    using Waiting = std::map<AddressKey, std::deque<Task>>;

    const std::size_t most_;
    std::mutex mutex_;
    std::size_t size_ = 0;
    Waiting known_;
    Waiting strangers_;
    AddressKey last_{};  ///< whose turn it was
};

}  // namespace cimom::wbem
