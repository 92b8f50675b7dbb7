#pragma once

#include <poll.h>

#include <cstddef>
#include <cstdint>
#include <map>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "kernel/NetworkChanges.h"
#include "kernel/WatchedPlace.h"
#include "zrclient/Diagnostic.h"
#include "zrcommon/UniqueFd.h"

namespace ZR::Live {

/// Learns that something changed: links and addresses by an rtnetlink
/// subscription, files by inotify on their directories, the end of processes by
/// descriptors of them. Of a directory that does not exist the nearest existing
/// ancestor is watched for its coming.
///
/// What happens after begin() makes changed() true. Too many events to be kept,
/// or a machine that refuses to watch, do so too: what cannot be known to be
/// unchanged counts as changed.
class ChangeMonitor {
  public:
    ChangeMonitor() = default;

    /// Watches exactly these places from now on and forgets what happened before.
    /// To be called before the state is read, so that nothing falls in between.
    void begin(const std::vector<WatchedPlace>& places, std::vector<Diagnostic>& diagnostics);

    /// Watches these processes for their end, and no others. One that has ended
    /// already counts as a change. Where the kernel cannot watch processes (before
    /// Linux 5.3) their end shows with whatever else changes next.
    void watchProcesses(std::span<const std::int32_t> pids);

    /// Whether something happened since begin(); one system call if nothing did.
    /// Stays true until the next begin(). Never blocks.
    [[nodiscard]] bool changed();

    /// What becomes readable when changed() may become true, or when the other descriptor does
    /// (-1: none), which counts until it is closed. Made when it is first asked for. None where
    /// that is not possible.
    [[nodiscard]] UniqueFd sign(int other = -1);

    /// Whether something happened that cannot be announced any more.
    [[nodiscard]] bool isMarked() const noexcept { return changed_; }
    /// Whether something cannot be watched, so that changed() is always true.
    [[nodiscard]] bool isBlind() const noexcept { return blind_; }

    /// What changed of the network since this was last asked, as far as changed() and begin()
    /// have heard of it; all, at first.
    [[nodiscard]] NetworkChanges takeNetworkChanges() {
        return std::exchange(network_, NetworkChanges{.all = false});
    }

    /// Makes changed() true until the next begin().
    void markChanged() noexcept { changed_ = true; }

  private:
    struct Interest {
        std::string name;
        bool ancestor = false;  // wait for this very name, else: for names beginning so
    };
    using Interests = std::map<int, std::vector<Interest>>;

    struct Arming;

    void openSubscription(std::vector<Diagnostic>& diagnostics);
    void openWatches(std::vector<Diagnostic>& diagnostics);
    void watchAll(const std::vector<WatchedPlace>& places, std::vector<Diagnostic>& diagnostics);
    void watch(const WatchedPlace& place, Arming& arming, std::vector<Diagnostic>& diagnostics);
    int watchAncestor(std::string directory, Arming& arming) const;
    void announce(int descriptor);
    bool drainSubscription();
    void note(std::span<const std::byte> message, std::size_t size);
    bool drainWatches();
    bool concerns(int watch, std::uint32_t mask, std::string_view name);

    UniqueFd subscription_;
    NetworkChanges network_;
    UniqueFd watches_;
    Interests interests_;
    std::map<std::int32_t, UniqueFd> processes_;
    UniqueFd announced_;         // an epoll set of all the above, once one waits for them
    std::vector<pollfd> asked_;  // kept for its memory
    std::vector<WatchedPlace> places_;
    bool blind_ = true;  // something cannot be watched at all
    bool rearm_ = true;  // a watch has ended, or one nearer to its aim is possible
    bool changed_ = true;
};

}  // namespace ZR::Live
