#include "client/Installation.h"

#include <algorithm>
#include <system_error>

#include "text/Failure.h"

namespace cimdhcp {

namespace fs = std::filesystem;

bool hasSchema(const fs::path& directory) {
    std::error_code error;
    const fs::directory_iterator files(directory, error);
    return !error && std::any_of(begin(files), end(files), [](const fs::directory_entry& entry) {
        return entry.path().extension() == ".mof";
    });
}

std::vector<Directories> installations(const fs::path& executable) {
    const fs::path prefix = executable.parent_path().parent_path();
    const fs::path schema = prefix / "share/dhcp-client-provider/schema";
    const fs::path plain = prefix / "lib/cmpi";
    Directories own{schema, schema, {prefix / CIMDHCP_LIBDIR "/cmpi"}};
    if (own.providers.front() != plain) {
        own.providers.push_back(plain);
    }
    const fs::path configured = CIMDHCP_FULL_DATADIR "/dhcp-client-provider/schema";
    return {own, {configured, configured, {CIMDHCP_FULL_LIBDIR "/cmpi"}}};
}

fs::path cimSchemaFile(const fs::path& place) {
    const auto fail = [&place](const std::string& reason) {
        throw Failure(ExitStatus::notLoaded, place.string() + ": " + reason +
                                                 " (from --cim-schema or CIMDHCP_CIM_SCHEMA)");
    };
    std::error_code error;
    if (!fs::is_directory(place, error)) {
        if (!fs::exists(place, error)) {
            fail("no such file or directory");
        }
        return place;
    }
    std::vector<fs::path> found;
    for (fs::directory_iterator entry(place, error); !error && entry != end(entry);
         entry.increment(error)) {
        const fs::path name = entry->path().filename();
        const bool published =
            name.extension() == ".mof" &&
            (name == "CIM_Schema.mof" || name.string().starts_with("cim_schema_"));
        if (published) {
            found.push_back(entry->path());
        }
    }
    if (error) {
        fail(error.message());
    }
    if (found.empty()) {
        fail("neither CIM_Schema.mof nor cim_schema_VERSION.mof is in it");
    }
    if (found.size() > 1) {
        std::sort(found.begin(), found.end());
        fail("both " + found[0].filename().string() + " and " + found[1].filename().string() +
             " are in it; name the file");
    }
    return found.front();
}

fs::path executableFile() {
    std::error_code error;
    fs::path file = fs::read_symlink("/proc/self/exe", error);
    if (error) {
        throw Failure(ExitStatus::notLoaded, "/proc/self/exe: " + error.message());
    }
    return file;
}

std::vector<fs::path> registrationFiles(const fs::path& directory) {
    std::error_code error;
    std::vector<fs::path> files;
    for (fs::directory_iterator entry(directory, error); !error && entry != end(entry);
         entry.increment(error)) {
        if (entry->path().extension() == ".registration") {
            files.push_back(entry->path());
        }
    }
    if (error) {
        throw Failure(ExitStatus::notLoaded, directory.string() + ": " + error.message());
    }
    if (files.empty()) {
        throw Failure(ExitStatus::notLoaded,
                      directory.string() + ": no *.registration file is in it");
    }
    std::sort(files.begin(), files.end());
    return files;
}

}  // namespace cimdhcp
