// What a library of providers costs a process that loads it and asks its first request, of
// the machine that it runs on: what is in memory of its file, and by how much the heap grew.
// The standard library and libmnl are left out: other programs have them in memory, too.
//
// Usage: first_request LIBRARY_DIRECTORY LIBRARY REGISTRATION [MOST_KILOBYTES]
// Fails when it is more than that.

#include <malloc.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>

#include "cimom/ObjectManager.h"
#include "cimom/Results.h"

namespace {

/// What this process has in memory, in kilobytes.
struct Resident {
    long library = 0;
    long heap = 0;
};

Resident resident(const std::string& library) {
    Resident sum;
    std::ifstream maps("/proc/self/smaps");
    long* place = nullptr;
    for (std::string line; std::getline(maps, line);) {
        std::istringstream words(line);
        std::string first;
        words >> first;
        if (first == "Rss:") {
            long kilobytes = 0;
            words >> kilobytes;
            if (place != nullptr) {
                *place += kilobytes;
            }
        } else if (first.find('-') != std::string::npos && first.back() != ':') {
            std::string rights;
            std::string offset;
            std::string device;
            std::string inode;
            std::string path;
            words >> rights >> offset >> device >> inode >> path;
            // What has no name is memory that was asked for, and what is behind a library's data.
            place = path.ends_with('/' + library)      ? &sum.library
                    : path.empty() || path == "[heap]" ? &sum.heap
                                                       : nullptr;
        }
    }
    return sum;
}

}  // namespace

int main(int count, char** words) {
    if (count < 4) {
        std::fputs("Usage: first_request LIBRARY_DIRECTORY LIBRARY REGISTRATION [KILOBYTES]\n",
                   stderr);
        return 2;
    }
    const std::string library = words[2];
    const long most = count > 4 ? std::strtol(words[4], nullptr, 10) : 0;
    cimom::Configuration configuration;
    configuration.schemaDirectories = {ZR_SOURCE_DIR "/schema"};
    configuration.providerDirectories = {words[1]};
    configuration.registrationFiles = {words[3]};
    cimom::ObjectManager manager(configuration);
    ::malloc_trim(0);
    const Resident before = resident(library);
    const auto result = manager.enumerateInstances({"", "root/cimv2", "QVXZR_DHCPSettingData", {}});
    const Resident after = resident(library);
    if (!result.status.ok() || after.library == 0) {
        std::fprintf(stderr, "no response of %s: %s\n", library.c_str(),
                     result.status.message.c_str());
        return 1;
    }
    const long heap = after.heap - before.heap;
    std::printf("%s: %zu instances, %ld kB of the library and %ld kB of heap, together %ld kB\n",
                library.c_str(), result.instances.size(), after.library, heap,
                after.library + heap);
    if (most != 0 && after.library + heap > most) {
        std::fprintf(stderr, "the aim is %ld kB\n", most);
        return 1;
    }
    return 0;
}
