#pragma once

#include <filesystem>

namespace cimdhcp {

/// Whether a directory like /proc hides the processes of other users from this one (its
/// mount option hidepid), so that DHCP clients among them are not seen.
[[nodiscard]] bool areProcessesHidden(const std::filesystem::path& proc = "/proc");

}  // namespace cimdhcp
