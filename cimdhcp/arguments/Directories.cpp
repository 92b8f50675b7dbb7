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
    if (options.exact) {
        result.registrations /= "exact";
    }
    if (options.providerDir) {
        requireDirectory(*options.providerDir, "--provider-dir", "CIMDHCP_PROVIDER_DIR");
        result.providers = {*options.providerDir};
    }
    return result;
}

}  // namespace cimdhcp
