#include "sources/FileWatch.h"

#include <fcntl.h>
#include <sys/inotify.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <filesystem>
#include <optional>
#include <string_view>
#include <system_error>
#include <utility>

namespace ZR {

namespace {

/// Another thing may stand behind the name.
constexpr std::uint32_t entryReplaced = IN_CREATE | IN_DELETE | IN_MOVED_FROM | IN_MOVED_TO;
/// The thing behind the name may hold, or let be read, something else.
constexpr std::uint32_t contentChanged = IN_MODIFY | IN_CLOSE_WRITE | IN_ATTRIB;

/// Puts the components of a path on the stack of those ahead, the first on top.
void push(std::string_view path, std::vector<std::string>& ahead) {
    while (!path.empty()) {
        const std::size_t slash = path.rfind('/');
        const std::size_t start = slash == std::string_view::npos ? 0 : slash + 1;
        if (start < path.size() && path.substr(start) != ".") {
            ahead.emplace_back(path.substr(start));
        }
        path = path.substr(0, start == 0 ? 0 : slash);
    }
}

/// Where a symbolic link leads; nothing when the path is not one.
std::optional<std::string> targetOf(const std::string& path) {
    std::array<char, PATH_MAX> target{};
    const ssize_t size = ::readlink(path.c_str(), target.data(), target.size());
    if (size <= 0) {
        return std::nullopt;
    }
    return std::string(target.data(), static_cast<std::size_t>(size));
}

std::string absolute(const std::string& path) {
    std::error_code error;
    std::string result = std::filesystem::absolute(path, error).string();
    return error ? path : result;
}

}  // namespace

FileWatch::FileWatch(const std::string& path) : path_(absolute(path)) {}

void FileWatch::subscribe() {
    if (wayChanged_ || !inotify_) {
        // The descriptor is kept: to close one takes the kernel some milliseconds.
        if (!inotify_) {
            inotify_.reset(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
        }
        const std::vector<Step> former = std::exchange(steps_, {});
        if (!inotify_ || !watchPath()) {
            inotify_.reset();
            steps_.clear();
        }
        dropAllBut(steps_, former);
        wayChanged_ = false;
    }
    changed_ = false;
}

/// Watches every directory that the path leads through, also by way of symbolic
/// links, for the entry that leads on. Where an entry is missing the way ends:
/// its directory tells when it appears. Each directory is watched before its
/// entry is looked at, so that no replacement falls between the two. False when
/// a directory cannot be watched.
bool FileWatch::watchPath() {
    constexpr int mostLinks = 40;  // as many as Linux itself follows
    int links = 0;
    std::vector<std::string> ahead;
    push(path_, ahead);
    std::string directory = "/";
    while (!ahead.empty()) {
        const std::string name = std::move(ahead.back());
        ahead.pop_back();
        const std::uint32_t events = ahead.empty() ? entryReplaced | contentChanged : entryReplaced;
        // IN_MASK_ADD, as one directory may be passed more than once.
        const int watch = ::inotify_add_watch(inotify_.get(), directory.c_str(),
                                              events | IN_ONLYDIR | IN_MASK_ADD);
        if (watch < 0) {
            return errno == ENOENT || errno == ENOTDIR;
        }
        steps_.push_back({watch, name});
        std::string entry = directory;
        entry.append("/").append(name);
        if (const auto target = targetOf(entry)) {
            if (++links > mostLinks) {
                return true;  // a circle, every link of which is watched by now
            }
            push(*target, ahead);
            if (target->front() == '/') {
                directory = "/";
            }
        } else {
            directory = std::move(entry);
        }
    }
    return true;
}

/// Ends the watches that no step needs any more.
void FileWatch::dropAllBut(const std::vector<Step>& needed, const std::vector<Step>& former) {
    for (const Step& each : former) {
        const bool isNeeded = std::any_of(needed.begin(), needed.end(), [&](const Step& step) {
            return step.watch == each.watch;
        });
        if (inotify_ && !isNeeded) {
            // Fails when the directory is gone, and its watch with it.
            ::inotify_rm_watch(inotify_.get(), each.watch);
        }
    }
}

bool FileWatch::changed() {
    if (changed_ || !inotify_) {
        return true;
    }
    alignas(inotify_event) std::array<char, 4096> buffer;  // NOLINT(*-member-init): read() fills it
    while (true) {
        const ssize_t size = ::read(inotify_.get(), buffer.data(), buffer.size());
        if (size > 0) {
            takeAll({buffer.data(), static_cast<std::size_t>(size)});
        } else if (size == 0 || (errno != EINTR && errno != EAGAIN)) {
            // Nothing that Linux does on a healthy descriptor; begin again.
            changed_ = wayChanged_ = true;
            return true;
        } else if (errno == EAGAIN) {
            return changed_;
        }
    }
}

UniqueFd FileWatch::sign() const {
    return UniqueFd(inotify_ ? ::fcntl(inotify_.get(), F_DUPFD_CLOEXEC, 0) : -1);
}

void FileWatch::takeAll(std::string_view events) {
    while (!events.empty()) {
        inotify_event event{};
        std::memcpy(&event, events.data(), sizeof event);
        events.remove_prefix(sizeof event);
        const std::string_view name = events.substr(0, event.len);  // padded with zeros, or absent
        take(event, name.substr(0, name.find('\0')));
        events.remove_prefix(name.size());
    }
}

void FileWatch::take(const inotify_event& event, std::string_view name) {
    if ((event.mask & IN_Q_OVERFLOW) != 0) {
        changed_ = wayChanged_ = true;
        return;
    }
    for (const Step& step : steps_) {
        // Without a name it is the directory itself that is gone or has another
        // mode. A watch of no step is one dropped, whose last events still come.
        if (step.watch == event.wd && (name.empty() || step.name == name)) {
            changed_ = true;
            wayChanged_ = wayChanged_ || name.empty() || (event.mask & entryReplaced) != 0;
        }
    }
}

}  // namespace ZR
