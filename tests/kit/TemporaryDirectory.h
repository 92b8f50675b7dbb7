#pragma once

#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <string_view>
#include <system_error>

namespace ZR::Testing {

/// A directory of one test's own; removed with all that is in it at the end.
class TemporaryDirectory {
  public:
    TemporaryDirectory() {
        std::string name = (std::filesystem::temp_directory_path() / "zr-test-XXXXXX").string();
        if (::mkdtemp(name.data()) == nullptr) {
            throw std::system_error(errno, std::generic_category(), name);
        }
        path_ = name;
    }
    ~TemporaryDirectory() {
        std::error_code ignored;  // a left-over directory is no reason to fail
        std::filesystem::remove_all(path_, ignored);
    }
    TemporaryDirectory(const TemporaryDirectory&) = delete;
    TemporaryDirectory& operator=(const TemporaryDirectory&) = delete;

    [[nodiscard]] const std::filesystem::path& path() const noexcept { return path_; }

    /// The path of an entry of the directory, whether there is one or not.
    [[nodiscard]] std::string operator/(std::string_view name) const {
        return (path_ / name).string();
    }

  private:
    std::filesystem::path path_;
};

}  // namespace ZR::Testing
