#include "client/Installation.h"

#include <algorithm>
#include <system_error>

#include "text/Failure.h"

namespace cimdhcp {

namespace {

namespace fs = std::filesystem;

/// A schema is there when there is a MOF file.
bool hasSchema(const fs::path& directory) {
    std::error_code error;
    const fs::directory_iterator files(directory, error);
    return !error && std::any_of(begin(files), end(files), [](const fs::directory_entry& entry) {
        return entry.path().extension() == ".mof";
    });
}

void requireDirectory(const fs::path& directory, const char* option, const char* variable) {
    std::error_code error;
    if (!fs::is_directory(directory, error)) {
        throw Failure(ExitStatus::notLoaded, directory.string() + ": no such directory (from " +
                                                 option + " or " + variable + ")");
    }
}

}  // namespace

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

Directories findDirectories(const Options& options, const std::vector<Directories>& installations) {
    const auto found =
        std::find_if(installations.begin(), installations.end(),
                     [](const Directories& place) { return hasSchema(place.schema); });
    Directories result;
    if (found != installations.end()) {
        result = *found;
    } else if (!options.schemaDir || !options.providerDir) {
        std::string places;
        for (const Directories& place : installations) {
            places += (places.empty() ? "" : ", ") + place.schema.string();
        }
        throw Failure(ExitStatus::notLoaded,
                      "no schema found in " + places +
                          "; --schema-dir and --provider-dir can name where they are");
    }
    if (options.schemaDir) {
        requireDirectory(*options.schemaDir, "--schema-dir", "CIMDHCP_SCHEMA_DIR");
        // The registrations lie beside the schema if nothing else is said.
        result.schema = result.registrations = *options.schemaDir;
    }
    if (options.registrationDir) {
        requireDirectory(*options.registrationDir, "--registration-dir",
                         "CIMDHCP_REGISTRATION_DIR");
        result.registrations = *options.registrationDir;
    }
    if (options.providerDir) {
        requireDirectory(*options.providerDir, "--provider-dir", "CIMDHCP_PROVIDER_DIR");
        result.providers = {*options.providerDir};
    }
    return result;
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
