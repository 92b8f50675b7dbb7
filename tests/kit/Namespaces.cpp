#include "kit/Namespaces.h"

#include <gtest/gtest.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <memory>

namespace ZR::Live {
namespace {

constexpr int namespaces = CLONE_NEWNET | CLONE_NEWNS | CLONE_NEWPID | CLONE_NEWUTS;

int awaitEnd(pid_t child) {
    int status = 0;
    while (::waitpid(child, &status, 0) < 0 && errno == EINTR) {
    }
    return status;
}

bool mountOwn(const char* type, const char* where) {
    return ::mount(type, where, type, MS_NOSUID | MS_NODEV, nullptr) == 0;
}

/// The first process of the new process namespace: all others end with it.
[[noreturn]] void live(const std::function<void()>& body) {
    const bool ready = ::mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0 &&
                       mountOwn("proc", "/proc") && mountOwn("tmpfs", "/run") &&
                       mountOwn("tmpfs", "/var/lib") &&
                       ::sethostname("inside", sizeof "inside" - 1) == 0;
    EXPECT_TRUE(ready) << "cannot set up the namespaces";
    if (ready) {
        body();
    }
    static_cast<void>(std::fflush(nullptr));
    ::_exit(::testing::Test::HasFailure() ? 1 : 0);
}

}  // namespace

bool mayMakeNamespaces() {
    const pid_t child = ::fork();
    if (child == 0) {
        ::_exit(::unshare(namespaces) == 0 ? 0 : 1);
    }
    return child > 0 && awaitEnd(child) == 0;
}

bool passesInNamespaces(unsigned seconds, const std::function<void()>& body) {
    static_cast<void>(std::fflush(nullptr));  // else the child would print it again
    const pid_t outer = ::fork();
    if (outer == 0) {
        if (::unshare(namespaces) != 0) {
            ::_exit(2);
        }
        const pid_t inner = ::fork();
        if (inner == 0) {
            live(body);
        }
        // The first process of a process namespace ignores signals of its own kind, so
        // that an alarm in it would not end it; from outside SIGKILL does.
        if (inner < 0) {
            ::_exit(2);
        }
        static pid_t watched;
        watched = inner;
        std::signal(SIGALRM, [](int) { ::kill(watched, SIGKILL); });
        ::alarm(seconds);
        const int status = awaitEnd(inner);
        ::_exit(WIFEXITED(status) ? WEXITSTATUS(status) : 3);
    }
    const int status = outer < 0 ? 1 : awaitEnd(outer);
    return WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

std::string run(const std::string& command) {
    std::string output;
    FILE* const pipe = ::popen((command + " 2>&1").c_str(), "r");
    if (pipe == nullptr) {
        ADD_FAILURE() << "cannot run " << command;
        return output;
    }
    std::array<char, 4096> buffer{};
    while (std::fgets(buffer.data(), buffer.size(), pipe) != nullptr) {
        output += buffer.data();
    }
    EXPECT_EQ(::pclose(pipe), 0) << command << "\n" << output;
    return output;
}

OtherNamespace::OtherNamespace() {
    std::array<int, 2> ready{};
    if (::pipe(ready.data()) != 0) {
        return;
    }
    process_ = ::fork();
    if (process_ == 0) {
        const char done = ::unshare(CLONE_NEWNET) == 0 ? 'y' : 'n';
        static_cast<void>(::write(ready[1], &done, 1));
        for (;;) {
            ::pause();
        }
    }
    char done = 'n';
    EXPECT_EQ(::read(ready[0], &done, 1), 1);
    EXPECT_EQ(done, 'y');
    ::close(ready[0]);
    ::close(ready[1]);
}

OtherNamespace::~OtherNamespace() {
    if (process_ > 0) {
        ::kill(process_, SIGKILL);
        awaitEnd(process_);
    }
}

}  // namespace ZR::Live
