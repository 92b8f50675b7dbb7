#include <fcntl.h>
#include <linux/audit.h>
#include <linux/filter.h>
#include <linux/seccomp.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <charconv>
#include <cstddef>
#include <optional>
#include <string_view>

#include "kit/ZrclientSupport.h"
#include "sources/JsonTreeSource.h"
#include "zrclient/Instrumentation.h"

namespace ZR::Testing {
namespace {

using NodeLexicon::NodeType;

/// From now on the kernel ends this process at any system call but read(),
/// poll(), futex() and exit_group(). False when it will not.
bool allowNothingButPolling() {
    constexpr auto load = static_cast<std::uint16_t>(BPF_LD | BPF_W | BPF_ABS);
    constexpr auto jump = static_cast<std::uint16_t>(BPF_JMP | BPF_JEQ | BPF_K);
    constexpr auto verdict = static_cast<std::uint16_t>(BPF_RET | BPF_K);
    std::array<sock_filter, 7> program{{
        {load, 0, 0, offsetof(seccomp_data, nr)},
        {jump, 4, 0, SYS_read},
#ifdef SYS_poll
        {jump, 3, 0, SYS_poll},
#else
        {jump, 3, 0, SYS_ppoll},
#endif
        {jump, 2, 0, SYS_futex},
        {jump, 1, 0, SYS_exit_group},
        {verdict, 0, 0, SECCOMP_RET_KILL_PROCESS},
        {verdict, 0, 0, SECCOMP_RET_ALLOW},
    }};
    const sock_fprog filter{static_cast<unsigned short>(program.size()), program.data()};
    return ::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0) == 0 &&
           ::prctl(PR_SET_SECCOMP, SECCOMP_MODE_FILTER, &filter, 0, 0) == 0;
}

/// The kernel's own count of the read() calls of this process. Takes one read().
std::optional<long> readCalls(int ioFile) {
    std::array<char, 512> text{};
    const ssize_t size = ::read(ioFile, text.data(), text.size());
    const std::string_view all(text.data(), size > 0 ? static_cast<std::size_t>(size) : 0);
    constexpr std::string_view key = "syscr: ";
    const std::size_t found = all.find(key);
    if (found == std::string_view::npos) {
        return std::nullopt;
    }
    long count = 0;
    const char* number = text.data() + found + key.size();
    if (std::from_chars(number, text.data() + size, count).ec != std::errc{}) {
        return std::nullopt;
    }
    return count;
}

enum Outcome : int { asPromised, wrongResult, readAgain, moreCalls, notConfined, notCounted };

/// Selects a type again and again, confined, and returns how it went.
Outcome selectConfined() {
    constexpr long rounds = 1000;
    Instrumentation cursor;
    // The first selection reads the file, the second is the first that polls.
    if (!cursor.selectNode(NodeType::ComputerSystem) ||
        !cursor.selectNode(NodeType::ComputerSystem)) {
        return wrongResult;
    }
    const std::uint64_t readings = InstrumentationService::process().readings();
    // Never closed but by the end of the process: close() is not allowed by then.
    const int before = ::open("/proc/self/io", O_RDONLY | O_CLOEXEC);
    const int after = ::open("/proc/self/io", O_RDONLY | O_CLOEXEC);
    const auto callsBefore = readCalls(before);
    if (!allowNothingButPolling()) {
        return notConfined;
    }
    for (long round = 0; round < rounds; ++round) {
        if (!cursor.selectNode(NodeType::ComputerSystem)) {
            return wrongResult;
        }
    }
    if (InstrumentationService::process().readings() != readings) {
        return readAgain;
    }
    const auto callsAfter = readCalls(after);
    if (!callsBefore || !callsAfter) {
        return notCounted;
    }
    // One is that which told the first count.
    return *callsAfter - *callsBefore - 1 == rounds ? asPromised : moreCalls;
}

/// Runs in a child process. Minus the signal, when one ends the child.
int outcomeOf(Outcome (*run)()) {
    const pid_t child = ::fork();
    if (child == 0) {
        // Not by _exit(), ahead of which a sanitizer makes calls of its own.
        ::syscall(SYS_exit_group, static_cast<int>(run()));
    }
    int status = 0;
    EXPECT_EQ(::waitpid(child, &status, 0), child);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
}

/// Whether the program runs under the thread sanitizer, whose own memory calls the
/// confinement would take for the service's.
constexpr bool underThreadSanitizer =
#ifdef ZR_SANITIZERS
    std::string_view(ZR_SANITIZERS).find("thread") != std::string_view::npos;
#else
    false;
#endif

TEST(PollCost, SelectingATypeCostsOneReadAndNoOtherCallWhileNothingChanges) {
    if (underThreadSanitizer) {
        GTEST_SKIP() << "the thread sanitizer makes system calls of its own";
    }
    const TemporaryDirectory directory;
    writeFile(directory / "tree.json", R"({"nodes": [{"type": "ComputerSystem"}]})");
    InstrumentationService::process().useSource(
        std::make_unique<JsonTreeSource>(directory / "tree.json"));
    const int outcome = outcomeOf(selectConfined);
    InstrumentationService::process().useSource(
        std::make_unique<HandSource>(std::make_shared<HandSource::State>()));
    if (outcome == notConfined || outcome == notCounted) {
        GTEST_SKIP() << "this kernel does not confine a process, or not count its calls";
    }
    EXPECT_EQ(outcome, asPromised);
}

TEST(PollCost, TheConfinementHolds) {
    const int outcome = outcomeOf([] {
        if (!allowNothingButPolling()) {
            return notConfined;
        }
        static_cast<void>(::getppid());
        return asPromised;
    });
    if (outcome == notConfined) {
        GTEST_SKIP() << "this kernel does not confine a process";
    }
    EXPECT_EQ(outcome, -SIGSYS);
}

}  // namespace
}  // namespace ZR::Testing
