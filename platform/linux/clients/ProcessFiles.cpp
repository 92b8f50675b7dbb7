#include "clients/ProcessFiles.h"

#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <climits>
#include <cstddef>
#include <string>

#include "formats/Files.h"

namespace ZR::Live {
namespace {

/// Empty when it cannot be read, for the reason that errno then has.
std::string readLink(const std::string& path) {
    std::array<char, PATH_MAX> target{};
    errno = 0;
    const ssize_t length = ::readlink(path.c_str(), target.data(), target.size());
    return length <= 0 ? std::string{}
                       : std::string(target.data(), static_cast<std::size_t>(length));
}

/// The name of a file that a process has open and that ends with this one; empty for none.
/// A client that has left the directory in which it was started still has its file.
std::string openFile(const std::string& process, std::string_view path) {
    const std::string end = '/' + std::string{path.substr(path.starts_with("./") ? 2 : 0)};
    const std::string descriptors = process + "/fd";
    Directory directory{descriptors};
    if (directory) {
        for (std::string_view name = directory.next(); !name.empty(); name = directory.next()) {
            std::string target = readLink(pathIn(descriptors, name));
            if (target.starts_with('/') && target.ends_with(end)) {
                return target;
            }
        }
    }
    return {};
}

/// Whether two names are those of one existing file or directory.
bool isSame(const std::string& one, const std::string& other) {
    struct stat first {};
    struct stat second {};
    return ::stat(one.c_str(), &first) == 0 && ::stat(other.c_str(), &second) == 0 &&
           first.st_dev == second.st_dev && first.st_ino == second.st_ino;
}

/// Whether a process is known to see other files under the same names.
bool seesOtherFiles(const Roots& roots, const std::string& process) {
    struct stat root {};
    if (::stat((process + "/root").c_str(), &root) != 0) {
        return false;
    }
    const std::string ownMounts = readLink(roots.proc + "/thread-self/ns/mnt");
    const std::string otherMounts = readLink(process + "/ns/mnt");
    return !isSame(roots.path("/"), process + "/root") ||
           (!ownMounts.empty() && !otherMounts.empty() && ownMounts != otherMounts);
}

}  // namespace

std::optional<ProcessFile> fileOfProcess(const Roots& roots, const ClientProcess& process,
                                         std::string_view path,
                                         std::vector<Diagnostic>& diagnostics) {
    const std::string directory = pathIn(roots.proc, std::to_string(process.pid));
    if (path.starts_with('/')) {
        return seesOtherFiles(roots, directory)
                   ? ProcessFile{.path = std::string{path}, .root = directory + "/root"}
                   : ProcessFile{.path = roots.path(path), .root = {}};
    }
    if (const std::string open = openFile(directory, path); !open.empty()) {
        return fileOfProcess(roots, process, open, diagnostics);
    }
    const std::string working = readLink(directory + "/cwd");
    const int error = errno;
    // The kernel names the directory from this process's root, or from that of the mounts of
    // the other one.
    for (const std::string& root : {std::string{}, directory + "/root"}) {
        const std::string place = root.empty() ? roots.path(working) : working;
        if (!working.empty() && isSame(root + place, directory + "/cwd")) {
            return ProcessFile{.path = pathIn(place, path), .root = root};
        }
    }
    if (working.empty() && isAbsent(error)) {
        return std::nullopt;  // the process has ended
    }
    diagnostics.emplace_back(
        "cannot tell where process " + std::to_string(process.pid) + " (" +
            std::string{nameOf(process.client)} + ") keeps " + std::string{path} + ": " +
            reasonOf(working.empty() ? error : ENOENT),
        working.empty() ? Diagnostic::Kind::Denied : Diagnostic::Kind::Unreadable);
    return std::nullopt;
}

}  // namespace ZR::Live
