#pragma once

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <filesystem>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <thread>

#include "IndicationQueue.h"
#include "indications/SubscriptionSettings.h"
#include "transport/HttpConnection.h"

namespace cimom::wbem {

/// One listener: the queue of what it is to get, and the thread that hands it over. A
/// listener that is silent keeps no other waiting. Safe for concurrent use.
class Delivery {
  public:
    using Clock = std::chrono::steady_clock;

    struct Listener {
        std::string name;  ///< of the destination, for the log
        HttpUrl url;
        std::string context;  ///< of its sequence numbers
        std::filesystem::path queue;
    };

    /// Begins with what waits in the file of the queue. `failing` is called in the thread each
    /// time the listener has failed for the settings' time, without a lock held; it must only
    /// take note.
    Delivery(Listener listener, DeliverySettings settings, SubscriptionLog log,
             std::function<void()> failing);
    /// Ends the thread; what waits stays in the file.
    ~Delivery();
    Delivery(const Delivery&) = delete;
    Delivery& operator=(const Delivery&) = delete;

    /// Queues an indication, as indicationText() writes it.
    void add(std::string indication);
    /// Lets the thread end soon, without waiting for it. For ends of several at once.
    void stop() noexcept;
    /// Ends the thread, and gives up what waits and its file.
    void discard();

  private:
    enum class Outcome {
        delivered,
        refused,  ///< not tried again: the listener does not want this one
        failed,
    };
    struct Attempt {
        Outcome outcome = Outcome::delivered;
        std::string reason;
    };

    void run();
    void deliverFirst(std::unique_lock<std::mutex>& lock);
    Attempt attempt(const IndicationQueue::Entry& entry);
    Attempt post(const IndicationQueue::Entry& entry);
    void tellDrops();
    void endThread();
    [[nodiscard]] std::string who() const;

    const Listener listener_;
    const DeliverySettings settings_;
    const SubscriptionLog log_;
    const std::function<void()> failing_;
    std::atomic<bool> stopping_{false};     ///< no further attempt is begun
    std::atomic<bool> interrupted_{false};  ///< one that is under way ends

    std::mutex mutex_;
    std::condition_variable wake_;
    IndicationQueue queue_;
    bool sending_ = false;     ///< the first one of the queue is on its way
    std::size_t dropped_ = 0;  ///< and not yet told of
    Clock::time_point tellAgain_{};
    Clock::time_point stopped_{};
    bool over_ = false;  ///< the thread is about to end

    // Of the thread alone.
    std::optional<HttpConnection> connection_;
    std::optional<std::uint64_t> tried_;  ///< the indication that has failed last
    unsigned failures_ = 0;               ///< of that one
    std::optional<Clock::time_point> failingSince_;
    bool failureTold_ = false;

    std::thread thread_;
};

}  // namespace cimom::wbem
