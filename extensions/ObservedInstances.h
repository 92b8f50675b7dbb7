#pragma once

#include <cmpift.h>

#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

/// The instances of one class as they were seen last, and how they differ from those seen now.
namespace ZR::DHCPClientExtensions {

/// A copy of an instance that is independent of the request in which it was got.
struct ReleaseInstance {
    void operator()(CMPIInstance* instance) const noexcept;
};
using InstanceCopy = std::unique_ptr<CMPIInstance, ReleaseInstance>;

/// Class and keys of an instance as the model path of an indication has them, without the
/// namespace: CLASS.KEY="VALUE",... Empty for one without a path.
[[nodiscard]] std::string modelPath(const CMPIInstance* instance);

/// Whether all properties agree. Points in time agree within a second: those that follow from
/// what is left of a time differ by that much from one reading to the next.
[[nodiscard]] bool sameState(const CMPIInstance* one, const CMPIInstance* other);

/// An instance that came, changed or went. Borrows from what it was made of.
struct Difference {
    const std::string* path = nullptr;
    const CMPIInstance* before = nullptr;  ///< null: it came
    const CMPIInstance* after = nullptr;   ///< null: it went
};

class ObservedInstances {
  public:
    /// Compares with what was seen before, gives each difference to `tell`, those that went
    /// first, and keeps what is seen now. The first time nothing is told.
    /// Throws std::bad_alloc, and what `tell` throws: then what was not told is told next time.
    template <typename Tell>
    void see(const std::vector<const CMPIInstance*>& now, Tell&& tell);

  private:
    /// In `next`, all of them with their paths; those of one path once.
    [[nodiscard]] static std::vector<std::pair<std::string, const CMPIInstance*>> named(
        const std::vector<const CMPIInstance*>& instances);
    [[nodiscard]] static InstanceCopy copyOf(const CMPIInstance* instance);

    std::unordered_map<std::string, InstanceCopy> known_;
    bool seen_ = false;
};

template <typename Tell>
void ObservedInstances::see(const std::vector<const CMPIInstance*>& now, Tell&& tell) {
    const auto present = named(now);
    std::unordered_map<std::string_view, const CMPIInstance*> byPath;
    for (const auto& [path, instance] : present) {
        byPath.emplace(path, instance);
    }
    for (auto known = known_.begin(); known != known_.end();) {
        if (byPath.contains(known->first)) {
            ++known;
            continue;
        }
        tell(Difference{&known->first, known->second.get(), nullptr});
        known = known_.erase(known);
    }
    for (const auto& [path, instance] : present) {
        const auto known = known_.find(path);
        if (known == known_.end()) {
            InstanceCopy copy = copyOf(instance);
            if (seen_) {
                tell(Difference{&path, nullptr, instance});
            }
            known_.emplace(path, std::move(copy));
        } else if (!sameState(known->second.get(), instance)) {
            // The copy that agrees stays, so that small differences cannot add up unseen.
            InstanceCopy copy = copyOf(instance);
            tell(Difference{&path, known->second.get(), instance});
            known->second = std::move(copy);
        }
    }
    seen_ = true;
}

}  // namespace ZR::DHCPClientExtensions
