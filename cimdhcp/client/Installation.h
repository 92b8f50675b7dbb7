#pragma once

#include <filesystem>
#include <vector>

namespace cimdhcp {

/// Where schema, registrations and provider libraries are, or are looked for.
struct Directories {
    std::filesystem::path schema;
    std::filesystem::path registrations;
    std::vector<std::filesystem::path> providers;  ///< searched in this order
    std::filesystem::path cimSchema = {};          ///< file of a whole schema; empty: none

    bool operator==(const Directories&) const = default;
};

/// The places where an installation can be: first the one that the executable is
/// part of, its prefix being the parent of its directory (which a build tree has
/// the form of, too), then the one that the program was configured for.
[[nodiscard]] std::vector<Directories> installations(const std::filesystem::path& executable);

/// Whether a directory has a MOF file. False for one that cannot be read.
[[nodiscard]] bool hasSchema(const std::filesystem::path& directory);

/// The file of a whole CIM schema, which includes the others: `place`, or the one in that
/// directory that has the name which such files are published under, CIM_Schema.mof or
/// cim_schema_VERSION.mof. Throws Failure when there is none, or several.
[[nodiscard]] std::filesystem::path cimSchemaFile(const std::filesystem::path& place);

/// The file of this process' program. Throws Failure.
[[nodiscard]] std::filesystem::path executableFile();

/// The *.registration files of a directory in the order of their names. Throws
/// Failure when the directory cannot be read or has none.
[[nodiscard]] std::vector<std::filesystem::path> registrationFiles(
    const std::filesystem::path& directory);

}  // namespace cimdhcp
