#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <net/if.h>
#include <sys/ioctl.h>
#include <sys/ptrace.h>
#include <sys/socket.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <functional>

#include "LinuxSupport.h"
#include "kernel/ChangeMonitor.h"
#include "kernel/WatchedPlace.h"
#include "kit/Diagnostics.h"
#include "kit/Namespaces.h"

namespace ZR::Live {
namespace {

using testing::IsEmpty;

class ChangeMonitorTest : public testing::Test {
  protected:
    void watch(const std::string& below, const std::string& prefix = "") {
        places_.push_back({.directory = root_.path(below), .namePrefix = prefix});
    }
    void begin() {
        std::vector<ZR::Diagnostic> diagnostics;
        monitor_.begin(places_, diagnostics);
        EXPECT_THAT(ZR::Testing::textsOf(diagnostics), IsEmpty());
    }
    void makeDirectory(const std::string& below) const {
        std::filesystem::create_directories(root_.path(below));
    }

    TemporaryDirectory root_;
    std::vector<WatchedPlace> places_;
    ChangeMonitor monitor_;
};

TEST_F(ChangeMonitorTest, BeforeItBeginsEverythingCountsAsChanged) {
    EXPECT_TRUE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, WithNothingHappeningNothingChanges) {
    makeDirectory("/leases");
    watch("/leases");
    begin();
    EXPECT_FALSE(monitor_.changed());
    EXPECT_FALSE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, EveryWayToChangeAFileIsNoticed) {
    makeDirectory("/leases");
    watch("/leases");
    begin();
    root_.write("/leases/2", "x");
    EXPECT_TRUE(monitor_.changed());
    EXPECT_TRUE(monitor_.changed()) << "stays so until the next beginning";
    begin();
    EXPECT_FALSE(monitor_.changed());
    std::filesystem::rename(root_.path("/leases/2"), root_.path("/leases/3"));
    EXPECT_TRUE(monitor_.changed());
    begin();
    std::filesystem::permissions(root_.path("/leases/3"), std::filesystem::perms::none);
    EXPECT_TRUE(monitor_.changed());
    begin();
    std::filesystem::remove(root_.path("/leases/3"));
    EXPECT_TRUE(monitor_.changed());
    begin();
    EXPECT_FALSE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, AppendingToAFileThatStaysOpenIsNoticed) {
    makeDirectory("/dhcp");
    std::ofstream file{root_.path("/dhcp/dhclient.leases")};
    watch("/dhcp", "dhclient");
    begin();
    file << "lease" << std::flush;
    EXPECT_TRUE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, ReadingChangesNothing) {
    root_.write("/leases/2", "x");
    watch("/leases");
    begin();
    EXPECT_TRUE(File::read(root_.path("/leases/2")));
    EXPECT_FALSE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, FilesOfOtherNamesDoNotCount) {
    makeDirectory("/state");
    watch("/state", "dhclient");
    begin();
    root_.write("/state/timestamps", "x");
    EXPECT_FALSE(monitor_.changed());
    root_.write("/state/dhclient-1-eth0.lease", "x");
    EXPECT_TRUE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, OneDirectoryMayBeWatchedForSeveralNames) {
    makeDirectory("/state");
    ASSERT_EQ(::symlink("state", root_.path("/alias").c_str()), 0);
    watch("/state", "a");
    watch("/alias", "b");
    begin();
    root_.write("/state/a", "x");
    EXPECT_TRUE(monitor_.changed());
    begin();
    root_.write("/state/b", "x");
    EXPECT_TRUE(monitor_.changed());
    begin();
    root_.write("/state/c", "x");
    EXPECT_FALSE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, ADirectoryThatComesLaterIsNoticedStepByStep) {
    watch("/run/systemd/netif/leases");
    begin();
    EXPECT_FALSE(monitor_.changed());
    for (const char* step : {"/run", "/run/systemd", "/run/systemd/netif",
                             "/run/systemd/netif/leases", "/run/systemd/netif/leases/2"}) {
        makeDirectory(step);
        EXPECT_TRUE(monitor_.changed()) << step;
        begin();
        EXPECT_FALSE(monitor_.changed()) << step;
    }
}

TEST_F(ChangeMonitorTest, ADirectoryThatComesAllAtOnceIsNoticedAndThenWatched) {
    watch("/run/systemd/netif/leases");
    begin();
    makeDirectory("/run/systemd/netif/leases");
    EXPECT_TRUE(monitor_.changed());
    begin();
    root_.write("/run/systemd/netif/leases/2", "x");
    EXPECT_TRUE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, OtherNewcomersBesideAnAwaitedDirectoryDoNotCount) {
    watch("/run/systemd/netif");
    begin();
    makeDirectory("/other");
    root_.write("/file", "x");
    EXPECT_FALSE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, AnAncestorMayBeWatchedForItself) {
    makeDirectory("/lib");
    watch("/lib/dhcp", "dhclient");
    watch("/lib", "dhclient");
    begin();
    root_.write("/lib/other", "x");
    EXPECT_FALSE(monitor_.changed());
    root_.write("/lib/dhclient.leases", "x");
    EXPECT_TRUE(monitor_.changed());
    begin();
    makeDirectory("/lib/dhcp");
    EXPECT_TRUE(monitor_.changed());
    begin();
    root_.write("/lib/dhcp/dhclient.leases", "x");
    EXPECT_TRUE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, SeveralPlacesMayWaitForOneDirectory) {
    const std::array<const char*, 4> places{"/run/a/b/c", "/run/a/b", "/run/a/d", "/run/a"};
    for (const char* place : places) {
        watch(place);
    }
    begin();
    EXPECT_FALSE(monitor_.changed());
    makeDirectory("/run/a");
    EXPECT_TRUE(monitor_.changed());
    begin();
    makeDirectory("/run/a/b/c");
    EXPECT_TRUE(monitor_.changed());
    begin();
    EXPECT_FALSE(monitor_.changed());
    makeDirectory("/run/a/d");
    EXPECT_TRUE(monitor_.changed());
    begin();
    for (const char* place : places) {
        root_.write(std::string{place} + "/x", "x");
        EXPECT_TRUE(monitor_.changed()) << place;
        begin();
        EXPECT_FALSE(monitor_.changed()) << place;
    }
}

TEST_F(ChangeMonitorTest, AFileInTheWayOfADirectoryIsWaitedFor) {
    root_.write("/run/db", "x");
    watch("/run/db/dhcpcd");
    watch("/run/db/other");
    begin();
    EXPECT_FALSE(monitor_.changed());
    std::filesystem::remove(root_.path("/run/db"));
    makeDirectory("/run/db/other");
    EXPECT_TRUE(monitor_.changed());
    begin();
    root_.write("/run/db/other/x", "x");
    EXPECT_TRUE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, ADirectoryThatGoesAndComesAgainIsWatchedAgain) {
    makeDirectory("/leases");
    watch("/leases");
    begin();
    std::filesystem::remove(root_.path("/leases"));
    EXPECT_TRUE(monitor_.changed());
    begin();
    EXPECT_FALSE(monitor_.changed());
    makeDirectory("/leases");
    EXPECT_TRUE(monitor_.changed());
    begin();
    root_.write("/leases/2", "x");
    EXPECT_TRUE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, ADirectoryThatIsMovedAwayIsNoticed) {
    makeDirectory("/leases");
    watch("/leases");
    begin();
    std::filesystem::rename(root_.path("/leases"), root_.path("/old"));
    EXPECT_TRUE(monitor_.changed());
    begin();
    makeDirectory("/leases");
    EXPECT_TRUE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, PlacesThatAreGivenUpAreWatchedNoMore) {
    makeDirectory("/a");
    makeDirectory("/b");
    watch("/a");
    watch("/b");
    begin();
    places_.pop_back();
    begin();
    root_.write("/b/file", "x");
    EXPECT_FALSE(monitor_.changed());
    root_.write("/a/file", "x");
    EXPECT_TRUE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, MoreFileEventsThanTheKernelKeepsCountAsAChange) {
    makeDirectory("/leases");
    watch("/leases", "never-used");
    begin();
    // Equal events in a row are kept once, so two files take turns.
    std::ofstream one{root_.path("/leases/one")};
    std::ofstream two{root_.path("/leases/two")};
    EXPECT_FALSE(monitor_.changed());
    std::size_t limit = 16384;
    std::ifstream{"/proc/sys/fs/inotify/max_queued_events"} >> limit;
    for (std::size_t i = 0; i < limit; ++i) {
        one << 'x' << std::flush;
        two << 'x' << std::flush;
    }
    EXPECT_TRUE(monitor_.changed());
    begin();
    EXPECT_FALSE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, AMarkCountsAsAChangeUntilTheNextBeginning) {
    begin();
    monitor_.markChanged();
    EXPECT_TRUE(monitor_.changed());
    begin();
    EXPECT_FALSE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, WhatHappensBetweenBeginAndChangedCounts) {
    makeDirectory("/leases");
    watch("/leases");
    begin();
    root_.write("/leases/2", "x");
    // The state is read now, before or after that: it cannot be known.
    EXPECT_TRUE(monitor_.changed());
}

TEST_F(ChangeMonitorTest, TheEndOfAProcessIsNoticed) {
    const pid_t process = ::fork();
    if (process == 0) {
        for (;;) {
            ::pause();
        }
    }
    ASSERT_GT(process, 0);
    const std::array<std::int32_t, 1> pids{process};
    begin();
    monitor_.watchProcesses(pids);
    EXPECT_FALSE(monitor_.changed());
    begin();
    monitor_.watchProcesses(pids);
    EXPECT_FALSE(monitor_.changed()) << "watched on, by the same descriptor";
    ::kill(process, SIGKILL);
    siginfo_t ended{};
    ASSERT_EQ(::waitid(P_PID, static_cast<id_t>(process), &ended, WEXITED | WNOWAIT), 0);
    EXPECT_TRUE(monitor_.changed());
    ASSERT_EQ(::waitpid(process, nullptr, 0), process);
    begin();
    monitor_.watchProcesses({});
    EXPECT_FALSE(monitor_.changed());
    monitor_.watchProcesses(pids);
    EXPECT_TRUE(monitor_.changed()) << "it had ended already";
}

/// Runs the action in a child process and counts its system calls, all of which
/// must be of that number. -1 when another came, or when tracing is not allowed.
int countSystemCalls(std::uint64_t number, const std::function<void()>& action, bool& traced) {
    const pid_t child = ::fork();
    if (child == 0) {
        if (::ptrace(PTRACE_TRACEME, 0, nullptr, nullptr) != 0) {
            ::_exit(1);
        }
        ::raise(SIGSTOP);
        action();
        ::syscall(SYS_exit_group, 0);  // _exit() does more where a sanitizer watches
    }
    if (child < 0) {
        return -1;
    }
    int status = 0;
    ::waitpid(child, &status, 0);
    traced = WIFSTOPPED(status) &&
             ::ptrace(PTRACE_SETOPTIONS, child, nullptr, PTRACE_O_TRACESYSGOOD) == 0;
    int count = 0;
    // Between the stop and the end lie the way out of raise(), the calls, and the end.
    bool begun = false;
    while (traced && ::ptrace(PTRACE_SYSCALL, child, nullptr, nullptr) == 0 &&
           ::waitpid(child, &status, 0) == child && WIFSTOPPED(status)) {
        __ptrace_syscall_info info{};
        ::ptrace(PTRACE_GET_SYSCALL_INFO, child, sizeof info, &info);
        if (info.op != PTRACE_SYSCALL_INFO_ENTRY || info.entry.nr == SYS_exit_group) {
            continue;
        }
        if (info.entry.nr == number) {
            begun = true;
            ++count;
        } else if (begun) {
            ADD_FAILURE() << "system call " << info.entry.nr;
            count = -1;
            ::kill(child, SIGKILL);
            ::waitpid(child, &status, 0);
            break;
        }
    }
    return count;
}

#ifdef SYS_poll
constexpr std::uint64_t pollCall = SYS_poll;
#else
constexpr std::uint64_t pollCall = SYS_ppoll;
#endif

TEST_F(ChangeMonitorTest, AnIdleCallIsOneSystemCall) {
    makeDirectory("/leases");
    watch("/leases");
    watch("/not/there/yet");
    begin();
    const std::array<std::int32_t, 1> pids{::getppid()};
    monitor_.watchProcesses(pids);
    EXPECT_FALSE(monitor_.changed());  // whatever memory it needs, it has now
    bool traced = false;
    const int count = countSystemCalls(
        pollCall,
        [&] {
            for (int i = 0; i < 100; ++i) {
                if (monitor_.changed()) {
                    ::_exit(2);
                }
            }
        },
        traced);
    if (!traced) {
        GTEST_SKIP() << "this process may not trace its children";
    }
    EXPECT_EQ(count, 100);
}

void toggle(int fd, const char* name, bool up) {
    ifreq request{};
    std::string_view{name}.copy(&request.ifr_name[0], IFNAMSIZ - 1);
    request.ifr_flags = static_cast<short>(up ? IFF_UP : 0);
    ASSERT_EQ(::ioctl(fd, SIOCSIFFLAGS, &request), 0);
}

TEST(ChangeMonitorKernel, LinksAndAddressesAreNoticed) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(20, [] {
        ChangeMonitor monitor;
        const auto begin = [&] {
            std::vector<ZR::Diagnostic> diagnostics;
            monitor.begin({}, diagnostics);
            EXPECT_THAT(ZR::Testing::textsOf(diagnostics), IsEmpty());
        };
        begin();
        EXPECT_FALSE(monitor.changed());
        for (const char* command :
             {"ip link add br0 type bridge", "ip addr add 192.0.2.1/24 dev br0",
              "ip addr del 192.0.2.1/24 dev br0", "ip link set br0 name br1"}) {
            run(command);
            EXPECT_TRUE(monitor.changed()) << command;
            begin();
            EXPECT_FALSE(monitor.changed()) << command;
        }
        // The kernel tells of IPv6 addresses by and by.
        run("ip addr add 2001:db8::1/64 dev br1 nodad");
        for (int i = 0; i < 1000 && !monitor.changed(); ++i) {
            ::usleep(5000);
        }
        EXPECT_TRUE(monitor.changed());
        begin();
        run("ip link del br1");
        EXPECT_TRUE(monitor.changed());
    }));
}

