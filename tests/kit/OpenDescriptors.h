#pragma once

#include <cstddef>
#include <filesystem>
#include <iterator>

namespace ZR::Testing {

/// How many descriptors this process has open, with the one that it takes to count them.
inline std::ptrdiff_t openDescriptors() {
    const std::filesystem::directory_iterator all("/proc/self/fd");
    return std::distance(begin(all), end(all));
}

}  // namespace ZR::Testing
