// What a reading of the live machine costs with 10, 1,000 and 10,000 interfaces, beside
// the two floors of the same run: getifaddrs(3), and a bare dump of links and addresses
// that nobody parses. Needs root: the links lie in a network namespace of its own, with
// empty directories where DHCP clients leave their traces.
//
// The links are bridges, which any kernel has and which count as interfaces; each has
// one address.
//
// Prints Google Benchmark's figures and, below them, the ratios of the same run.

#include <benchmark/benchmark.h>
#include <ifaddrs.h>
#include <libmnl/libmnl.h>
#include <linux/rtnetlink.h>
#include <net/if.h>
#include <sched.h>
#include <sys/ioctl.h>
#include <sys/mount.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "zrclient/Instrumentation.h"
#include "zrclient/InstrumentationService.h"
#include "zrclient/LiveSource.h"
#include "zrcommon/UniqueFd.h"

namespace {

using Clock = std::chrono::steady_clock;
using ZR::NodeLexicon::NodeType;

[[noreturn]] void fail(const char* what) {
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

/// Makes links until there are so many.
void growTo(std::int64_t wanted) {
    static std::int64_t present = 0;
    if (wanted <= present) {
        return;
    }
    FILE* const ip = ::popen("ip -batch -", "w");
    if (ip == nullptr) {
        fail("ip");
    }
    for (; present < wanted; ++present) {
        const auto number = static_cast<int>(present);
        std::fprintf(ip, "link add b%d type bridge\naddr add 10.%d.%d.%d/32 dev b%d\n", number,
                     number / 62500, number / 250 % 250, number % 250 + 1, number);
    }
    if (::pclose(ip) != 0) {
        std::fprintf(stderr, "the links cannot be made\n");
        std::exit(1);
    }
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

void requireInterfaces(const ZR::Snapshot& snapshot, std::int64_t wanted, benchmark::State& state) {
    std::int64_t count = 0;
    for (auto node = snapshot.first(NodeType::NetworkInterface); node != ZR::Snapshot::none;
         node = snapshot.node(node).nextOfType) {
        ++count;
    }
    if (count != wanted) {
        state.SkipWithError(("read " + std::to_string(count) + " interfaces").c_str());
    }
}

void coldReading(benchmark::State& state) {
    growTo(state.range(0));
    for (auto _ : state) {
        auto source = ZR::openLiveSource();
        const auto snapshot = source->read();
        state.PauseTiming();
        requireInterfaces(*snapshot, state.range(0), state);
        // The kernel takes its time to close what watches files, and nobody waits for it.
        source.reset();
        state.ResumeTiming();
    }
}

void warmCursor(benchmark::State& state) {
    growTo(state.range(0));
    auto& service = ZR::InstrumentationService::process();
    service.useSource(ZR::openLiveSource());
    requireInterfaces(*service.current(), state.range(0), state);
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
    requireInterfaces(*service.current(), state.range(0), state);
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

/// Receives a whole dump and looks at nothing but its end.
void dump(mnl_socket* socket, std::uint16_t type, std::vector<char>& buffer) {
    nlmsghdr* const request = ::mnl_nlmsg_put_header(buffer.data());
    request->nlmsg_type = type;
    request->nlmsg_flags = NLM_F_REQUEST | NLM_F_DUMP;
    ::mnl_nlmsg_put_extra_header(request, sizeof(rtgenmsg));
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
    const std::unique_ptr<mnl_socket, int (*)(mnl_socket*)> socket{::mnl_socket_open(NETLINK_ROUTE),
                                                                   ::mnl_socket_close};
    if (!socket || ::mnl_socket_bind(socket.get(), 0, MNL_SOCKET_AUTOPID) != 0) {
        fail("netlink");
    }
    std::vector<char> buffer(32768);
    for (auto _ : state) {
        dump(socket.get(), RTM_GETLINK, buffer);
        dump(socket.get(), RTM_GETADDR, buffer);
    }
}

/// Prints the usual figures and remembers microseconds per iteration of each.
class RememberingReporter : public benchmark::ConsoleReporter {
  public:
    void ReportRuns(const std::vector<Run>& runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run& run : runs) {
            if (!run.error_occurred) {
                const std::string name = run.benchmark_name();
                microseconds[name.substr(0, name.find("/manual_time"))] =
                    run.GetAdjustedRealTime() * 1e6 /
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
    std::printf("\n%-12s %12s %12s | %-21s | %-21s\n", "", "bare dump", "getifaddrs",
                "cold: / dump  / getif", "event: / dump  / getif");
    for (const char* count : {"10", "1000", "10000"}) {
        const double bare = of("bare dump", count);
        const double getif = of("getifaddrs", count);
        const double cold = of("cold reading", count);
        const double event = of("reading after an event", count);
        if (bare > 0 && getif > 0) {
            std::printf("%-12s %9.0f us %9.0f us | %12.2f %8.2f | %13.2f %8.2f\n", count, bare,
                        getif, cold / bare, cold / getif, event / bare, event / getif);
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
        benchmark::RegisterBenchmark("getifaddrs", getIfAddrs)->Arg(count);
        benchmark::RegisterBenchmark("cold reading", coldReading)->Arg(count);
        benchmark::RegisterBenchmark("warm cursor", warmCursor)->Arg(count);
        benchmark::RegisterBenchmark("reading after an event", readingAfterAnEvent)
            ->Arg(count)
            ->UseManualTime();
    }
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) {
        return 2;
    }
    enterOwnMachine();
    RememberingReporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    printRatios(reporter.microseconds);
    return 0;
}
