// What the associations cost through the provider's function tables, with tracing
// discarded: each class enumerated, and walked from one element of each end, at 10,
// 100 and 1,000 interfaces. The far ends are served by the neighbours' library.
//
// Some classes walk the interfaces anew for each object of an enumeration: clients rely
// on that walk, although it grows with the square. Below Google Benchmark's figures
// stands how each request grew, and what one step of each such walk cost.

#include <benchmark/benchmark.h>

#include <cmath>
#include <cstdio>
#include <map>
#include <string>
#include <vector>

#include "BenchmarkMachine.h"
#include "Lindows/DHCPElementSettingData.h"
#include "Lindows/DHCPOrderedComponent.h"
#include "Lindows/DHCPRemoteAccessAvailableToElement.h"
#include "Lindows/ElementCapabilities.h"
#include "Lindows/SAPSAPDependency.h"
#include "RunBenchmarks.h"
#include "cimom/Instance.h"
#include "kit/Host.h"
#include "zrclient/Moniker.h"
#include "zrcommon/SystemName.h"

namespace {

using namespace ZR::DHCPClientProvider;  // NOLINT(google-build-using-namespace)
using Keys = std::vector<std::pair<std::string, std::string>>;
using Kind = test::Host::Kind;
using ZR::Moniker;

/// A path of one of the classes at the ends, for the interface of this name.
cimom::ObjectPath endOf(const std::string& className, const std::string& interface) {
    const auto named = [&](const std::string& name) {
        return test::pathOf(className, {{"SystemCreationClassName", "QVXZR_ComputerSystem"},
                                        {"SystemName", ZR::getSystemName()},
                                        {"CreationClassName", className},
                                        {"Name", name}});
    };
    if (className == "QVXZR_ComputerSystem") {
        return test::pathOf(className,
                            {{"CreationClassName", className}, {"Name", ZR::getSystemName()}});
    }
    if (className == "QVXZR_DHCPRemoteServiceAccessPoint") {
        return named(interface + "_IPv4");
    }
    if (className == "QVXZR_DHCPCapabilities") {
        return test::pathOf(className, {{"InstanceID", interface}});
    }
    if (className == "QVXZR_DHCPSettingData") {
        return test::pathOf(className, {{"InstanceID", "Computer%" + interface}});
    }
    if (className == "QVXZR_IPAssignmentSettingData") {
        return test::pathOf(className, {{"InstanceID", "Computer%" + interface + "%dhcp"}});
    }
    return named(interface);
}

std::string lastInterface(const benchmark::State& state) {
    return "eth" + std::to_string(state.range(0) - 1);
}

void enumerate(benchmark::State& state, const std::string& association) {
    bench::setInterfaces(state.range(0));
    test::Host host(test::Host::Neighbours::served);
    bench::CountingResult result;
    for (auto _ : state) {
        host.request(Kind::instances, test::pathOf(association),
                     [&](auto* context, auto* /*collector*/, auto* path) {
                         return host.instanceTable().enumerateInstances(
                             nullptr, context, &result.record, path, nullptr);
                     });
    }
    state.SetItemsProcessed(result.objects);
}

/// The associators of the element of the last interface.
void walk(benchmark::State& state, const std::string& association, const std::string& source) {
    bench::setInterfaces(state.range(0));
    test::Host host(test::Host::Neighbours::served);
    bench::CountingResult result;
    const cimom::ObjectPath path = endOf(source, lastInterface(state));
    for (auto _ : state) {
        host.request(Kind::instances, path, [&](auto* context, auto* /*collector*/, auto* record) {
            return host.associationTable().associators(nullptr, context, &result.record, record,
                                                       association.c_str(), nullptr, nullptr,
                                                       nullptr, nullptr);
        });
    }
    state.SetItemsProcessed(result.objects);
}

/// A builder that walks up to the last interface; an item is one step.
template <typename Record>
void step(benchmark::State& state, Moniker (Record::*builder)(Moniker&),
          const std::string& className) {
    bench::setInterfaces(state.range(0));
    Moniker known;
    const cimom::ObjectPath path = endOf(className, lastInterface(state));
    for (const cimom::NamedValue& key : path.keys) {
        known.addKey(key.name, test::keyOf(path, key.name).value_or(""));
    }
    Record record;
    for (auto _ : state) {
        benchmark::DoNotOptimize((record.*builder)(known));
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
}

struct Association {
    const char* name;
    const char* first;
    const char* second;
};

constexpr Association associations[] = {
    {"QVXZR_HostedDHCPPoint", "QVXZR_ComputerSystem", "QVXZR_DHCPProtocolEndpoint"},
    {"QVXZR_SAPSAPDependency", "QVXZR_IPProtocolEndpoint", "QVXZR_DHCPProtocolEndpoint"},
    {"QVXZR_DHCPElementCapabilities", "QVXZR_DHCPProtocolEndpoint", "QVXZR_DHCPCapabilities"},
    {"QVXZR_DHCPRemoteHostedAccessPoint", "QVXZR_ComputerSystem",
     "QVXZR_DHCPRemoteServiceAccessPoint"},
    {"QVXZR_DHCPRemoteAccessAvailableToElement", "QVXZR_DHCPRemoteServiceAccessPoint",
     "QVXZR_DHCPProtocolEndpoint"},
    {"QVXZR_DHCPElementSettingData", "QVXZR_DHCPProtocolEndpoint", "QVXZR_DHCPSettingData"},
    {"QVXZR_DHCPOrderedComponent", "QVXZR_IPAssignmentSettingData", "QVXZR_DHCPSettingData"},
};

constexpr const char* stepPrefix = "step: ";

template <typename Run>
void registerRequest(const std::string& name, const Run& run) {
    benchmark::RegisterBenchmark(name.c_str(), run)
        ->Arg(10)
        ->Arg(100)
        ->Arg(1000)
        ->Unit(benchmark::kMicrosecond);
}

template <typename Record>
void registerStep(const char* name, Moniker (Record::*builder)(Moniker&), const char* className) {
    benchmark::RegisterBenchmark((stepPrefix + std::string(name)).c_str(),
                                 [=](benchmark::State& state) { step(state, builder, className); })
        ->Arg(1000)
        ->Unit(benchmark::kMicrosecond);
}

/// Prints the usual figures and remembers what each run cost.
class RememberingReporter : public benchmark::ConsoleReporter {
  public:
    RememberingReporter() : ConsoleReporter(OO_Tabular) {}

    void ReportRuns(const std::vector<Run>& runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run& run : runs) {
            const std::string name = run.benchmark_name();
            const std::size_t slash = name.rfind('/');
            const std::string request = name.substr(0, slash);
            if (name.starts_with(stepPrefix)) {
                steps[request] = 1e9 / run.counters.at("items_per_second").value;
            } else if (slash != std::string::npos) {
                requests[request][std::stoi(name.substr(slash + 1))] = run.GetAdjustedCPUTime();
            }
        }
    }

    std::map<std::string, std::map<int, double>> requests;  ///< microseconds by interfaces
    std::map<std::string, double> steps;                    ///< nanoseconds
};

/// The exponent b of a cost a N^b, fitted to the two larger sizes: the smallest is
/// mostly what a request costs at all.
void printGrowth(const RememberingReporter& reporter) {
    std::printf("\n%-75s %12s %12s %12s %8s\n", "request [us of CPU]", "10", "100", "1000",
                "growth");
    for (const auto& [request, costs] : reporter.requests) {
        if (costs.size() == 3) {
            std::printf("%-75s %12.1f %12.1f %12.1f  N^%.2f\n", request.c_str(), costs.at(10),
                        costs.at(100), costs.at(1000), std::log10(costs.at(1000) / costs.at(100)));
        }
    }
    std::printf("\n%-75s %12s\n", "walk that clients rely on", "step [ns]");
    for (const auto& [name, nanoseconds] : reporter.steps) {
        std::printf("%-75s %12.0f\n", name.c_str(), nanoseconds);
    }
}

}  // namespace

