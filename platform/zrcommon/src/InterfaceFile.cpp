#include "zrcommon/InterfaceFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstring>

namespace ZR {

std::optional<std::string> InterfaceFile::path(const std::string& directory,
                                               const std::string& interfaceName) {
    const bool unusable = std::any_of(interfaceName.begin(), interfaceName.end(), [](char c) {
        const auto byte = static_cast<std::uint8_t>(c);
        return c == '/' || byte < 0x20 || byte == 0x7F;
    });
    if (unusable || interfaceName.empty() || interfaceName == "." || interfaceName == "..") {
        return std::nullopt;
    }
    return directory + std::string(prefix) + interfaceName;
}

std::optional<InterfaceFile::Obstacle> InterfaceFile::obstacle(const std::string& path) {
    const auto mayNot = [&path](int mode) {
        return ::faccessat(AT_FDCWD, path.c_str(), mode, AT_EACCESS) != 0;
    };
    if (mayNot(F_OK)) {
        const int error = errno;
        return Obstacle{path + ": " + std::strerror(error), error == EACCES};
    }
    struct stat status {};
    if (::stat(path.c_str(), &status) == 0 && !S_ISREG(status.st_mode)) {
        return Obstacle{path + " is not a regular file"};
    }
    for (const int mode : {R_OK, W_OK}) {
        if (mayNot(mode)) {
            const int error = errno;
            return Obstacle{path + " cannot be " + (mode == R_OK ? "read" : "written") + ": " +
                                std::strerror(error),
                            true};
        }
    }
    // Room that only the administrator may take does not count.
    struct statvfs system {};
    if (::statvfs(path.c_str(), &system) == 0 && system.f_bavail == 0) {
        return Obstacle{path + ": " + std::strerror(ENOSPC)};
    }
    return std::nullopt;
}

}  // namespace ZR
