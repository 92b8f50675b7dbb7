#pragma once

#include <fcntl.h>
#include <sys/stat.h>

#include <array>
#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>
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
        std::error_code ignored;  // a directory that stays behind fails no test
        std::filesystem::remove_all(path_, ignored);
    }
    TemporaryDirectory(const TemporaryDirectory&) = delete;
    TemporaryDirectory& operator=(const TemporaryDirectory&) = delete;

    [[nodiscard]] const std::filesystem::path& path() const noexcept { return path_; }

    /// The path of an entry of the directory, whether there is one or not.
    [[nodiscard]] std::string operator/(std::string_view name) const {
        return (path_ / name).string();
    }

    // As the root directory of a machine: `below` begins with a slash.

    [[nodiscard]] std::string path(std::string_view below) const {
        return path_.string() + std::string(below);
    }
    /// Makes the directories on the way, too. Throws when the file cannot be written.
    void write(std::string_view below, std::string_view content) const {
        std::filesystem::create_directories(std::filesystem::path(path(below)).parent_path());
        put(below, content, std::ios::trunc);
    }
    void append(std::string_view below, std::string_view content) const {
        put(below, content, std::ios::app);
    }
    /// Sets when a file was last written, in seconds since the epoch.
    void age(std::string_view below, std::int64_t seconds) const {
        const timespec time{.tv_sec = static_cast<std::time_t>(seconds), .tv_nsec = 0};
        if (time.tv_sec != seconds) {
            throw std::invalid_argument("not a time on each processor: 32 bits end in 2038");
        }
        const std::array<timespec, 2> times{time, time};
        if (::utimensat(AT_FDCWD, path(below).c_str(), times.data(), 0) != 0) {
            throw std::system_error(errno, std::generic_category(), path(below));
        }
    }

  private:
    void put(std::string_view below, std::string_view content, std::ios::openmode mode) const {
        std::ofstream file(path(below), std::ios::binary | mode);
        file << content;
        file.close();
        if (!file) {
            throw std::runtime_error("cannot write " + path(below));
        }
    }

    std::filesystem::path path_;
};

/// All bytes of a file. Throws when it cannot be read.
inline std::string readFile(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    std::string content;
    std::array<char, 4096> piece{};
    while (file.read(piece.data(), piece.size()) || file.gcount() > 0) {
        content.append(piece.data(), static_cast<std::size_t>(file.gcount()));
    }
    if (!file.is_open() || file.bad()) {
        throw std::runtime_error("cannot read " + path);
    }
    return content;
}

/// Makes or overwrites a file with exactly these bytes. Throws when it cannot.
inline void writeFile(const std::string& path, std::string_view content) {
    std::ofstream file(path, std::ios::binary | std::ios::trunc);
    file.write(content.data(), static_cast<std::streamsize>(content.size()));
    file.close();
    if (!file) {
        throw std::runtime_error("cannot write " + path);
    }
}

/// How many descriptors this process has open, with the one that it takes to count them.
inline std::ptrdiff_t openDescriptors() {
    const std::filesystem::directory_iterator all("/proc/self/fd");
    return std::distance(begin(all), end(all));
}

}  // namespace ZR::Testing
