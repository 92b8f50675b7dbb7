#include "kernel/ChangeMonitor.h"

#include <fcntl.h>
#include <linux/netlink.h>
#include <linux/rtnetlink.h>
#include <poll.h>
#include <sys/epoll.h>
#include <sys/inotify.h>
#include <sys/socket.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <cstring>
#include <functional>
#include <utility>

#include "formats/Files.h"
#include "kernel/Attributes.h"

namespace ZR::Live {
namespace {

constexpr std::uint32_t selfEvents = IN_DELETE_SELF | IN_MOVE_SELF | IN_UNMOUNT;
// IN_MODIFY: a client that keeps its lease file open appends without closing it.
// IN_ATTRIB: a file may become readable.
constexpr std::uint32_t directoryEvents = IN_MODIFY | IN_CREATE | IN_MOVED_TO | IN_MOVED_FROM |
                                          IN_DELETE | IN_ATTRIB | IN_DELETE_SELF | IN_MOVE_SELF;
constexpr std::uint32_t ancestorEvents = IN_CREATE | IN_MOVED_TO | IN_DELETE_SELF | IN_MOVE_SELF;

// The most reads of one drain, so that a flood of events cannot keep a caller here. What is
// left is read at the next call.
constexpr int longestDrain = 4096;

int addWatch(int fd, const std::string& directory, std::uint32_t events) {
    // IN_MASK_ADD: two paths may be one directory, whose watch is then one too.
    return ::inotify_add_watch(fd, directory.c_str(), events | IN_ONLYDIR | IN_MASK_ADD);
}

}  // namespace

void ChangeMonitor::begin(const std::vector<WatchedPlace>& places,
                          std::vector<Diagnostic>& diagnostics) {
    if (blind_) {
        rearm_ = true;
        blind_ = false;
    }
    openSubscription(diagnostics);
    openWatches(diagnostics);
    if (subscription_) {
        drainSubscription();
    }
    if (watches_) {
        // Before watching anew: what it tells may ask for that.
        drainWatches();
    }
    if (watches_) {
        if (rearm_ || places != places_) {
            rearm_ = true;  // until all is done
            watchAll(places, diagnostics);
            rearm_ = false;
        }
    }
    changed_ = false;
}

bool ChangeMonitor::changed() {
    if (changed_ || blind_) {
        return true;
    }
    asked_.clear();
    asked_.push_back({.fd = subscription_.get(), .events = POLLIN, .revents = 0});
    asked_.push_back({.fd = watches_.get(), .events = POLLIN, .revents = 0});
    for (const auto& [pid, descriptor] : processes_) {
        asked_.push_back({.fd = descriptor.get(), .events = POLLIN, .revents = 0});
    }
    const int ready = ::poll(asked_.data(), asked_.size(), 0);
    if (ready == 0) {
        return false;
    }
    if (ready < 0) {
        changed_ = true;  // not even that can be known
        return true;
    }
    if (asked_[0].revents != 0 && drainSubscription()) {
        changed_ = true;
    }
    if (asked_[1].revents != 0 && drainWatches()) {
        changed_ = true;
    }
    if (std::any_of(asked_.begin() + 2, asked_.end(),
                    [](const pollfd& process) { return process.revents != 0; })) {
        changed_ = true;
    }
    return changed_;
}

void ChangeMonitor::watchProcesses(std::span<const std::int32_t> pids) {
    std::map<std::int32_t, UniqueFd> processes;
    for (const std::int32_t pid : pids) {
        if (const auto known = processes_.find(pid); known != processes_.end()) {
            processes.insert(processes_.extract(known));
            continue;
        }
        // The C library has a function for it only in its newer versions.
        UniqueFd descriptor{static_cast<int>(::syscall(SYS_pidfd_open, pid, 0))};
        if (descriptor) {
            announce(descriptor.get());
            processes.emplace(pid, std::move(descriptor));
        } else if (errno == ESRCH) {
            changed_ = true;
        }
    }
    processes_ = std::move(processes);
}

void ChangeMonitor::openSubscription(std::vector<Diagnostic>& diagnostics) {
    if (subscription_) {
        return;
    }
    network_.addAll();
    subscription_.reset(
        ::socket(AF_NETLINK, SOCK_RAW | SOCK_NONBLOCK | SOCK_CLOEXEC, NETLINK_ROUTE));
    sockaddr_nl address{};
    address.nl_family = AF_NETLINK;
    address.nl_groups = RTMGRP_LINK | RTMGRP_IPV4_IFADDR | RTMGRP_IPV6_IFADDR;
    const auto* const generic = static_cast<const sockaddr*>(static_cast<const void*>(&address));
    if (!subscription_ || ::bind(subscription_.get(), generic, sizeof address) != 0) {
        diagnostics.emplace_back("cannot subscribe to network changes: " + reasonOf(errno));
        subscription_.reset();
        blind_ = true;
        return;
    }
    announce(subscription_.get());
}

void ChangeMonitor::openWatches(std::vector<Diagnostic>& diagnostics) {
    if (watches_) {
        return;
    }
    interests_.clear();
    rearm_ = true;
    watches_.reset(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
    if (!watches_) {
        diagnostics.emplace_back("cannot watch files: " + reasonOf(errno));
        blind_ = true;
        return;
    }
    announce(watches_.get());
}

UniqueFd ChangeMonitor::sign(int other) {
    if (!announced_) {
        announced_.reset(::epoll_create1(EPOLL_CLOEXEC));
        announce(subscription_.get());
        announce(watches_.get());
        for (const auto& [pid, descriptor] : processes_) {
            announce(descriptor.get());
        }
    }
    announce(other);
    return UniqueFd(announced_ ? ::fcntl(announced_.get(), F_DUPFD_CLOEXEC, 0) : -1);
}

/// The set keeps no descriptor open: one that is closed leaves it.
void ChangeMonitor::announce(int descriptor) {
    if (!announced_ || descriptor < 0) {
        return;
    }
    epoll_event event{};
    event.events = EPOLLIN;
    if (::epoll_ctl(announced_.get(), EPOLL_CTL_ADD, descriptor, &event) != 0 && errno != EEXIST) {
        blind_ = true;  // what it tells would not be heard
    }
}

/// What one round of watching knows so far. Many places lie in few directories, or below
/// few missing ones: the kernel is asked about each directory once.
struct ChangeMonitor::Arming {
    struct Directory {
        int watch = -1;
        bool full = false;  // with all its events, else for newcomers only
    };

    Interests interests;
    std::map<std::string, Directory, std::less<>> watched;
    /// Missing directories, each with the watch of the directory above it. That watch began
    /// before the directory was found missing, so that its coming is not overlooked.
    std::map<std::string, int, std::less<>> missing;

    /// Waits for the nearest missing directory on the way to this one, if one is known.
    bool awaits(std::string_view directory) {
        for (std::size_t end = directory.size(); end != 0 && end != std::string_view::npos;
             end = directory.rfind('/', end - 1)) {
            const std::string_view path = directory.substr(0, end);
            const auto found = missing.find(path);
            if (found != missing.end()) {
                interests[found->second].push_back(
                    {.name = std::string{path.substr(path.rfind('/') + 1)}, .ancestor = true});
                return true;
            }
        }
        return false;
    }
};

void ChangeMonitor::watchAll(const std::vector<WatchedPlace>& places,
                             std::vector<Diagnostic>& diagnostics) {
    Arming arming;
    for (const WatchedPlace& place : places) {
        watch(place, arming, diagnostics);
    }
    for (const auto& [watch, unused] : interests_) {
        if (!arming.interests.contains(watch)) {
            // Fails when the directory went meanwhile, and the watch with it.
            static_cast<void>(::inotify_rm_watch(watches_.get(), watch));
        }
    }
    interests_ = std::move(arming.interests);
    places_ = places;
}

void ChangeMonitor::watch(const WatchedPlace& place, Arming& arming,
                          std::vector<Diagnostic>& diagnostics) {
    const auto notice = [&](int watch) {
        arming.interests[watch].push_back({.name = place.namePrefix, .ancestor = false});
    };
    if (const auto known = arming.watched.find(place.directory);
        known != arming.watched.end() && known->second.full) {
        notice(known->second.watch);
        return;
    }
    // A directory may come or go between two calls. A few attempts are enough for that.
    for (int attempt = 0; attempt < 8; ++attempt) {
        if (arming.awaits(place.directory)) {
            return;
        }
        const int directory = addWatch(watches_.get(), place.directory, directoryEvents);
        if (directory >= 0) {
            arming.watched[place.directory] = {.watch = directory, .full = true};
            notice(directory);
            return;
        }
        if (!isAbsent(errno) || watchAncestor(place.directory, arming) < 0) {
            break;
        }
    }
    const int error = errno;
    if (error == EACCES) {
        // Nothing was read from a directory that may not be read, and its reader has
        // reported that.
        return;
    }
    // Anything else, like a limit that was reached, leaves changes unnoticed.
    diagnostics.emplace_back("cannot watch " + place.directory + ": " + reasonOf(error));
    blind_ = true;
}

/// Watches the nearest existing ancestor of a directory that was just found missing.
/// `arming.missing` then has the topmost missing directory below it, which was looked for
/// again after that watch began: if it comes, the watch tells. Returns the watch; -1 with
/// errno set when there is nothing to watch.
int ChangeMonitor::watchAncestor(std::string directory, Arming& arming) const {
    const auto await = [&](const std::string& path) {
        const int watch = addWatch(watches_.get(), path, ancestorEvents);
        if (watch >= 0) {
            arming.watched[path].watch = watch;
            arming.interests[watch];  // kept, even if nothing is awaited there in the end
        }
        return watch;
    };
    while (directory.size() > 1) {
        const std::size_t slash = directory.rfind('/');
        if (slash == std::string::npos) {
            break;
        }
        const std::string parent = directory.substr(0, std::max<std::size_t>(slash, 1));
        if (const auto known = arming.watched.find(parent); known != arming.watched.end()) {
            arming.missing.emplace(directory, known->second.watch);
            return known->second.watch;
        }
        const int above = await(parent);
        if (above >= 0) {
            const int found = await(directory);
            if (found < 0 && isAbsent(errno)) {
                arming.missing.emplace(directory, above);
                return above;
            }
            return found;
        }
        if (!isAbsent(errno)) {
            return above;
        }
        directory = parent;
    }
    errno = ENOENT;
    return -1;
}

bool ChangeMonitor::drainSubscription() {
    bool happened = false;
    for (int i = 0; i < longestDrain; ++i) {
        // Of which link it tells is all that matters; what does not fit is dropped.
        std::array<std::byte, 64> message{};
        const ssize_t got =
            ::recv(subscription_.get(), message.data(), message.size(), MSG_DONTWAIT | MSG_TRUNC);
        if (got >= 0) {
            happened = true;
            note(message, static_cast<std::size_t>(got));
        } else if (errno == ENOBUFS) {
            happened = true;  // more came than was kept
            network_.addAll();
        } else if (errno == EAGAIN) {
            return happened;
        } else if (errno != EINTR) {
            subscription_.reset();
            network_.addAll();
            blind_ = true;
            return true;
        }
    }
    return true;
}

/// Notes the link of a message of so many bytes, of which the first ones are here.
void ChangeMonitor::note(std::span<const std::byte> message, std::size_t size) {
    const auto body = message.subspan(NLMSG_HDRLEN);
    const auto header = valueAt<nlmsghdr>(message);
    const auto link = valueAt<ifinfomsg>(body);
    const auto address = valueAt<ifaddrmsg>(body);
    const bool whole = header && link && address && header->nlmsg_len == size;
    const std::uint16_t type = whole ? header->nlmsg_type : std::uint16_t{NLMSG_NOOP};
    if (type == RTM_NEWLINK || type == RTM_DELLINK) {
        network_.add(static_cast<std::uint32_t>(link->ifi_index));
    } else if (type == RTM_NEWADDR || type == RTM_DELADDR) {
        network_.add(address->ifa_index);
    } else {
        network_.addAll();
    }
}

bool ChangeMonitor::drainWatches() {
    bool happened = false;
    alignas(inotify_event) std::array<char, 16384> buffer{};
    for (int i = 0; i < longestDrain; ++i) {
        const ssize_t got = ::read(watches_.get(), buffer.data(), buffer.size());
        if (got <= 0) {
            if (got < 0 && errno == EINTR) {
                continue;
            }
            if (got == 0 || errno == EAGAIN) {
                return happened;
            }
            watches_.reset();
            blind_ = true;
            return true;
        }
        std::string_view rest{buffer.data(), static_cast<std::size_t>(got)};
        while (rest.size() >= sizeof(inotify_event)) {
            inotify_event event{};
            std::memcpy(&event, rest.data(), sizeof event);
            rest.remove_prefix(sizeof event);
            const std::string_view padded = rest.substr(0, event.len);
            rest.remove_prefix(padded.size());
            const std::string_view name = padded.substr(0, padded.find('\0'));
            happened = concerns(event.wd, event.mask, name) || happened;
        }
    }
    return true;
}

bool ChangeMonitor::concerns(int watch, std::uint32_t mask, std::string_view name) {
    if ((mask & IN_Q_OVERFLOW) != 0) {
        rearm_ = true;
        return true;
    }
    const auto interests = interests_.find(watch);
    if (interests == interests_.end()) {
        return false;  // an event of a watch that was removed meanwhile
    }
    if ((mask & IN_IGNORED) != 0) {
        interests_.erase(interests);
        rearm_ = true;
        return true;
    }
    if ((mask & selfEvents) != 0) {
        rearm_ = true;
        return true;
    }
    bool found = false;
    for (const Interest& interest : interests->second) {
        if (interest.ancestor) {
            if (name == interest.name) {
                rearm_ = true;
                found = true;
            }
        } else if (name.empty() || name.starts_with(interest.name)) {
            found = true;
        }
    }
    return found;
}

}  // namespace ZR::Live
