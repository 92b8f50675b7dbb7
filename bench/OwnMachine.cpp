#include "OwnMachine.h"

#include <sched.h>
#include <sys/mount.h>
#include <sys/stat.h>

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
        ::mount("tmpfs", "/run", "tmpfs", 0, "mode=755") != 0 ||
        ::mount("tmpfs", "/var/lib", "tmpfs", 0, "mode=755") != 0) {
        fail("mount");
    }
}

void leaveLeases(const std::string& leases) {
    FILE* file = nullptr;
    if (::mkdir("/var/lib/dhcp", 0755) != 0 ||
        (file = std::fopen("/var/lib/dhcp/dhclient.leases", "w")) == nullptr ||
        std::fputs(leases.c_str(), file) < 0 || std::fclose(file) != 0) {
        fail("/var/lib/dhcp/dhclient.leases");
    }
}

std::string leaseOf(const std::string& link, const std::string& address,
                    const std::string& server) {
    return "lease {\n  interface \"" + link + "\";\n  fixed-address " + address +
           ";\n  option dhcp-server-identifier " + server +
           ";\n  expire 5 2199/11/20 23:19:41;\n}\n";
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