TEST(ChangeMonitorKernel, MoreNetworkEventsThanTheKernelKeepsCountAsAChange) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(20, [] {
        ChangeMonitor monitor;
        std::vector<ZR::Diagnostic> diagnostics;
        monitor.begin({}, diagnostics);
        const int fd = ::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
        // The kernel keeps about 135 messages of a default socket and says ENOBUFS
        // once for all that it drops.
        for (int i = 0; i < 500; ++i) {
            toggle(fd, "lo", i % 2 == 0);
        }
        ::close(fd);
        EXPECT_TRUE(monitor.changed());
        monitor.begin({}, diagnostics);
        EXPECT_FALSE(monitor.changed());
        run("ip link add br0 type bridge");
        EXPECT_TRUE(monitor.changed());
        EXPECT_THAT(ZR::Testing::textsOf(diagnostics), IsEmpty());
    }));
}

TEST(WatchedPlaces, AShorterPrefixCoversALongerOne) {
    const WatchedPlace place{.directory = "/d", .namePrefix = "a"};
    EXPECT_TRUE(place.covers({.directory = "/d", .namePrefix = "ab"}));
    EXPECT_FALSE(place.covers({.directory = "/d", .namePrefix = ""}));
    EXPECT_FALSE(place.covers({.directory = "/e", .namePrefix = "a"}));
}

}  // namespace
}  // namespace ZR::Live
