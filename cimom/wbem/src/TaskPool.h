#pragma once

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <deque>
#include <functional>
#include <map>
#include <mutex>
#include <thread>
#include <vector>

namespace cimom::wbem {

/// A fixed number of threads that run tasks in the order of their arrival, or at
/// a time. Tasks must not throw. Safe for concurrent use.
class TaskPool {
  public:
    using Task = std::function<void()>;
    using Clock = std::chrono::steady_clock;

    /// `waiting` tasks may wait for a thread.
    TaskPool(std::size_t threads, std::size_t waiting);
    /// Waits for the tasks that run, and forgets those that wait.
    ~TaskPool();
    TaskPool(const TaskPool&) = delete;
    TaskPool& operator=(const TaskPool&) = delete;

    /// False, and the task is not run, when too many wait or the pool has stopped.
    bool run(Task task);
    /// Runs a task once the delay is over. False when the pool has stopped.
    bool runAfter(Clock::duration delay, Task task);

    /// Takes no more tasks, and forgets those that wait; does not wait itself.
    void stop();

  private:
    void work();

    const std::size_t waiting_;
    std::mutex mutex_;
    std::condition_variable changed_;
    std::deque<Task> ready_;
    std::multimap<Clock::time_point, Task> later_;
    bool stopped_ = false;
    std::vector<std::thread> threads_;
};

}  // namespace cimom::wbem
