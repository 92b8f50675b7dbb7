// What an endpoint instance costs through the provider's function table, with
// tracing discarded, beside the floor: the same instances made from a plain vector
// through the same broker. Both serve a request of the broker's, whose path and
// context are made for each, and hand their objects to a result that only counts.
//
// Prints Google Benchmark's figures and, below them, the ratios of the same run.

#include <benchmark/benchmark.h>

#include <cstdio>
#include <map>
#include <string>
#include <vector>

#include "BenchmarkMachine.h"
#include "RunBenchmarks.h"
#include "cimom/Instance.h"
#include "include/TracePoint.h"
#include "kit/Host.h"
#include "kit/LogCapture.h"
#include "providerutilities/ProviderUtilities.h"

namespace {

using ZR::ProviderUtilities;

struct PlainEndpoint {
    std::string name;
    std::string systemName;
};

/// The floor: exactly the paths and instances that the provider makes, from facts
/// that lie ready.
void makePlainInstances(const CMPIBroker* broker, const std::vector<PlainEndpoint>& endpoints,
                        const CMPIResult* result) {
    const std::string className = "QVXZR_DHCPProtocolEndpoint";
    const std::string systemClass = "QVXZR_ComputerSystem";
    const std::vector<unsigned short> options{8, 14, 17};
    for (const PlainEndpoint& endpoint : endpoints) {
        CMPIObjectPath* path =
            ProviderUtilities::createObjectPath(broker, className.c_str(), "root/cimv2");
        ProviderUtilities::setKeyProperty(path, "SystemCreationClassName", systemClass);
        ProviderUtilities::setKeyProperty(path, "SystemName", endpoint.systemName);
        ProviderUtilities::setKeyProperty(path, "CreationClassName", className);
        ProviderUtilities::setKeyProperty(path, "Name", endpoint.name);
        CMPIInstance* instance = ProviderUtilities::createInstance(broker, path);
        const auto text = [&](const char* name, const std::string& value) {
            ProviderUtilities::setProperty(instance, name, value);
        };
        const auto number = [&](const char* name, unsigned short value) {
            ProviderUtilities::setProperty(instance, name, value);
        };
        text("ElementName", endpoint.name);
        number("RequestedState", 2);
        text("SystemCreationClassName", systemClass);
        text("SystemName", endpoint.systemName);
        text("CreationClassName", className);
        text("Description", "Ethernet interface");
        number("EnabledState", 2);
        text("Name", endpoint.name);
        text("NameFormat", "NICName");
        number("ProtocolIFType", 1);
        text("OtherTypeDescription", "DHCP");
        number("ClientState", 8);
        ProviderUtilities::setProperty(broker, instance, "OptionsReceived", options);
        result->ft->returnInstance(result, instance);
    }
}

void floorOfInstances(benchmark::State& state) {
    test::Host host;
    std::vector<PlainEndpoint> endpoints;
    for (std::int64_t i = 0; i < state.range(0); ++i) {
        endpoints.push_back({"eth" + std::to_string(i), "host.example"});
    }
    bench::CountingResult result;
    for (auto _ : state) {
        host.request(test::Host::Kind::instances, test::pathOf("QVXZR_DHCPProtocolEndpoint"),
                     [&](auto* /*context*/, auto* /*collector*/, auto* /*path*/) {
                         makePlainInstances(host.broker(), endpoints, &result.record);
                         return CMPIStatus{CMPI_RC_OK, nullptr};
                     });
    }
    state.SetItemsProcessed(result.objects);
}

void ask(test::Host& host, const char* className, const CMPIResult& result) {
    host.request(test::Host::Kind::instances, test::pathOf(className),
                 [&](auto* context, auto* /*collector*/, auto* path) {
                     return host.instanceTable().enumerateInstances(nullptr, context, &result, path,
                                                                    nullptr);
                 });
}

/// How many trace points an instance costs, those of its share of the request with it.
double tracePointsEach(test::Host& host, const char* className) {
    bench::CountingResult result;
    const ZR::Testing::LogCapture capture;
    ask(host, className, result.record);
    return static_cast<double>(capture.log().size()) / static_cast<double>(result.objects);
}

void enumerate(benchmark::State& state, const char* className) {
    bench::setInterfaces(state.range(0));
    test::Host host;
    state.counters["trace_points"] = tracePointsEach(host, className);
    bench::CountingResult result;
    for (auto _ : state) {
        ask(host, className, result.record);
    }
    state.SetItemsProcessed(result.objects);
}

const std::string loggerBenchmark = ZR::loggerCategory;
const ZR::TraceSource source{"bench/EnumerateBenchmark", loggerBenchmark};

void discardedTracePoint(benchmark::State& state) {
    for (auto _ : state) {
        ZR::traceVariable(ZR_HERE, "classId", 4U);
    }
    state.SetItemsProcessed(state.iterations());
}

/// Prints the usual figures and remembers nanoseconds per item of each.
class RememberingReporter : public benchmark::ConsoleReporter {
  public:
    void ReportRuns(const std::vector<Run>& runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run& run : runs) {
            const auto rate = run.counters.find("items_per_second");
            if (rate != run.counters.end() && rate->second.value > 0) {
                nanoseconds[run.benchmark_name()] = 1e9 / rate->second.value;
            }
        }
    }

    std::map<std::string, double> nanoseconds;
};

void printRatios(const std::map<std::string, double>& nanoseconds) {
    std::printf("\n%-24s %14s %14s %8s\n", "endpoints", "instance [ns]", "floor [ns]", "ratio");
    for (const char* count : {"1", "100", "1000"}) {
        const auto instance = nanoseconds.find(std::string("QVXZR_DHCPProtocolEndpoint/") + count);
        const auto floor = nanoseconds.find(std::string("floor/") + count);
        if (instance != nanoseconds.end() && floor != nanoseconds.end()) {
            std::printf("%-24s %14.0f %14.0f %8.2f\n", count, instance->second, floor->second,
                        instance->second / floor->second);
        }
    }
    const auto trace = nanoseconds.find("discarded trace point");
    if (trace != nanoseconds.end()) {
        std::printf("%-24s %14.1f\n", "discarded trace point", trace->second);
    }
}

}  // namespace

int main(int argc, char** argv) {
    const bench::Machine machine;
    benchmark::RegisterBenchmark("discarded trace point", discardedTracePoint);
    benchmark::RegisterBenchmark("floor", floorOfInstances)->Arg(1)->Arg(100)->Arg(1000);
    for (const char* className : {"QVXZR_DHCPProtocolEndpoint", "QVXZR_DHCPCapabilities",
                                  "QVXZR_DHCPSettingData", "QVXZR_DHCPRemoteServiceAccessPoint"}) {
        benchmark::RegisterBenchmark(
            className, [className](benchmark::State& state) { enumerate(state, className); })
            ->Arg(1)
            ->Arg(100)
            ->Arg(1000);
    }
    RememberingReporter reporter;
    if (!bench::run(argc, argv, reporter)) {
        return 2;
    }
    printRatios(reporter.nanoseconds);
    return 0;
}
