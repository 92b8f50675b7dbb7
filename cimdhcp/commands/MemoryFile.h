#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "zrcommon/UniqueFd.h"

namespace cimdhcp {

// Files without a name that lie in memory. All throw std::system_error.

/// An empty one; the name is only what /proc shows.
[[nodiscard]] ZR::UniqueFd memoryFile(const char* name);

void writeWhole(int file, std::string_view text);

/// Everything from where the file stands to its end, of any kind of file. More than `largest`
/// bytes are EFBIG.
[[nodiscard]] std::string readWhole(int file, std::size_t largest = std::string::npos);

}  // namespace cimdhcp
