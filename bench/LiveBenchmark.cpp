// What a reading of the live machine costs with 10, 1,000 and 10,000 interfaces, beside
// what it cannot cost less than: the bare reading of the same run asks the kernel for the
// same links, addresses, directories, files and names of processes, each once, and looks
// at none of them. getifaddrs(3) and the bare dump of links and addresses stand beside
// it. Needs root: the links lie in a network namespace of its own, with a file system of
// its own where DHCP clients leave their state files.
//
// The links are a bridge and macvlans above it, which count as interfaces; each has one
// address. A namespace of as many bridges would hold the kernel's lock of all links for
// minutes when it goes, and hold up every other process.
//
// Prints Google Benchmark's figures and, below them, the ratios of the same run. Those are
// of processor time: everything here is work of the kernel for the reader or of the
// reader, and what else the machine does makes the clock's ratios differ from run to run.

#include <benchmark/benchmark.h>
#include <dirent.h>
#include <fcntl.h>
#include <ifaddrs.h>
#include <libmnl/libmnl.h>
#include <linux/rtnetlink.h>
#include <net/if.h>
#include <sys/ioctl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cctype>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include "OwnMachine.h"
#include "RunBenchmarks.h"
#include "StateReaders.h"
#include "zrclient/Instrumentation.h"
#include "zrclient/InstrumentationService.h"
#include "zrcommon/UniqueFd.h"
#include "zrlinux/LiveSource.h"

namespace {

using Clock = std::chrono::steady_clock;
using ZR::NodeLexicon::NodeType;

using bench::fail;

void enterMachineWithALease() {
    bench::enterOwnMachine();
    bench::leaveLeases(bench::leaseOf("b1", "10.0.0.2", "10.0.0.1"));
}

/// Makes links until there are so many.
void growTo(std::int64_t wanted) {
    static std::int64_t present = 0;
    if (wanted <= present) {
        return;
    }
    std::string lines;
    for (; present < wanted; ++present) {
        const std::string link = "b" + std::to_string(present);
        lines += "link add " + link;
        lines += present == 0 ? " type bridge\n" : " link b0 type macvlan mode bridge\n";
        lines += "addr add 10." + std::to_string(present / 62500) + "." +
                 std::to_string(present / 250 % 250) + "." + std::to_string(present % 250 + 1) +
                 "/32 dev " + link + "\n";
    }
    bench::configureLinks(lines);
}

/// Changes one link, so that the kernel tells of it.
void causeEvent() {
    static const ZR::UniqueFd socket{::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0)};
    static int mtu = 1500;
    mtu = mtu == 1500 ? 1400 : 1500;
    ifreq request{};
    std::strcpy(&request.ifr_name[0], "b0");
    request.ifr_mtu = mtu;
    if (::ioctl(socket.get(), SIOCSIFMTU, &request) != 0) {
        fail("SIOCSIFMTU");
    }
}

bool requireInterfaces(const ZR::Snapshot& snapshot, std::int64_t wanted, benchmark::State& state) {
    std::int64_t count = 0;
    for (auto node = snapshot.first(NodeType::NetworkInterface); node != ZR::Snapshot::none;
         node = snapshot.node(node).nextOfType) {
        ++count;
    }
    if (count != wanted) {
        state.SkipWithError(("read " + std::to_string(count) + " interfaces").c_str());
    }
    return count == wanted;
}

void coldReading(benchmark::State& state) {
    growTo(state.range(0));
    for (auto _ : state) {
        auto source = ZR::openLiveSource();
        const auto snapshot = source->read();
        state.PauseTiming();
        if (!requireInterfaces(*snapshot, state.range(0), state)) {
            break;
        }
        // The kernel takes its time to close what watches files, and no caller waits for it.
        source.reset();
        state.ResumeTiming();
    }
}

void warmCursor(benchmark::State& state) {
    growTo(state.range(0));
    auto& service = ZR::InstrumentationService::process();
    service.useSource(ZR::openLiveSource());
    if (!requireInterfaces(*service.current(), state.range(0), state)) {
        return;
    }
    const std::uint64_t readings = service.readings();
    for (auto _ : state) {
        ZR::Instrumentation cursor;
        benchmark::DoNotOptimize(cursor.selectNode(NodeType::NetworkInterface));
    }
    if (service.readings() != readings) {
        state.SkipWithError("it was read again");
    }
}

void readingAfterAnEvent(benchmark::State& state) {
    growTo(state.range(0));
    auto& service = ZR::InstrumentationService::process();
    service.useSource(ZR::openLiveSource());
    if (!requireInterfaces(*service.current(), state.range(0), state)) {
        return;
    }
    for (auto _ : state) {
        causeEvent();
        const std::uint64_t readings = service.readings();
        const auto start = Clock::now();
        ZR::Instrumentation cursor;
        benchmark::DoNotOptimize(cursor.selectNode(NodeType::NetworkInterface));
        state.SetIterationTime(std::chrono::duration<double>(Clock::now() - start).count());
        if (service.readings() != readings + 1) {
            state.SkipWithError("it was not read again");
        }
    }
}

