#pragma once

#include <dirent.h>

#include <cerrno>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "zrclient/Diagnostic.h"

namespace ZR::Live {

/// What an errno means, in the words of strerror(3).
[[nodiscard]] inline std::string reasonOf(int error) {
    return std::generic_category().message(error);
}

/// Whether an errno says that a file or directory does not exist.
[[nodiscard]] inline bool isAbsent(int error) noexcept {
    return error == ENOENT || error == ENOTDIR;
}

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

/// An open directory.
class Directory {
  public:
    /// Opens it; where that fails, errno says why and the object is false.
    explicit Directory(const std::string& path) noexcept : handle_(::opendir(path.c_str())) {}

    explicit operator bool() const noexcept { return handle_ != nullptr; }

    /// For the calls that end in "at". Belongs to the directory.
    [[nodiscard]] int descriptor() const noexcept { return ::dirfd(handle_.get()); }

    /// The next name, valid until the next call; empty behind the last one, with errno 0,
    /// and where reading fails, with the errno of that.
    [[nodiscard]] std::string_view next() noexcept {
        errno = 0;
        const dirent* const entry = ::readdir(handle_.get());
        return entry == nullptr ? std::string_view{} : std::string_view{&entry->d_name[0]};
    }

  private:
    struct Close {
        void operator()(DIR* directory) const noexcept {
            // Nothing was written through it that a failing close could lose.
            static_cast<void>(::closedir(directory));
        }
    };
    std::unique_ptr<DIR, Close> handle_;
};

/// The content of a file that need not exist; nullopt without it. When it exists and
/// cannot be read, a diagnostic is added.
[[nodiscard]] std::optional<std::string> readOptionalFile(const std::string& path,
                                                          std::vector<Diagnostic>& diagnostics);

/// The names in a directory that need not exist, sorted, without those that begin
/// with a point: such are half-written files waiting to be renamed.
[[nodiscard]] std::vector<std::string> listOptionalDirectory(const std::string& path,
                                                             std::vector<Diagnostic>& diagnostics);

/// DIRECTORY/NAME
[[nodiscard]] std::string pathIn(const std::string& directory, std::string_view name);

/// "cannot read PATH: REASON"
[[nodiscard]] Diagnostic unreadable(std::string_view path, int error);

}  // namespace ZR::Live