int main(int argc, char** argv) {
    const bench::Machine machine;
    for (const Association& association : associations) {
        const std::string name = association.name;
        registerRequest("enumerate " + name,
                        [name](benchmark::State& state) { enumerate(state, name); });
        for (const std::string source : {association.first, association.second}) {
            registerRequest(name + " from " + source,
                            [name, source](benchmark::State& state) { walk(state, name, source); });
        }
    }
    registerStep("to the capabilities of an endpoint",
                 &ElementCapabilities::getDHCPCapabilitiesMoniker, "QVXZR_DHCPProtocolEndpoint");
    registerStep("to the endpoint of capabilities", &ElementCapabilities::getDHCPEndpointMoniker,
                 "QVXZR_DHCPCapabilities");
    registerStep("to the endpoint of an access point",
                 &DHCPRemoteAccessAvailableToElement::getDHCPProtocolEndpointMoniker,
                 "QVXZR_DHCPRemoteServiceAccessPoint");
    registerStep("to the access point of an endpoint",
                 &DHCPRemoteAccessAvailableToElement::getRemoteServiceAccessPointMoniker,
                 "QVXZR_DHCPProtocolEndpoint");
    registerStep("to the endpoint of a setting", &DHCPElementSettingData::getManagedElementMoniker,
                 "QVXZR_DHCPSettingData");
    registerStep("to the setting of an endpoint",
                 &DHCPElementSettingData::getDHCPSettingDataMoniker, "QVXZR_DHCPProtocolEndpoint");
    registerStep("to the assignment of a setting", &DHCPOrderedComponent::getGroupComponentMoniker,
                 "QVXZR_DHCPSettingData");
    registerStep("to the setting of an assignment", &DHCPOrderedComponent::getPartComponentMoniker,
                 "QVXZR_IPAssignmentSettingData");
    registerStep("to the DHCP endpoint of an IP endpoint", &SAPSAPDependency::getDHCPSAPMoniker,
                 "QVXZR_IPProtocolEndpoint");
    RememberingReporter reporter;
    if (!bench::run(argc, argv, reporter)) {
        return 2;
    }
    printGrowth(reporter);
    return 0;
}