void getIfAddrs(benchmark::State& state) {
    growTo(state.range(0));
    for (auto _ : state) {
        ifaddrs* addresses = nullptr;
        if (::getifaddrs(&addresses) != 0) {
            fail("getifaddrs");
        }
        ::freeifaddrs(addresses);
    }
}

using Socket = std::unique_ptr<mnl_socket, int (*)(mnl_socket*)>;

Socket openSocket() {
    Socket socket{::mnl_socket_open(NETLINK_ROUTE), ::mnl_socket_close};
    if (!socket || ::mnl_socket_bind(socket.get(), 0, MNL_SOCKET_AUTOPID) != 0) {
        fail("netlink");
    }
    return socket;
}

/// Receives a whole dump and looks at nothing but its end.
void dump(mnl_socket* socket, std::uint16_t type, std::vector<char>& buffer) {
    nlmsghdr* const request = ::mnl_nlmsg_put_header(buffer.data());
    request->nlmsg_type = type;
    request->nlmsg_flags = NLM_F_REQUEST | NLM_F_DUMP;
    if (type == RTM_GETLINK) {
        ::mnl_nlmsg_put_extra_header(request, sizeof(ifinfomsg));
        ::mnl_attr_put_u32(request, IFLA_EXT_MASK, RTEXT_FILTER_SKIP_STATS);
    } else {
        ::mnl_nlmsg_put_extra_header(request, sizeof(ifaddrmsg));
    }
    if (::mnl_socket_sendto(socket, request, request->nlmsg_len) < 0) {
        fail("send");
    }
    for (bool more = true; more;) {
        const ssize_t got = ::mnl_socket_recvfrom(socket, buffer.data(), buffer.size());
        if (got <= 0) {
            fail("receive");
        }
        nlmsghdr first{};
        std::memcpy(&first, buffer.data(), sizeof first);
        more = first.nlmsg_type != NLMSG_DONE;
    }
}

void bareDump(benchmark::State& state) {
    growTo(state.range(0));
    const Socket socket = openSocket();
    std::vector<char> buffer(32768);
    for (auto _ : state) {
        dump(socket.get(), RTM_GETLINK, buffer);
        dump(socket.get(), RTM_GETADDR, buffer);
    }
}

/// Reads a file to its end, if it is there, into memory that is there already.
std::size_t readBare(const char* path, std::vector<char>& buffer) {
    const ZR::UniqueFd fd{::open(path, O_RDONLY | O_CLOEXEC)};
    std::size_t all = 0;
    for (ssize_t got = 1; fd && got > 0;) {
        got = ::read(fd.get(), buffer.data(), buffer.size());
        all += got > 0 ? static_cast<std::size_t>(got) : 0;
    }
    return all;
}

template <typename Action>
void forEachName(const char* path, Action action) {
    const std::unique_ptr<DIR, int (*)(DIR*)> directory{::opendir(path), ::closedir};
    while (directory) {
        const dirent* const entry = ::readdir(directory.get());
        if (entry == nullptr) {
            break;
        }
        action(std::string_view{&entry->d_name[0]});
    }
}

/// The numbers of the kernel's own threads, whose names a reading does not look at.
std::set<std::string, std::less<>> kernelThreads() {
    std::set<std::string, std::less<>> threads;
    FILE* const children = std::fopen("/proc/2/task/2/children", "r");
    std::array<char, 16> word{};
    while (children != nullptr && std::fscanf(children, "%15s", word.data()) == 1) {
        threads.emplace(word.data());
    }
    if (children != nullptr) {
        static_cast<void>(std::fclose(children));
    }
    return threads;
}

/// Each directory once, with the names of files in it that are read.
std::map<std::string, std::vector<std::string>> placesToRead() {
    std::map<std::string, std::vector<std::string>> places;
    for (const ZR::Live::StateReader& reader : ZR::Live::stateReaders()) {
        for (const ZR::Live::StatePlace& place : reader.places) {
            places[std::string{place.directory}].emplace_back(place.namePrefix);
        }
    }
    return places;
}

