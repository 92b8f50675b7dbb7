#include "TaskPool.h"

#include <utility>

namespace cimom::wbem {

TaskPool::TaskPool(std::size_t threads, std::size_t waiting) : waiting_(waiting) {
    threads_.reserve(threads);
    for (std::size_t count = 0; count < threads; ++count) {
        threads_.emplace_back([this] { work(); });
    }
}

TaskPool::~TaskPool() {
    stop();
    for (std::thread& thread : threads_) {
        thread.join();
    }
}

bool TaskPool::run(Task task) {
    {
        const std::lock_guard lock(mutex_);
        if (stopped_ || ready_.size() >= waiting_) {
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
        // What the tasks hold may be released without the lock only.
        ready.swap(ready_);
        later.swap(later_);
    }
    changed_.notify_all();
}

void TaskPool::work() {
    std::unique_lock lock(mutex_);
    while (!stopped_) {
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
        lock.unlock();
        task();
        task = nullptr;
        lock.lock();
    }
}

}  // namespace cimom::wbem
