#include "formats/Files.h"

#include <dirent.h>

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <memory>
#include <system_error>

#include "zrcommon/File.h"

namespace ZR::Live {
namespace {

// Clients keep a few hundred bytes per lease and rewrite their files before long.
constexpr std::size_t largestFile = std::size_t{4} << 20U;

struct CloseDirectory {
    void operator()(DIR* directory) const noexcept {
        // Nothing was written through it that a failing close could lose.
        static_cast<void>(::closedir(directory));
    }
};

bool isAbsent(int error) {
    return error == ENOENT || error == ENOTDIR;
}

}  // namespace

std::string pathIn(const std::string& directory, std::string_view name) {
    std::string path;
    path.reserve(directory.size() + 1 + name.size());
    path.append(directory).append(1, '/').append(name);
    return path;
}

std::string unreadable(std::string_view path, int error) {
    return "cannot read " + std::string{path} + ": " + std::generic_category().message(error);
}

std::optional<std::string> readOptionalFile(const std::string& path,
                                            std::vector<std::string>& complaints) {
    auto content = File::read(path, largestFile);
    if (!content && !isAbsent(errno)) {
        complaints.push_back(unreadable(path, errno));
    }
    return content;
}

std::vector<std::string> listOptionalDirectory(const std::string& path,
                                               std::vector<std::string>& complaints) {
    std::vector<std::string> names;
    const std::unique_ptr<DIR, CloseDirectory> directory{::opendir(path.c_str())};
    if (!directory) {
        if (!isAbsent(errno)) {
            complaints.push_back(unreadable(path, errno));
        }
        return names;
    }
    for (;;) {
        errno = 0;
        const dirent* const entry = ::readdir(directory.get());
        if (entry == nullptr) {
            break;
        }
        const std::string_view name{&entry->d_name[0]};
        if (!name.starts_with('.')) {
            names.emplace_back(name);
        }
    }
    if (errno != 0) {
        complaints.push_back(unreadable(path, errno));
    }
    std::sort(names.begin(), names.end());
    return names;
}

}  // namespace ZR::Live
