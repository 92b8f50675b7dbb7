#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "text/Columns.h"
#include "text/Style.h"

namespace cimdhcp {

class Client;

/// A profile that a server advertises: a CIM_RegisteredProfile. Empty texts: not told.
struct Profile {
    std::string organization;  ///< "DMTF"
    std::string name;
    std::string version;
    std::string id;
    /// How many instances conform to it; none: the server does not tell.
    std::optional<std::uint64_t> instances;

    bool operator==(const Profile&) const = default;
};

struct Profiles {
    std::string nameSpace;  ///< the interop namespace
    std::vector<Profile> profiles;

    bool operator==(const Profiles&) const = default;
};

/// The first of the usual names that is a namespace of the server, spelt as the server has it.
/// Throws Failure when none is.
[[nodiscard]] std::string interopNamespace(Client& client);

/// Looks for the interop namespace, and in it for profiles. Throws Failure, also when there
/// is no such namespace or the server knows of no profiles.
[[nodiscard]] Profiles readProfiles(Client& client);

[[nodiscard]] const std::vector<Column<Profile>>& profileColumns();

/// A line when there are none.
[[nodiscard]] std::string profileTable(const std::vector<Profile>& profiles,
                                       std::optional<std::size_t> width, const Style& style = {});

/// {"namespace", "profiles": [{"organization", "name", "version", "id", "instances"}]}.
[[nodiscard]] std::string profileJson(const std::string& nameSpace,
                                      const std::vector<Profile>& profiles);

}  // namespace cimdhcp
