#pragma once

#include <string>

namespace ZR::Live {

/// A directory that was read: all its files, or those of a name prefix.
struct WatchedPlace {
    std::string directory;
    std::string namePrefix;

    bool operator==(const WatchedPlace&) const = default;

    /// Whether changes there are noticed by whoever watches this place.
    [[nodiscard]] bool covers(const WatchedPlace& other) const {
        return directory == other.directory && other.namePrefix.starts_with(namePrefix);
    }
};

}  // namespace ZR::Live
