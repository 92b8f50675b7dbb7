#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <memory>
#include <mutex>
#include <vector>

#include "zrclient/Snapshot.h"
#include "zrclient/SnapshotSource.h"

namespace ZR {

/// Keeps the newest snapshot for the process. Safe to use from many threads.
///
/// Nothing is read ahead of the first request, no thread is started, and with
/// nothing changed a snapshot is handed out for the price of one poll.
class InstrumentationService {
  public:
    /// How the running machine is opened as a source; never null.
    using OpenMachine = std::unique_ptr<SnapshotSource> (*)();

    /// The service of this process (of this library, when linked into one). Its
    /// source is the tree that the platform settings name, else the running machine,
    /// opened on first use.
    static InstrumentationService& process();

    /// Tells how the running machine is opened. The service knows no operating system:
    /// a library or a program that has one calls this before its first request. Without
    /// it, and without a tree in the settings, snapshots are empty.
    static void setMachine(OpenMachine open) noexcept;

    /// The first current() waits until the source awaits no response any more, at most
    /// `firstWait`; for that of the process, the platform settings tell how long.
    explicit InstrumentationService(std::unique_ptr<SnapshotSource> source = nullptr,
                                    std::chrono::milliseconds firstWait = {});

    /// The newest state: polls the source, and reads it when it changed.
    [[nodiscard]] std::shared_ptr<const Snapshot> current();

    /// Waits until the source awaits no response any more, at most that long.
    void settle(std::chrono::milliseconds limit);

    /// Whether the source awaits a response, for which it may ask now. Reads nothing.
    [[nodiscard]] bool awaiting();

    /// The state that was read last, without polling; reads once if there is none.
    [[nodiscard]] std::shared_ptr<const Snapshot> latest();

    /// Replaces the source; the next current() reads it. Cursors keep what they hold.
    void useSource(std::unique_ptr<SnapshotSource> source);

    /// A wait for snapshots, for one thread at a time; none is started. While there is none,
    /// nothing is done that no request asks for. Ends before the service.
    class Waiter {
      public:
        /// Throws std::system_error when the system has no descriptor left.
        explicit Waiter(InstrumentationService& service);
        ~Waiter();
        Waiter(const Waiter&) = delete;
        Waiter& operator=(const Waiter&) = delete;

        /// Waits until there is another snapshot than the one given, whoever has read it, and
        /// returns the newest; at once if that is so already. Null after stop(). Of what
        /// changes quickly, not every state is seen. Throws std::bad_alloc.
        [[nodiscard]] std::shared_ptr<const Snapshot> next(
            const std::shared_ptr<const Snapshot>& known);

        /// Lets next() return the newest snapshot at once, though it may be the known one.
        /// From any thread.
        void refresh() noexcept;

        /// Ends the wait, and all to come. From any thread.
        void stop() noexcept;

      private:
        friend class InstrumentationService;

        void wake() const noexcept;
        [[nodiscard]] bool wait(const ChangeSigns& signs) const;

        InstrumentationService& service_;
        UniqueFd event_;
        std::atomic<bool> stopped_{false};
        std::atomic<bool> refreshed_{false};
    };

    /// How often a source was read since the start.
    [[nodiscard]] std::uint64_t readings() const noexcept { return readings_.load(); }

  private:
    [[nodiscard]] SnapshotSource& openedSource();
    [[nodiscard]] std::shared_ptr<const Snapshot> published();
    std::shared_ptr<const Snapshot> readSource();
    [[nodiscard]] ChangeSigns signs();
    void wakeWaiters() noexcept;

    // Two locks, so that latest() never waits for a reading under way. The first
    // is held while the source is asked, the second only to copy or swap the
    // pointer; who takes both takes them in this order.
    std::mutex sourceMutex_;
    std::unique_ptr<SnapshotSource> source_;
    std::mutex snapshotMutex_;
    std::shared_ptr<const Snapshot> snapshot_;
    std::mutex waitersMutex_;
    std::vector<Waiter*> waiters_;
    std::atomic<std::uint64_t> readings_{0};
    // Taken by the first current(), so that none waits later on.
    std::atomic<std::chrono::milliseconds> firstWait_;
};

}  // namespace ZR
