#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "zrcommon/UniqueFd.h"

struct inotify_event;

namespace ZR {

/// Notices, without blocking and without a thread, that a file may have another
/// content: written, replaced, removed, created, made readable, or reached by
/// another way since a directory or symbolic link on its path was replaced.
/// Writes through a shared mapping, and by another name of the same file, are
/// not noticed. Used by one thread at a time.
class FileWatch {
  public:
    /// Watches nothing before the first subscribe(). A relative path starts at
    /// the present working directory, also after that has changed.
    explicit FileWatch(const std::string& path);

    /// The absolute path that is watched, and is to be read.
    [[nodiscard]] const std::string& path() const noexcept { return path_; }

    /// Watches from now on. To be called before the file is read: what happens
    /// after the call, changed() tells.
    void subscribe();

    /// Whether something may have changed since subscribe(). True before the
    /// first one. Costs one read() while nothing happens.
    [[nodiscard]] bool changed();

    /// What becomes readable when changed() may become true; none when it is blind.
    [[nodiscard]] UniqueFd sign() const;

    /// True when a directory cannot be watched. Then changed() is always true,
    /// since an unnoticed change would be worse than a needless reading.
    [[nodiscard]] bool isBlind() const noexcept { return !inotify_; }

  private:
    /// An entry of a watched directory that the path leads through.
    struct Step {
        int watch;
        std::string name;
    };

    [[nodiscard]] bool watchPath();
    void dropAllBut(const std::vector<Step>& needed, const std::vector<Step>& former);
    void takeAll(std::string_view events);
    void take(const inotify_event& event, std::string_view name);

    std::string path_;
    UniqueFd inotify_;
    std::vector<Step> steps_;
    bool changed_ = true;
    bool wayChanged_ = true;
};

}  // namespace ZR
