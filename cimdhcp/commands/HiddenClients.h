#pragma once

#include <filesystem>
#include <string>
#include <vector>

namespace cimdhcp {

/// What this process may not learn of DHCP clients that run.
struct HiddenClients {
    /// "dhclient (process 123)" for each whose network namespace cannot be told:
    /// what it does is left out of the machine.
    std::vector<std::string> processes;
    /// /proc shows nobody else's processes (its mount option hidepid).
    bool otherUsersHidden = false;

    bool operator==(const HiddenClients&) const = default;
};

/// Looks through a directory like /proc. What cannot be read at all is not hidden.
[[nodiscard]] HiddenClients findHiddenClients(const std::filesystem::path& proc = "/proc");

}  // namespace cimdhcp
