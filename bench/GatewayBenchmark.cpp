// What the gateway costs beside the exact provider, both on the same machine and the same
// object manager in the same run: each class enumerated, and the associators of one
// endpoint. Behind the gateway each class is enumerated at 10,000 interfaces, too, for which
// some walks of the exact provider are too long. Below Google Benchmark's figures stands the
// difference for each instance.

#include <benchmark/benchmark.h>

#include <cstdio>
#include <map>
#include <string>

#include "BenchmarkMachine.h"
#include "DHCPClientGateway.h"
#include "RunBenchmarks.h"
#include "kit/Host.h"
#include "zrcommon/SystemName.h"

namespace {

using Kind = test::Host::Kind;

constexpr const char* classes[] = {
    "QVXZR_DHCPProtocolEndpoint",
    "QVXZR_DHCPCapabilities",
    "QVXZR_DHCPSettingData",
    "QVXZR_DHCPRemoteServiceAccessPoint",
    "QVXZR_DHCPElementCapabilities",
    "QVXZR_SAPSAPDependency",
    "QVXZR_HostedDHCPPoint",
    "QVXZR_DHCPRemoteAccessAvailableToElement",
    "QVXZR_DHCPRemoteHostedAccessPoint",
    "QVXZR_DHCPElementSettingData",
    "QVXZR_DHCPOrderedComponent",
};
constexpr const char* exact = "exact ";
constexpr const char* gateway = "gateway ";

/// Whose function tables are called.
struct Tables {
    const CMPIInstanceMIFT& instances;
    const CMPIAssociationMIFT& associations;
};

Tables tablesOf(const test::Host& host, bool behindGateway) {
    if (!behindGateway) {
        return {host.instanceTable(), host.associationTable()};
    }
    CMPIStatus status{CMPI_RC_OK, nullptr};
    return {*DHCPClientGateway_Create_InstanceMI(host.broker(), nullptr, &status)->ft,
            *DHCPClientGateway_Create_AssociationMI(host.broker(), nullptr, &status)->ft};
}

void enumerate(benchmark::State& state, const std::string& className, bool behindGateway) {
    bench::setInterfaces(state.range(0));
    test::Host host(test::Host::Neighbours::served);
    const Tables tables = tablesOf(host, behindGateway);
    bench::CountingResult result;
    for (auto _ : state) {
        host.request(Kind::instances, test::pathOf(className),
                     [&](auto* context, auto* /*collector*/, auto* path) {
                         return tables.instances.enumerateInstances(nullptr, context,
                                                                    &result.record, path, nullptr);
                     });
    }
    state.SetItemsProcessed(result.objects);
}

/// The associators of the last endpoint. The exact provider gives access points of all.
void walk(benchmark::State& state, bool behindGateway) {
    bench::setInterfaces(state.range(0));
    test::Host host(test::Host::Neighbours::served);
    const Tables tables = tablesOf(host, behindGateway);
    bench::CountingResult result;
    const cimom::ObjectPath endpoint = test::pathOf(
        "QVXZR_DHCPProtocolEndpoint", {{"SystemCreationClassName", "QVXZR_ComputerSystem"},
                                       {"SystemName", ZR::getSystemName()},
                                       {"CreationClassName", "QVXZR_DHCPProtocolEndpoint"},
                                       {"Name", "eth" + std::to_string(state.range(0) - 1)}});
    for (auto _ : state) {
        host.request(
            Kind::instances, endpoint, [&](auto* context, auto* /*collector*/, auto* path) {
                return tables.associations.associators(nullptr, context, &result.record, path,
                                                       nullptr, nullptr, nullptr, nullptr, nullptr);
            });
    }
    state.SetItemsProcessed(result.objects);
}

/// Prints the usual figures and remembers what an item of each run cost.
class RememberingReporter : public benchmark::ConsoleReporter {
  public:
    RememberingReporter() : ConsoleReporter(OO_Tabular) {}

    void ReportRuns(const std::vector<Run>& runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run& run : runs) {
            // Of repeated runs the median, which comes behind them.
            if (run.run_type == Run::RT_Iteration || run.aggregate_name == "median") {
                items[run.run_name.str()] = 1e9 / run.counters.at("items_per_second").value;
            }
        }
    }

    std::map<std::string, double> items;  ///< nanoseconds by run
};

void printDifferences(const RememberingReporter& reporter) {
    std::printf("\n%-55s %10s %10s %10s\n", "an instance [ns of CPU]", "exact", "gateway",
                "beside");
    for (const auto& [name, cost] : reporter.items) {
        const auto floor =
            name.starts_with(gateway)
                ? reporter.items.find(exact + name.substr(std::string(gateway).size()))
                : reporter.items.end();
        if (floor != reporter.items.end()) {
            std::printf("%-55s %10.0f %10.0f %10.0f\n", floor->first.c_str(), floor->second, cost,
                        cost - floor->second);
        }
    }
}

}  // namespace

int main(int argc, char** argv) {
    const bench::Machine machine;
    for (const bool behindGateway : {false, true}) {
        const std::string prefix = behindGateway ? gateway : exact;
        for (const std::string name : classes) {
            auto* const enumeration = benchmark::RegisterBenchmark(
                (prefix + name).c_str(),
                [=](benchmark::State& state) { enumerate(state, name, behindGateway); });
            enumeration->Arg(100)->Arg(1000)->Unit(benchmark::kMicrosecond);
            if (behindGateway) {
                enumeration->Arg(10000);
            }
        }
        benchmark::RegisterBenchmark((prefix + "associators of an endpoint").c_str(),
                                     [=](benchmark::State& state) { walk(state, behindGateway); })
            ->Arg(100)
            ->Arg(1000)
            ->Unit(benchmark::kMicrosecond);
    }
    RememberingReporter reporter;
    if (!bench::run(argc, argv, reporter)) {
        return 2;
    }
    printDifferences(reporter);
    return 0;
}
