#include "formats/Trust.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <cstddef>

#include "formats/Files.h"

namespace ZR::Live {
namespace {

// As many as the kernel follows (path_resolution(7)).
constexpr int mostLinks = 40;

class Walk {
  public:
    Walk(std::string_view root, std::span<const uid_t> writers) : root_(root), writers_(writers) {}

    /// Goes to the end of the path; 0, or the errno that stopped it.
    int go(const std::string& path) {
        rest_ = path;
        if (::lstat((root_ + '/').c_str(), &status_) != 0) {
            return errno;
        }
        inspect();
        for (std::string name = takeName(); !name.empty(); name = takeName()) {
            if (name == ".") {
                continue;
            }
            if (name == "..") {
                leaveTo(current_.substr(0, std::min(current_.rfind('/'), current_.size())));
            } else if (const int error = enter(name); error != 0) {
                return error;
            }
        }
        return 0;
    }

    [[nodiscard]] FoundFile found() && {
        return {.path = here(), .status = status_, .doubt = std::move(doubt_)};
    }

  private:
    std::string takeName() {
        rest_.erase(0, std::min(rest_.find_first_not_of('/'), rest_.size()));
        std::string name = rest_.substr(0, rest_.find('/'));
        rest_.erase(0, name.size());
        return name;
    }

    int enter(const std::string& name) {
        const std::string directory = current_;
        current_ += '/' + name;
        if (::lstat(here().c_str(), &status_) != 0) {
            return errno;
        }
        inspect();
        return S_ISLNK(status_.st_mode) ? follow(directory) : 0;
    }

    int follow(const std::string& directory) {
        std::array<char, PATH_MAX> target{};
        const ssize_t length = ::readlink(here().c_str(), target.data(), target.size());
        if (length <= 0) {
            return length < 0 ? errno : ENOENT;
        }
        if (++links_ > mostLinks) {
            return ELOOP;
        }
        rest_.insert(0, std::string(target.data(), static_cast<std::size_t>(length)) + '/');
        leaveTo(target.front() == '/' ? "" : directory);
        return 0;
    }

    void leaveTo(std::string directory) {
        current_ = std::move(directory);
        if (closed_ && current_.size() < closedDepth_) {
            closed_ = false;
        }
    }

    [[nodiscard]] std::string here() const {
        return current_.empty() ? root_ + '/' : root_ + current_;
    }

    [[nodiscard]] bool mayWrite(uid_t user) const {
        return user == 0 || user == ::geteuid() ||
               std::find(writers_.begin(), writers_.end(), user) != writers_.end();
    }

    /// Whether anyone else may change what the walk has just come to.
    void inspect() {
        const mode_t mode = status_.st_mode;
        if (!doubt_.empty() || closed_) {
            return;
        }
        const bool sticky = S_ISDIR(mode) && (mode & S_ISVTX) != 0;
        if (!mayWrite(status_.st_uid)) {
            doubt_ = "user " + std::to_string(status_.st_uid) + " may change " + here();
        } else if (S_ISLNK(mode) || sticky) {
            return;  // the mode of a link says nothing
        } else if ((mode & S_IWOTH) != 0) {
            doubt_ = "every user may change " + here();
        } else if ((mode & S_IWGRP) != 0) {
            doubt_ = "group " + std::to_string(status_.st_gid) + " may change " + here();
        } else if (S_ISDIR(mode) && (mode & (S_IXGRP | S_IXOTH)) == 0) {
            closed_ = true;
            closedDepth_ = current_.size();
        }
    }

    const std::string root_;
    const std::span<const uid_t> writers_;
    std::string current_;  // below the root, without links; empty for the root itself
    std::string rest_;
    struct stat status_ {};
    std::string doubt_;
    int links_ = 0;
    bool closed_ = false;  // a directory on the way lets nobody else in
    std::size_t closedDepth_ = 0;
};

}  // namespace

Diagnostic untrusted(std::string_view path, std::string_view reason) {
    std::string text{path};
    text.append(" is not trusted: ").append(reason);
    return Diagnostic{std::move(text), Diagnostic::Kind::Untrusted};
}

std::optional<FoundFile> findFile(const std::string& path, std::span<const uid_t> writers,
                                  std::vector<Diagnostic>& diagnostics, std::string_view root) {
    Walk walk{root, writers};
    if (const int error = walk.go(path); error != 0) {
        if (!isAbsent(error)) {
            diagnostics.push_back(unreadable(std::string{root} + path, error));
        }
        return std::nullopt;
    }
    return std::move(walk).found();
}

bool isTrusted(const std::string& path, std::span<const uid_t> writers,
               std::vector<Diagnostic>& diagnostics) {
    const auto file = findFile(path, writers, diagnostics);
    if (file && !file->doubt.empty()) {
        diagnostics.push_back(untrusted(path, file->doubt));
    }
    return file && file->doubt.empty();
}

std::optional<std::string> readTrustedFile(const std::string& path, std::span<const uid_t> writers,
                                           std::vector<Diagnostic>& diagnostics) {
    return isTrusted(path, writers, diagnostics) ? readOptionalFile(path, diagnostics)
                                                 : std::nullopt;
}

}  // namespace ZR::Live
