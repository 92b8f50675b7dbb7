#include "BenchmarkMachine.h"

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>

namespace bench {

namespace {

std::string treeFile;

CMPIStatus count(const CMPIResult* result) {
    ++static_cast<CountingResult*>(result->hdl)->objects;
    return {CMPI_RC_OK, nullptr};
}

[[noreturn]] void fail(const char* what) {
    std::perror(what);
    std::exit(1);
}

}  // namespace

const CMPIResultFT CountingResult::table{
    200,
    nullptr,
    nullptr,
    [](const CMPIResult*, const CMPIValue*, CMPIType) { return CMPIStatus{}; },
    [](const CMPIResult* result, const CMPIInstance*) { return count(result); },
    [](const CMPIResult* result, const CMPIObjectPath*) { return count(result); },
    [](const CMPIResult*) { return CMPIStatus{}; },
    [](const CMPIResult*, const CMPIError*) { return CMPIStatus{}; }};

Machine::Machine() : directory_("/tmp/provider-bench-XXXXXX") {
    if (::mkdtemp(directory_.data()) == nullptr) {
        fail("mkdtemp");
    }
    treeFile = directory_ + "/tree.json";
    ::setenv("ZR_INSTRUMENTATION_TREE", treeFile.c_str(), 1);
    ::setenv("ZR_LOG_SINK", "none", 1);
    ::setenv("ZR_TRACE_SINK", "none", 1);
    ::setenv("ZR_DATA_DIR", directory_.c_str(), 1);
}

Machine::~Machine() {
    std::error_code ignored;  // a directory that stays in /tmp does no harm
    std::filesystem::remove_all(directory_, ignored);
}

void setInterfaces(std::int64_t count) {
    const std::string next = treeFile + ".next";
    std::ofstream out(next);
    out << R"({"nodes":[{"type":"ComputerSystem","description":"Computer",)"
        << R"("properties":{"Name":"${HOSTNAME}"},"children":[)"
        << R"({"type":"Network","description":"Network","children":[)";
    for (std::int64_t i = 0; i < count; ++i) {
        out << (i == 0 ? "" : ",")
            << R"({"type":"NetworkInterface","description":"Ethernet interface","properties":{)"
            << R"("Name":"eth)" << i << R"(","NameMaxLength":15,"DHCPEnabled":true,)"
            << R"("AddressSource":1,"InterfaceState":1,"DHCPServerAddresses":["192.0.2.1"],)"
            << R"("IPv4Address":"192.0.2.2"}})";
    }
    out << "]}]}]}";
    out.close();
    if (std::rename(next.c_str(), treeFile.c_str()) != 0) {
        fail(treeFile.c_str());
    }
}

}  // namespace bench
