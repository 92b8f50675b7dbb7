#pragma once

#include <filesystem>
#include <string>
#include <vector>

namespace cimdhcp {

/// Running DHCP clients that this process may not look into.
struct HiddenClients {
    /// "dhclient (process 123)" for each whose network namespace cannot be read. The
    /// live source leaves out what such a client does.
    std::vector<std::string> processes;
    /// /proc hides the processes of other users (its mount option hidepid).
    bool otherUsersHidden = false;

    bool operator==(const HiddenClients&) const = default;
};

/// Looks through a directory like /proc. In one that cannot be read, none are hidden.
[[nodiscard]] HiddenClients findHiddenClients(const std::filesystem::path& proc = "/proc");

}  // namespace cimdhcp
