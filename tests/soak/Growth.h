#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace test {

/// What a process holds at one time.
struct Sample {
    std::uint64_t requests = 0;     ///< served so far
    std::uint64_t residentKiB = 0;  ///< resident memory
    std::uint64_t descriptors = 0;  ///< open

    bool operator==(const Sample&) const = default;
};

/// What this process holds now. Throws std::runtime_error where /proc does not tell.
[[nodiscard]] Sample takeSample(std::uint64_t requests);

/// How much more a process may hold at the end of the second half than at its beginning.
struct Bounds {
    std::uint64_t residentKiB = 1024;
    std::uint64_t descriptors = 0;
};

/// What has grown too much in the second half, in words; empty when nothing has. The
/// first half is for what is made once and kept.
[[nodiscard]] std::string growth(const std::vector<Sample>& samples, const Bounds& bounds);

/// The samples as a JSON document, which docs/figures/soak.py draws.
[[nodiscard]] std::string toJson(const std::vector<Sample>& samples);

}  // namespace test
