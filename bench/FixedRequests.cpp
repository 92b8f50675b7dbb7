// Ten requests that never change, each a client's request through the object manager
// and the provider's library, on a machine of 100 interfaces. Under callgrind each
// writes a profile of its own, named after it, so that the instructions of each can be
// counted exactly; bench/instructions compares them with what they were.
//
// Run without valgrind it only checks that every request succeeds.

#include <valgrind/callgrind.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <memory>
#include <stdexcept>
#include <string>

#include "BenchmarkMachine.h"
#include "cimom/ObjectManager.h"
#include "cimom/Results.h"

namespace {

constexpr int interfaces = 100;

cimom::Configuration configuration() {
    cimom::Configuration all;
    all.schemaDirectories = {ZR_SOURCE_DIR "/schema"};
    all.registrationFiles = {ZR_SOURCE_DIR "/schema/exact/DHCPClientProvider.registration",
                             ZR_SOURCE_DIR "/schema/exact/DHCPClientNeighbours.registration"};
    all.providerDirectories = {ZR_BINARY_DIR "/lib/cmpi"};
    return all;
}

void expect(const char* name, const cimom::Status& status, std::size_t found, std::size_t wanted) {
    if (!status.ok() || found != wanted) {
        throw std::runtime_error(std::string(name) + ": " + std::to_string(found) +
                                 " objects instead of " + std::to_string(wanted) + ", status " +
                                 std::to_string(status.code) + " " + status.message);
    }
}

void expect(const char* name, const cimom::InstancesResult& result, std::size_t wanted) {
    expect(name, result.status, result.instances.size(), wanted);
}

void expect(const char* name, const cimom::PathsResult& result, std::size_t wanted) {
    expect(name, result.status, result.paths.size(), wanted);
}

/// Counts what `request` costs, and nothing around it.
template <typename Request>
auto measure(const char* name, Request&& request) {
    CALLGRIND_ZERO_STATS;
    CALLGRIND_START_INSTRUMENTATION;
    auto result = request();
    CALLGRIND_STOP_INSTRUMENTATION;
    CALLGRIND_DUMP_STATS_AT(name);
    std::puts(name);
    return result;
}

cimom::ObjectPath classPath(const char* className) {
    return {"", "root/cimv2", className, {}};
}

/// The path of the instance that stands at `index` of its class.
cimom::ObjectPath pathAt(cimom::ObjectManager& manager, const char* className, std::size_t index) {
    const cimom::PathsResult names = manager.enumerateInstanceNames(classPath(className));
    return names.paths.at(index).value();
}

void runAll() {
    bench::setInterfaces(interfaces);
    std::unique_ptr<cimom::ObjectManager> manager;
    expect("load",
           measure("load",
                   [&] {
                       manager = std::make_unique<cimom::ObjectManager>(configuration());
                       return manager->enumerateInstances(classPath("QVXZR_DHCPProtocolEndpoint"));
                   }),
           interfaces);

    // Every library is loaded and every code path is warm before the rest is counted.
    const cimom::ObjectPath endpoint = pathAt(*manager, "QVXZR_DHCPProtocolEndpoint", 50);
    const cimom::ObjectPath setting = pathAt(*manager, "QVXZR_DHCPSettingData", 50);
    const cimom::ObjectPath system = pathAt(*manager, "QVXZR_ComputerSystem", 0);
    expect("warm", manager->associatorNames(endpoint),
           manager->associatorNames(endpoint).paths.size());

    const auto instances = [&](const char* name, const char* className) {
        expect(name,
               measure(name, [&] { return manager->enumerateInstances(classPath(className)); }),
               interfaces);
    };
    instances("endpoints", "QVXZR_DHCPProtocolEndpoint");
    instances("access-points", "QVXZR_DHCPRemoteServiceAccessPoint");
    instances("element-settings", "QVXZR_DHCPElementSettingData");
    expect(
        "endpoint-names",
        measure("endpoint-names",
                [&] {
                    return manager->enumerateInstanceNames(classPath("QVXZR_DHCPProtocolEndpoint"));
                }),
        interfaces);
    expect("get-endpoint", measure("get-endpoint", [&] { return manager->getInstance(endpoint); }),
           1);

    cimom::AssociationRequest throughHost;
    throughHost.assocClass = "QVXZR_HostedDHCPPoint";
    expect(
        "system-of-endpoint",
        measure("system-of-endpoint", [&] { return manager->associators(endpoint, throughHost); }),
        1);
    expect("endpoints-of-system",
           measure("endpoints-of-system",
                   [&] { return manager->associatorNames(system, throughHost); }),
           interfaces);

    const std::string file = std::string(std::getenv("ZR_DATA_DIR")) + "/ifcfg-eth50";
    std::ofstream(file) << "CONFIG_NAME=old\n";
    const cimom::Instance renamed{setting, {{"ConfigurationName", cimom::Value::ofString("new")}}};
    expect("modify-setting",
           measure("modify-setting", [&] { return manager->modifyInstance(renamed); }), 0);
    std::string line;
    if (!std::getline(std::ifstream(file), line) || line != "CONFIG_NAME=new") {
        throw std::runtime_error("modify-setting left \"" + line + "\" in " + file);
    }

    bench::setInterfaces(interfaces + 1);
    expect("after-a-change",
           measure("after-a-change",
                   [&] {
                       return manager->enumerateInstances(classPath("QVXZR_DHCPProtocolEndpoint"));
                   }),
           interfaces + 1);
}

}  // namespace

int main() {
    const bench::Machine machine;
    try {
        runAll();
    } catch (const std::exception& error) {
        std::fprintf(stderr, "%s\n", error.what());
        return 1;
    }
    return 0;
}
