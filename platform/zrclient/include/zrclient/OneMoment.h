#pragma once

#include <memory>

namespace ZR {

class Snapshot;

/// As long as it lives, every cursor that this thread places stands in one snapshot:
/// the newest one at the time when the first node type is selected. A request that
/// places cursors one after the other, and inside of each other, thus tells of one
/// moment, and asks the source once. Of several that are nested the outermost counts.
class OneMoment {
  public:
    OneMoment() noexcept;
    ~OneMoment();
    OneMoment(const OneMoment&) = delete;
    OneMoment& operator=(const OneMoment&) = delete;

    /// What a cursor that selects a node type gets on this thread.
    [[nodiscard]] static std::shared_ptr<const Snapshot> current();
    /// What a cursor that selects a path gets.
    [[nodiscard]] static std::shared_ptr<const Snapshot> latest();

  private:
    OneMoment* outer_;
    std::shared_ptr<const Snapshot> snapshot_;
};

}  // namespace ZR
