#pragma once

#include <cerrno>
#include <string>
#include <system_error>

namespace ZR::Live {

/// What an errno means, in the words of strerror(3).
[[nodiscard]] inline std::string reasonOf(int error) {
    return std::generic_category().message(error);
}

/// Whether an errno says that a file or directory does not exist.
[[nodiscard]] inline bool isAbsent(int error) noexcept {
    return error == ENOENT || error == ENOTDIR;
}

}  // namespace ZR::Live
