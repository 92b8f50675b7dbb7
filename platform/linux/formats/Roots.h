#pragma once

#include <string>
#include <string_view>

namespace ZR::Live {

/// Where the file systems of the machine begin. Elsewhere than at "/" only when a
/// machine's files have been laid out in some directory.
struct Roots {
    std::string files;           ///< stands before every absolute path but those of /proc
    std::string proc = "/proc";  ///< the process file system

    [[nodiscard]] std::string path(std::string_view absolute) const {
        return files + std::string{absolute};
    }

    bool operator==(const Roots&) const = default;
};

}  // namespace ZR::Live
