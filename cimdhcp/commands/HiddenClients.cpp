#include "commands/HiddenClients.h"

#include <unistd.h>

#include <system_error>

namespace cimdhcp {

bool areProcessesHidden(const std::filesystem::path& proc) {
    // Process 1 runs as root; without hidepid every user can see it.
    std::error_code error;
    return ::geteuid() != 0 && std::filesystem::is_directory(proc, error) &&
           ::access((proc / "1" / "comm").c_str(), F_OK) != 0;
}

}  // namespace cimdhcp
