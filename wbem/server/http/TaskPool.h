#pragma once

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <deque>
#include <functional>
#include <list>
#include <map>
#include <mutex>
#include <optional>
#include <thread>

namespace cimom::wbem {

/// Threads that run tasks in the order of their arrival, or at a time. Tasks must
/// not throw. Safe for concurrent use.
///
/// A thread whose task does not come back cannot be ended. Another one takes its
/// place, a fixed number of times; its own ends should the task come back after all.
class TaskPool {
  public:
    using Task = std::function<void()>;
    using Clock = std::chrono::steady_clock;

    /// `waiting` tasks may wait for a thread; `spares` threads may be replaced at a time.
    TaskPool(std::size_t threads, std::size_t waiting, std::size_t spares = 0);
    /// As end().
    ~TaskPool();
    TaskPool(const TaskPool&) = delete;
    TaskPool& operator=(const TaskPool&) = delete;

    /// False, and the task is not run, when too many wait, all threads are stuck and
    /// no further one is left, or the pool has stopped.
    bool run(Task task);
    /// Runs a task once the delay is over. False when the pool has stopped.
    bool runAfter(Clock::duration delay, Task task);

    /// Replaces the threads whose task has been running for longer than `patience`,
    /// as far as there are spares; how many.
    std::size_t replaceStuck(Clock::duration patience);

    /// Takes no more tasks, and forgets those that wait; does not wait itself.
    void stop();
    /// The same, and waits for the tasks that run. Not in a task of the pool.
    void end();

  private:
    struct Worker {
        std::thread thread;
        std::optional<Clock::time_point> since;  ///< of the task that it runs
        bool replaced = false;
        bool ended = false;
    };

    void startLocked();
    void work(Worker& self);

    const std::size_t waiting_;
    const std::size_t spares_;
    std::mutex mutex_;
    std::condition_variable changed_;
    std::deque<Task> ready_;
    std::multimap<Clock::time_point, Task> later_;
    bool stopped_ = false;
    bool exhausted_ = false;  ///< all are stuck, and there is no spare
    std::list<Worker> workers_;
};

}  // namespace cimom::wbem
