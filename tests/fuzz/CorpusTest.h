#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

namespace corpus {

/// A fuzz target: reads one input, and ends the process when something does not hold.
using Target = int(const std::uint8_t* data, std::size_t size);

struct NamedTarget {
    const char* name;
    Target* target;
};

/// All fuzz targets.
std::span<const NamedTarget> targets();

}  // namespace corpus
