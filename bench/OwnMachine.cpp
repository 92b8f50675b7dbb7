#include "OwnMachine.h"

#include <sched.h>
#include <sys/mount.h>

#include <cstdio>
#include <cstdlib>

namespace bench {

void fail(const char* what) {
    std::perror(what);
    std::exit(1);
}

void enterOwnMachine() {
    if (::unshare(CLONE_NEWNET | CLONE_NEWNS) != 0) {
        fail("a namespace of its own needs root: unshare");
    }
    if (::mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
        ::mount("tmpfs", "/run", "tmpfs", 0, nullptr) != 0 ||
        ::mount("tmpfs", "/var/lib", "tmpfs", 0, nullptr) != 0) {
        fail("mount");
    }
}

void configureLinks(const std::string& lines) {
    FILE* const ip = ::popen("ip -batch -", "w");
    if (ip == nullptr) {
        fail("ip");
    }
    const bool written = std::fputs(lines.c_str(), ip) >= 0;
    if (::pclose(ip) != 0 || !written) {
        std::fprintf(stderr, "the links cannot be made\n");
        std::exit(1);
    }
}

}  // namespace bench
