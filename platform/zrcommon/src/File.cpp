#include "zrcommon/File.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <system_error>

#include "zrcommon/Strings.h"
#include "zrcommon/UniqueFd.h"

namespace ZR {

namespace {

/// The system's functions would take what stands before a zero byte for the name.
bool isName(const std::string& path) {
    if (path.find('\0') == std::string::npos) {
        return true;
    }
    errno = ENOENT;
    return false;
}

/// What the system tells of an open file's size; nothing, with errno set, when it is
/// not a regular file or larger than the limit.
std::optional<std::size_t> sizeOf(const UniqueFd& fd, std::size_t limit) {
    struct stat status {};
    if (::fstat(fd.get(), &status) != 0) {
        return std::nullopt;
    }
    if (!S_ISREG(status.st_mode)) {
        errno = S_ISDIR(status.st_mode) ? EISDIR : EINVAL;
        return std::nullopt;
    }
    // A file may be larger than a process's memory could be.
    if (static_cast<std::uintmax_t>(status.st_size) > limit) {
        errno = EFBIG;
        return std::nullopt;
    }
    return static_cast<std::size_t>(status.st_size);
}

ssize_t readSome(const UniqueFd& fd, char* room, std::size_t size) {
    ssize_t got = 0;
    do {
        got = ::read(fd.get(), room, size);
    } while (got < 0 && errno == EINTR);
    return got;
}

}  // namespace

bool File::exists(const std::wstring& path) {
    const std::string name = make_string(path);
    struct stat status {};
    return isName(name) && ::stat(name.c_str(), &status) == 0;
}

std::optional<std::string> File::read(const std::string& path, std::size_t limit) {
    if (!isName(path)) {
        return std::nullopt;
    }
    // Non-blocking, so that a pipe in the file's place cannot hang the caller.
    const UniqueFd fd{::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY)};
    // A size that is too large is met before any room is taken for it.
    const auto size = fd ? sizeOf(fd, limit) : std::nullopt;
    if (!size) {
        return std::nullopt;
    }
    // One byte more than the size shows that the file ends there; files of /proc
    // and /sys tell no size.
    std::string content(std::max<std::size_t>(*size + 1, 4096), '\0');
    std::size_t filled = 0;
    for (;;) {
        const ssize_t got = readSome(fd, content.data() + filled, content.size() - filled);
        if (got < 0) {
            return std::nullopt;
        }
        filled += static_cast<std::size_t>(got);
        if (filled > limit) {
            errno = EFBIG;
            return std::nullopt;
        }
        if (got == 0) {
            content.resize(filled);
            return content;
        }
        if (filled == content.size()) {
            content.resize(2 * filled);
        }
    }
}

std::string reasonOf(int error) {
    return std::generic_category().message(error);
}

bool isAbsent(int error) noexcept {
    return error == ENOENT || error == ENOTDIR;
}

}  // namespace ZR
