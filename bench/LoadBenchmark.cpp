// How soon a freshly loaded library responds, and what it keeps: from opening the
// library to the response to its first request on a live machine of four interfaces,
// beside the floor, a library opened and closed that does nothing. Needs root: the
// links lie in a network namespace of its own.
//
// Prints Google Benchmark's figures and, below them, the ratio of the same run and by
// how much the process grew with the library.

#include <benchmark/benchmark.h>
#include <dlfcn.h>
#include <malloc.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "OwnMachine.h"
#include "RunBenchmarks.h"
#include "cimom/ObjectManager.h"
#include "cimom/Results.h"

namespace {

constexpr std::size_t interfaces = 4;

void enterMachineOfFour() {
    bench::enterOwnMachine();
    std::string lines;
    std::string leases;
    for (std::size_t i = 0; i < interfaces; ++i) {
        // The address and its lease have no end.
        const std::string link = "b" + std::to_string(i);
        const std::string address = "192.0.2." + std::to_string(i + 1);
        lines += "link add " + link + " type bridge\nlink set " + link + " up\naddr add " +
                 address + "/32 dev " + link + "\n";
        leases += bench::leaseOf(link, address, "192.0.2.254");
    }
    bench::leaveLeases(leases);
    bench::configureLinks(lines);
    ::setenv("ZR_LOG_SINK", "none", 1);
    ::setenv("ZR_TRACE_SINK", "none", 1);
}

cimom::Configuration configuration() {
    cimom::Configuration all;
    all.schemaDirectories = {ZR_SOURCE_DIR "/schema"};
    all.registrationFiles = {ZR_SOURCE_DIR "/schema/exact/DHCPClientProvider.registration"};
    all.providerDirectories = {ZR_BINARY_DIR "/lib/cmpi"};
    return all;
}

long residentKilobytes() {
    std::ifstream file("/proc/self/smaps_rollup");
    std::string word;
    long value = 0;
    while (file >> word) {
        if (word == "Rss:") {
            file >> value;
            return value;
        }
    }
    bench::fail("/proc/self/smaps_rollup");
}

/// Asks the first request of a manager, which loads the library for it.
bool ask(cimom::ObjectManager& manager) {
    const cimom::InstancesResult result =
        manager.enumerateInstances({"", "root/cimv2", "QVXZR_DHCPProtocolEndpoint", {}});
    return result.status.ok() && result.instances.size() == interfaces;
}

void bareLoad(benchmark::State& state) {
    for (auto _ : state) {
        void* const library =
            ::dlopen(ZR_BINARY_DIR "/lib/cmpi/libDHCPClientProvider.so", RTLD_NOW | RTLD_LOCAL);
        if (library == nullptr) {
            state.SkipWithError(::dlerror());
            return;
        }
        ::dlclose(library);
    }
}

void firstResponse(benchmark::State& state, long growth) {
    for (auto _ : state) {
        state.PauseTiming();
        auto manager = std::make_unique<cimom::ObjectManager>(configuration());
        state.ResumeTiming();
        const bool complete = ask(*manager);
        state.PauseTiming();
        if (!complete) {
            state.SkipWithError("the four interfaces do not show");
        }
        manager.reset();
        state.ResumeTiming();
    }
    state.counters["resident_kB"] = static_cast<double>(growth);
}

/// Growth of resident memory over the first of all requests, in kilobytes. Pages of the
/// library that are only in the page cache until then count as well.
long growthOfFirstLoad() {
    auto manager = std::make_unique<cimom::ObjectManager>(configuration());
    ::malloc_trim(0);
    const long before = residentKilobytes();
    if (!ask(*manager)) {
        std::fprintf(stderr, "the four interfaces do not show\n");
        std::exit(1);
    }
    return residentKilobytes() - before;
}

class Reporter : public benchmark::ConsoleReporter {
  public:
    void ReportRuns(const std::vector<Run>& runs) override {
        for (const Run& run : runs) {
            times_[run.benchmark_name()] = run.GetAdjustedRealTime();
        }
        ConsoleReporter::ReportRuns(runs);
    }
    double time(const char* name) { return times_[name]; }

  private:
    std::map<std::string, double> times_;
};

}  // namespace

int main(int argc, char** argv) {
    enterMachineOfFour();
    const long growth = growthOfFirstLoad();
    benchmark::RegisterBenchmark("bare load", bareLoad)->Unit(benchmark::kMicrosecond);
    benchmark::RegisterBenchmark(
        "load to first response",
        [growth](benchmark::State& state) { firstResponse(state, growth); })
        ->Unit(benchmark::kMicrosecond)
        ->UseRealTime();
    Reporter reporter;
    if (!bench::run(argc, argv, reporter)) {
        return 2;
    }
    const double floor = reporter.time("bare load");
    const double response = reporter.time("load to first response/real_time");
    std::printf("\nload to first response: %.0f us, %.1f of a bare load (%.0f us)\n", response,
                response / floor, floor);
    std::printf("resident memory grew by %ld kB with the library and its first request\n", growth);
    return 0;
}
