// What the sweeps stand on: that the calls of the library really come through the
// program's own functions, and that no other calls are there.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <memory>
#include <set>
#include <string>

#include "NamespaceMachine.h"
#include "kit/Allocations.h"
#include "kit/Namespaces.h"
#include "kit/ProviderHost.h"
#include "kit/SystemCalls.h"
#include "kit/TreeMachine.h"

namespace test {
namespace {

using ZR::Testing::Allocations;
using ZR::Testing::Call;
using ZR::Testing::CallOrigin;
using ZR::Testing::SystemCalls;

const ScriptRequest servers{"Servers", Operation::enumerate, "QVXZR_DHCPRemoteServiceAccessPoint",
                            ""};

TEST(SystemCallsOfTheLibrary, AllComeThroughTheFake) {
    // What it takes from other libraries, as the linker's table has it.
    const std::string command =
        "nm -D --undefined-only " + ProviderHost::builtLibraries() + '/' + ProviderHost::library;
    const std::unique_ptr<FILE, int (*)(FILE*)> pipe(::popen(command.c_str(), "r"), &::pclose);
    ASSERT_TRUE(pipe);
    std::set<std::string> taken;
    std::array<char, 4096> line{};
    while (std::fgets(line.data(), line.size(), pipe.get()) != nullptr) {
        const std::string text = line.data();
        const std::size_t start = text.find_last_of(' ') + 1;
        taken.insert(text.substr(start, text.find_first_of("@\n", start) - start));
    }
    ASSERT_TRUE(taken.contains("open"));
    std::set<std::string> faked;
    for (unsigned i = 0; i < static_cast<unsigned>(Call::count); ++i) {
        faked.insert(nameOf(static_cast<Call>(i)));
    }
    // All of the C library's that ask the system for something.
    const std::set<std::string> asking{"accept",       "access",        "bind",
                                       "chdir",        "chmod",         "close",
                                       "closedir",     "connect",       "creat",
                                       "dup",          "dup2",          "epoll_ctl",
                                       "epoll_wait",   "fallocate",     "fchmod",
                                       "fcntl",        "fdatasync",     "flock",
                                       "fopen",        "fork",          "fstat",
                                       "fstat64",      "fstatat",       "fsync",
                                       "ftruncate",    "getaddrinfo",   "gethostname",
                                       "getsockname",  "getsockopt",    "inotify_add_watch",
                                       "inotify_init", "inotify_init1", "inotify_rm_watch",
                                       "ioctl",        "kill",          "link",
                                       "listen",       "lseek",         "lstat",
                                       "mkdir",        "mmap",          "open",
                                       "open64",       "openat",        "openat64",
                                       "opendir",      "pipe",          "poll",
                                       "ppoll",        "pread",         "pwrite",
                                       "pwritev",      "read",          "readdir",
                                       "readdir64",    "readlink",      "readlinkat",
                                       "readv",        "recv",          "recvfrom",
                                       "recvmsg",      "rename",        "rmdir",
                                       "select",       "send",          "sendmsg",
                                       "sendto",       "setsockopt",    "shutdown",
                                       "socket",       "stat",          "stat64",
                                       "statx",        "symlink",       "syscall",
                                       "truncate",     "uname",         "unlink",
                                       "write",        "writev"};
    // Which frees what is open, and cannot fail for a directory that is.
    const std::set<std::string> harmless{"closedir"};
    for (const std::string& name : taken) {
        if (asking.contains(name) && !harmless.contains(name)) {
            EXPECT_TRUE(faked.contains(name)) << name << " can fail, and no test lets it";
        }
    }
}

TEST(SystemCallsOfTheLibrary, AreCountedAndPassedOnWhereATreeIsRead) {
    TreeMachine machine;
    machine.enter(0);
    ProviderHost host;
    const CallOrigin origin(ProviderHost::library);
    const ScriptResponse before = host.run(servers);
    machine.enter(1);
    SystemCalls calls(origin);
    const ScriptResponse after = host.run(servers);
    EXPECT_EQ(before.objects.size(), 1U);
    EXPECT_EQ(after.objects.size(), 3U);
    for (const Call call : {Call::close, Call::fstat, Call::gethostname, Call::inotify_add_watch,
                            Call::open, Call::read, Call::readlink}) {
        EXPECT_GT(calls.count(call), 0U) << nameOf(call);
    }
    const unsigned opened = calls.count(Call::open);
    host.run(servers);
    EXPECT_EQ(calls.count(Call::open), opened) << "what did not change is not read again";
}

TEST(SystemCallsOfTheLibrary, AreCountedAndPassedOnWhereTheMachineIsRead) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(ZR::Live::passesInNamespaces(60, [] {
        LiveMachine machine;
        machine.enter(0);
        ProviderHost host;
        const CallOrigin origin(ProviderHost::library);
        machine.enter(1);
        SystemCalls calls(origin);
        EXPECT_EQ(host.run(servers).objects.size(), 1U);
        for (const Call call : {Call::close, Call::fstat, Call::gethostname, Call::open,
                                Call::openat, Call::opendir, Call::poll, Call::read, Call::readdir,
                                Call::readlinkat, Call::recvmsg, Call::sendto}) {
            EXPECT_GT(calls.count(call), 0U) << nameOf(call);
        }
        const unsigned opened = calls.count(Call::open);
        host.run(servers);
        EXPECT_EQ(calls.count(Call::open), opened) << "what did not change is not read again";
    }));
}

TEST(SystemCallsOfTheLibrary, AreToldFromThoseOfTheObjectManager) {
    TreeMachine machine;
    machine.enter(0);
    ProviderHost host;
    const CallOrigin origin(ProviderHost::library);
    host.run(servers);
    const CallOrigin everyone;
    const auto count = [&](const CallOrigin& whose) {
        const Allocations allocations(whose);
        host.run(servers);
        return allocations.count();
    };
    EXPECT_GT(count(origin), 2U);
    EXPECT_GT(count(everyone), 2 * count(origin));
    EXPECT_EQ(count(origin), count(origin));
}

TEST(SystemCallsOfTheLibrary, FailAsTheyAreTold) {
    TreeMachine machine;
    machine.enter(0);
    ProviderHost host;
    const CallOrigin origin(ProviderHost::library);
    ASSERT_EQ(host.run(servers).objects.size(), 1U);
    machine.enter(1);
    {
        SystemCalls calls(origin);
        calls.fail(Call::open, 1, EMFILE);
        EXPECT_EQ(host.run(servers).objects.size(), 0U);
        EXPECT_TRUE(calls.failed());
    }
    EXPECT_EQ(host.run(servers).objects.size(), 3U);
}

}  // namespace
}  // namespace test
