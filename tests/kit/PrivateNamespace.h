#pragma once

#include <sched.h>
#include <sys/mount.h>
#include <unistd.h>

#include <cerrno>
#include <string>
#include <system_error>

#include "kit/ChildProcess.h"

namespace ZR::Testing {

/// Takes the calling process (a child of a test) into name spaces of its own, as
/// unshare(2) names them. Without privileges it becomes the owner of a new user
/// name space first. Throws when the system allows neither.
inline void enterNamespaces(int kinds) {
    if (::geteuid() != 0) {
        kinds |= CLONE_NEWUSER;
    }
    if (::unshare(kinds) != 0) {
        throw std::system_error(errno, std::generic_category(), "unshare");
    }
    // What is mounted here must not show outside.
    if ((kinds & CLONE_NEWNS) != 0 &&
        ::mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0) {
        throw std::system_error(errno, std::generic_category(), "mount /");
    }
}

/// Hides a directory behind an empty one. Only in a mount name space of one's own.
inline void mountEmpty(const std::string& directory) {
    if (::mount("tmpfs", directory.c_str(), "tmpfs", 0, nullptr) != 0) {
        throw std::system_error(errno, std::generic_category(), "mount " + directory);
    }
}

/// Whether tests that need a private mount or UTS name space can run here.
inline bool canEnterNamespaces() {
    return inChild([] {
               enterNamespaces(CLONE_NEWNS | CLONE_NEWUTS);
               mountEmpty("/mnt");
               return std::string("yes");
           }).output == "yes";
}

}  // namespace ZR::Testing
