#pragma once

#include <chrono>
#include <memory>
#include <optional>

#include "zrcommon/UniqueFd.h"

namespace ZR {

class Snapshot;

/// What tells that a source may have changed.
struct ChangeSigns {
    UniqueFd descriptor;  ///< readable then, until changed() was called; may be none
    /// When to call changed() though nothing is readable; absent: there is no need to.
    std::optional<std::chrono::steady_clock::time_point> askAt;

    void askNoLaterThan(std::chrono::steady_clock::time_point time) {
        if (!askAt || time < *askAt) {
            askAt = time;
        }
    }
};

/// Where snapshots come from: a file, or the live machine. The service calls a
/// source from one thread at a time.
class SnapshotSource {
  public:
    SnapshotSource() = default;
    SnapshotSource(const SnapshotSource&) = delete;
    SnapshotSource& operator=(const SnapshotSource&) = delete;
    virtual ~SnapshotSource() = default;

    /// Whether something may have changed since the last read(). Never blocks;
    /// costs one system call while nothing changes, and one more while a response
    /// is awaited. True before the first read.
    [[nodiscard]] virtual bool changed() = 0;

    /// Whether a response is on its way that a later read() will tell of: one that may
    /// be slow is never waited for. Asks for it if that is due; reads nothing else.
    [[nodiscard]] virtual bool awaiting() { return false; }

    /// What to wait for before changed() is called again. The descriptor stays valid when the
    /// source ends. A source that cannot tell is asked once a second.
    [[nodiscard]] virtual ChangeSigns signs() {
        return {.descriptor = {}, .askAt = std::chrono::steady_clock::now() + slowest};
    }

    /// Reads the present state. Never returns null: what cannot be read is logged and
    /// left out. Throws nothing but std::bad_alloc, after which changed() is true.
    /// Waits for responses, as of the kernel or a bus, somewhat over a second at most.
    [[nodiscard]] virtual std::shared_ptr<const Snapshot> read() = 0;

  protected:
    /// What announces nothing is looked at as rarely as this, by who waits for changes.
    static constexpr std::chrono::seconds slowest{1};
};

}  // namespace ZR
