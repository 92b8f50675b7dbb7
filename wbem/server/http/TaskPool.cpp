#include "http/TaskPool.h"

#include <algorithm>
#include <system_error>
#include <utility>

namespace cimom::wbem {

TaskPool::TaskPool(std::size_t threads, std::size_t waiting, std::size_t spares)
    : waiting_(waiting), spares_(spares) {
    const std::lock_guard lock(mutex_);
    for (std::size_t count = 0; count < threads; ++count) {
        startLocked();
    }
}

TaskPool::~TaskPool() {
    end();
}

void TaskPool::end() {
    stop();
    for (Worker& worker : workers_) {
        if (worker.thread.joinable()) {
            worker.thread.join();
        }
    }
}

void TaskPool::startLocked() {
    Worker& worker = workers_.emplace_back();
    try {
        worker.thread = std::thread([this, &worker] { work(worker); });
    } catch (const std::system_error&) {
        workers_.pop_back();
        throw;
    }
}

std::size_t TaskPool::replaceStuck(Clock::duration patience) {
    const std::lock_guard lock(mutex_);
    // A worker that has ended does not hold the mutex, and is joined without waiting.
    std::erase_if(workers_, [](Worker& worker) {
        if (worker.ended) {
            worker.thread.join();
        }
        return worker.ended;
    });
    const Clock::time_point now = Clock::now();
    const auto isStuck = [&](const Worker& worker) {
        return worker.since && now - *worker.since > patience;
    };
    auto used = static_cast<std::size_t>(std::count_if(
        workers_.begin(), workers_.end(), [](const Worker& worker) { return worker.replaced; }));
    std::size_t replaced = 0;
    for (Worker& worker : workers_) {
        if (stopped_ || used == spares_) {
            break;
        }
        if (isStuck(worker) && !worker.replaced) {
            try {
                startLocked();
            } catch (const std::system_error&) {
                // The system has no more threads: as if there were no spare.
                break;
            }
            worker.replaced = true;
            ++used;
            ++replaced;
        }
    }
    exhausted_ = std::all_of(workers_.begin(), workers_.end(), isStuck);
    return replaced;
}

bool TaskPool::run(Task task) {
    {
        const std::lock_guard lock(mutex_);
        if (stopped_ || exhausted_ || ready_.size() >= waiting_) {
            return false;
        }
        ready_.push_back(std::move(task));
    }
    changed_.notify_one();
    return true;
}

bool TaskPool::runAfter(Clock::duration delay, Task task) {
    {
        const std::lock_guard lock(mutex_);
        if (stopped_) {
            return false;
        }
        later_.emplace(Clock::now() + delay, std::move(task));
    }
    changed_.notify_one();
    return true;
}

void TaskPool::stop() {
    std::deque<Task> ready;
    std::multimap<Clock::time_point, Task> later;
    {
        const std::lock_guard lock(mutex_);
        stopped_ = true;
        // What the tasks hold must be released without the lock.
        ready.swap(ready_);
        later.swap(later_);
    }
    changed_.notify_all();
}

void TaskPool::work(Worker& self) {
    std::unique_lock lock(mutex_);
    while (!stopped_ && !self.replaced) {
        Task task;
        if (!later_.empty() && later_.begin()->first <= Clock::now()) {
            task = std::move(later_.begin()->second);
            later_.erase(later_.begin());
        } else if (!ready_.empty()) {
            task = std::move(ready_.front());
            ready_.pop_front();
        } else if (later_.empty()) {
            changed_.wait(lock);
            continue;
        } else {
            const Clock::time_point next = later_.begin()->first;
            changed_.wait_until(lock, next);
            continue;
        }
        self.since = Clock::now();
        lock.unlock();
        task();
        task = nullptr;
        lock.lock();
        self.since.reset();
        exhausted_ = false;
    }
    self.ended = true;
}

}  // namespace cimom::wbem
