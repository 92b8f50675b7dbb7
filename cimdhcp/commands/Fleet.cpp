#include "commands/Fleet.h"

#include <algorithm>
#include <condition_variable>
#include <deque>
#include <exception>
#include <mutex>
#include <system_error>
#include <thread>
#include <utility>

namespace cimdhcp {

namespace {

/// The reports on their way from the threads that ask to the one that shows them.
class Reports {
  public:
    explicit Reports(std::size_t askers) : askers_(askers) {}

    void put(ServerReport&& report) {
        {
            const std::lock_guard lock(mutex_);
            waiting_.push_back(std::move(report));
        }
        changed_.notify_one();
    }

    void endAsker() {
        {
            const std::lock_guard lock(mutex_);
            --askers_;
        }
        changed_.notify_one();
    }

    /// None when all askers have ended.
    std::optional<ServerReport> take() {
        std::unique_lock lock(mutex_);
        changed_.wait(lock, [this] { return !waiting_.empty() || askers_ == 0; });
        if (waiting_.empty()) {
            return std::nullopt;
        }
        ServerReport report = std::move(waiting_.front());
        waiting_.pop_front();
        return report;
    }

  private:
    std::mutex mutex_;
    std::condition_variable changed_;
    std::deque<ServerReport> waiting_;
    std::size_t askers_;
};

Outcome guarded(const AskServer& ask, const ServerUrl& server) {
    Outcome outcome;
    try {
        outcome = ask(server);
    } catch (const Failure& failure) {
        outcome.failure = failure;
    } catch (const std::exception& exception) {
        outcome.failure = Failure(ExitStatus::notLoaded, exception.what());
    }
    return outcome;
}

}  // namespace

void askFleet(const std::vector<ServerUrl>& servers, std::size_t parallel, const AskServer& ask,
              const std::function<void(ServerReport&&)>& arrived,
              const std::atomic<bool>& interrupted) {
    const std::size_t askers = std::min(std::max<std::size_t>(parallel, 1), servers.size());
    Reports reports(askers);
    std::atomic<std::size_t> next = 0;
    const auto work = [&] {
        for (std::size_t server = next++; server < servers.size() && !interrupted;
             server = next++) {
            const auto start = std::chrono::steady_clock::now();
            Outcome outcome = guarded(ask, servers[server]);
            reports.put({server, std::move(outcome), std::chrono::steady_clock::now() - start});
        }
        reports.endAsker();
    };
    // The threads end before anything that they use: jthread joins.
    std::vector<std::jthread> threads;
    for (std::size_t asker = 0; asker < askers; ++asker) {
        try {
            threads.emplace_back(work);
        } catch (const std::system_error&) {
            if (threads.empty()) {
                throw;
            }
            reports.endAsker();  // the system has no more threads: fewer do the work
        }
    }
    while (auto report = reports.take()) {
        arrived(*std::move(report));
    }
}

}  // namespace cimdhcp
