#pragma once

#include <dirent.h>

#include <cerrno>
#include <memory>
#include <string>
#include <string_view>

namespace ZR::Live {

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

}  // namespace ZR::Live
