#include "formats/Files.h"

#include <algorithm>
#include <cerrno>
#include <cstddef>

#include "zrcommon/File.h"

namespace ZR::Live {
namespace {

// Clients keep a few hundred bytes per lease and rewrite their files before long.
constexpr std::size_t largestFile = std::size_t{4} << 20U;

}  // namespace

std::string pathIn(const std::string& directory, std::string_view name) {
    std::string path;
    path.reserve(directory.size() + 1 + name.size());
    path.append(directory).append(1, '/').append(name);
    return path;
}

Diagnostic unreadable(std::string_view path, int error) {
    return Diagnostic{"cannot read " + std::string{path} + ": " + reasonOf(error),
                      error == EACCES || error == EPERM ? Diagnostic::Kind::Denied
                                                        : Diagnostic::Kind::Unreadable};
}

std::optional<std::string> readOptionalFile(const std::string& path,
                                            std::vector<Diagnostic>& diagnostics) {
    auto content = File::read(path, largestFile);
    if (!content && !isAbsent(errno)) {
        diagnostics.push_back(unreadable(path, errno));
    }
    return content;
}

std::vector<std::string> listOptionalDirectory(const std::string& path,
                                               std::vector<Diagnostic>& diagnostics) {
    std::vector<std::string> names;
    Directory directory{path};
    if (!directory) {
        if (!isAbsent(errno)) {
            diagnostics.push_back(unreadable(path, errno));
        }
        return names;
    }
    for (std::string_view name = directory.next(); !name.empty(); name = directory.next()) {
        if (!name.starts_with('.')) {
            names.emplace_back(name);
        }
    }
    if (errno != 0) {
        diagnostics.push_back(unreadable(path, errno));
    }
    std::sort(names.begin(), names.end());
    return names;
}

}  // namespace ZR::Live
