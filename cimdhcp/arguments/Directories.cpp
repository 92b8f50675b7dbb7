#include "arguments/Directories.h"

#include <algorithm>
#include <string>
#include <system_error>

#include "text/Failure.h"

namespace cimdhcp {

namespace {

namespace fs = std::filesystem;

void requireDirectory(const fs::path& directory, const char* option, const char* variable) {
    std::error_code error;
    if (!fs::is_directory(directory, error)) {
        throw Failure(ExitStatus::notLoaded, directory.string() + ": no such directory (from " +
                                                 option + " or " + variable + ")");
    }
}

}  // namespace

Directories findDirectories(const Options& options, const std::vector<Directories>& installations) {
    const auto found =
        std::find_if(installations.begin(), installations.end(),
                     [](const Directories& place) { return hasSchema(place.schema); });
    Directories result;
    if (found != installations.end()) {
        result = *found;
    } else if (!options.directories.schemaDir || options.directories.providerDirs.empty()) {
        std::string places;
        for (const Directories& place : installations) {
            places += (places.empty() ? "" : ", ") + place.schema.string();
        }
        throw Failure(ExitStatus::notLoaded,
                      "no schema found in " + places +
                          "; --schema-dir and --provider-dir can name where they are");
    }
    if (options.directories.schemaDir) {
        requireDirectory(*options.directories.schemaDir, "--schema-dir", "CIMDHCP_SCHEMA_DIR");
        // The registrations lie beside the schema if nothing else is said.
        result.schema = result.registrations = *options.directories.schemaDir;
    }
    if (options.directories.registrationDir) {
        requireDirectory(*options.directories.registrationDir, "--registration-dir",
                         "CIMDHCP_REGISTRATION_DIR");
        result.registrations = *options.directories.registrationDir;
    }
    if (options.exact) {
        result.registrations /= "exact";
    }
    if (!options.directories.providerDirs.empty()) {
        result.providers.clear();
        for (const std::string& directory : options.directories.providerDirs) {
            requireDirectory(directory, "--provider-dir", "CIMDHCP_PROVIDER_DIR");
            result.providers.emplace_back(directory);
        }
    }
    if (options.directories.cimSchema) {
        result.cimSchema = cimSchemaFile(*options.directories.cimSchema);
    }
    return result;
}

}  // namespace cimdhcp