/// What a reading has to ask the kernel for; a cold one has no sockets yet, either. What
/// comes after a pause finds the processor's caches used by others: cold readings do, and
/// what they are compared with is to do so, too.
template <bool afterPauses>
void bareReading(benchmark::State& state) {
    growTo(state.range(0));
    const auto places = placesToRead();
    const auto ofKernel = kernelThreads();
    std::vector<char> buffer(32768);
    std::string path;
    for (auto _ : state) {
        if constexpr (afterPauses) {
            state.PauseTiming();
            static_cast<void>(ZR::openLiveSource()->read());
            state.ResumeTiming();
        }
        const Socket socket = openSocket();
        dump(socket.get(), RTM_GETLINK, buffer);
        dump(socket.get(), RTM_GETADDR, buffer);
        readBare("/proc/2/stat", buffer);
        readBare("/proc/2/task/2/children", buffer);
        forEachName("/proc", [&](std::string_view name) {
            if (std::isdigit(static_cast<unsigned char>(name.front())) != 0 &&
                ofKernel.find(name) == ofKernel.end()) {
                path.assign("/proc/").append(name).append("/comm");
                const ZR::UniqueFd fd{::open(path.c_str(), O_RDONLY | O_CLOEXEC)};
                benchmark::DoNotOptimize(::read(fd.get(), buffer.data(), 32));
            }
        });
        for (const auto& [directory, prefixes] : places) {
            forEachName(directory.c_str(), [&, &of = directory, &wanted = prefixes](auto name) {
                bool read = false;
                for (const std::string& prefix : wanted) {
                    read = read || (name.front() != '.' && name.starts_with(prefix));
                }
                if (read) {
                    path.assign(of).append("/").append(name);
                    readBare(path.c_str(), buffer);
                }
            });
        }
        for (const char* file :
             {"/proc/loadavg", "/proc/thread-self/net/udp", "/proc/thread-self/net/packet"}) {
            readBare(file, buffer);
        }
    }
}

/// Prints the usual figures and remembers microseconds of the processor per iteration of each.
class RememberingReporter : public benchmark::ConsoleReporter {
  public:
    void ReportRuns(const std::vector<Run>& runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run& run : runs) {
            if (!run.error_occurred) {
                const std::string name = run.benchmark_name();
                microseconds[name.substr(0, name.find("/manual_time"))] =
                    run.GetAdjustedCPUTime() * 1e6 /
                    benchmark::GetTimeUnitMultiplier(run.time_unit);
            }
        }
    }

    std::map<std::string, double> microseconds;
};

void printRatios(const std::map<std::string, double>& microseconds) {
    const auto of = [&](const char* name, const char* count) {
        const auto found = microseconds.find(std::string(name) + '/' + count);
        return found == microseconds.end() ? 0.0 : found->second;
    };
    std::printf("\n%-7s %10s %12s %12s | %-22s | %-22s\n", "", "bare dump", "bare reading",
                "getifaddrs", "cold: / bare / getif", "event: / bare / getif");
    for (const char* count : {"10", "1000", "10000"}) {
        const double bare = of("bare reading", count);
        const double again = of("bare reading again", count);
        const double getif = of("getifaddrs", count);
        const double cold = of("cold reading", count);
        const double event = of("reading after an event", count);
        if (bare > 0 && getif > 0) {
            std::printf("%-7s %7.0f us %9.0f us %9.0f us | %12.2f %7.2f   | %13.2f %7.2f\n", count,
                        of("bare dump", count), bare, getif, cold / bare, cold / getif,
                        event / again, event / getif);
        }
    }
    const double warm10 = of("warm cursor", "10");
    if (warm10 > 0) {
        std::printf("a warm cursor with 10,000 interfaces costs %.2f of one with 10\n",
                    of("warm cursor", "10000") / warm10);
    }
}

}  // namespace

int main(int argc, char** argv) {
    ::setenv("ZR_LOG_SINK", "none", 1);
    ::setenv("ZR_TRACE_SINK", "none", 1);
    ::unsetenv("ZR_INSTRUMENTATION_TREE");
    // In the order in which they run: the number of links only ever grows.
    for (const std::int64_t count : {10, 1'000, 10'000}) {
        benchmark::RegisterBenchmark("bare dump", bareDump)->Arg(count);
        benchmark::RegisterBenchmark("bare reading", bareReading<true>)->Arg(count);
        benchmark::RegisterBenchmark("bare reading again", bareReading<false>)->Arg(count);
        benchmark::RegisterBenchmark("getifaddrs", getIfAddrs)->Arg(count);
        benchmark::RegisterBenchmark("cold reading", coldReading)->Arg(count);
        benchmark::RegisterBenchmark("warm cursor", warmCursor)->Arg(count);
        benchmark::RegisterBenchmark("reading after an event", readingAfterAnEvent)
            ->Arg(count)
            ->UseManualTime();
    }
    enterMachineWithALease();
    RememberingReporter reporter;
    if (!bench::run(argc, argv, reporter)) {
        return 2;
    }
    printRatios(reporter.microseconds);
    return 0;
}
