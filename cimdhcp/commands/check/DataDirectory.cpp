#include "commands/check/Findings.h"

#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <system_error>

#include "text/DisplayText.h"
#include "zrcommon/InterfaceFile.h"
#include "zrcommon/PlatformSettings.h"

namespace cimdhcp {

namespace {

namespace fs = std::filesystem;
using Verdict = Finding::Verdict;

constexpr const char* dataDirectory = "data directory";

/// The one of the directories that a directory is, or lies in; empty: none. Compared as
/// the file system does, so that links and mounts hide nothing.
fs::path sourcedAbove(const fs::path& directory, const std::vector<fs::path>& sourced) {
    std::error_code error;
    // Without the separator at its end, behind which there would be an empty name.
    fs::path place = fs::weakly_canonical(directory / ".", error);
    for (bool more = !error; more; place = place.parent_path()) {
        for (const fs::path& each : sourced) {
            if (fs::equivalent(place, each, error)) {
                return each;
            }
        }
        more = place != place.parent_path();
    }
    return {};
}

/// What this user may not do, for one finding, however many files it is about.
class Refusals {
  public:
    void tryAccess(const fs::path& path, int mode) {
        if (::access(path.c_str(), mode) != 0) {
            const int error = errno;  // making texts may change it
            ++count_;
            if (first_.empty()) {
                first_ = printable(path.filename().string()) + ": " + std::strerror(error);
            }
        }
    }

    [[nodiscard]] std::string text(const std::string& doing) const {
        return count_ == 0 ? ""
                           : "; this user may not " + doing + ' ' +
                                 counted(count_, "file", "files") + " (" + first_ + ")";
    }

  private:
    std::size_t count_ = 0;
    std::string first_;
};

/// What it has, and what this user may not do there.
Finding contentOf(const std::string& directory) {
    std::error_code error;
    std::size_t files = 0;
    Refusals reading;
    Refusals writing;
    for (fs::directory_iterator entry(directory, error); !error && entry != end(entry);
         entry.increment(error)) {
        if (entry->path().filename().string().starts_with(ZR::InterfaceFile::prefix)) {
            ++files;
            reading.tryAccess(entry->path(), R_OK);
            writing.tryAccess(entry->path(), W_OK);
        }
    }
    if (error) {
        return {Verdict::bad, dataDirectory, printable(directory) + ": " + error.message(),
                "let this user read it, or run as another one"};
    }
    std::string refused = reading.text("read") + writing.text("change");
    if (::access(directory.c_str(), W_OK) != 0) {
        const int reason = errno;
        refused +=
            std::string("; this user may not make files there (") + std::strerror(reason) + ")";
    }
    return {refused.empty() ? Verdict::good : Verdict::notable, dataDirectory,
            printable(directory) + " has " + counted(files, "ifcfg file", "ifcfg files") + refused,
            refused.empty() ? "" : "rename as a user who may, such as root"};
}

}  // namespace

const std::vector<fs::path>& sourcedDirectories() {
    static const std::vector<fs::path> directories{"/etc/sysconfig/network-scripts",
                                                   "/etc/sysconfig/network", "/etc/network",
                                                   "/etc/default", "/etc/profile.d"};
    return directories;
}

void lookAtDataDirectory(const std::string& directory, std::vector<Finding>& findings,
                         const std::vector<fs::path>& sourced) {
    std::error_code error;
    const fs::file_type type = fs::status(directory, error).type();
    if (type == fs::file_type::directory) {
        findings.push_back(contentOf(directory));
    } else if (error && error != std::errc::no_such_file_or_directory) {
        const bool loop = error == std::errc::too_many_symbolic_link_levels;
        findings.push_back(
            {Verdict::bad, dataDirectory, printable(directory) + ": " + error.message(),
             loop ? "remove the link that leads to itself, and make a directory there"
                  : "make it a directory that this user may look into, or set DATA_DIR"});
    } else {
        findings.push_back({Verdict::notable, dataDirectory,
                            printable(directory) +
                                " does not exist: no configuration has a name, and none can be "
                                "given",
                            "mkdir -p " + printable(directory) + ", or set DATA_DIR"});
    }
    if (const fs::path place = sourcedAbove(directory, sourced); !place.empty()) {
        findings.push_back(
            {Verdict::notable, dataDirectory,
             printable(directory) + " is in " + place.string() +
                 ", whose files shells or network scripts read: who reads an ifcfg file there, "
                 "often as root, runs the commands that a configuration name holds, and whoever "
                 "may modify can give such a name",
             std::string("set DATA_DIR to a directory of its own, such as ") +
                 ZR::PlatformSettings::defaultDataDir});
    }
}

}  // namespace cimdhcp
