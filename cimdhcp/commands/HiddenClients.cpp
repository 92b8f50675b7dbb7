#include "commands/HiddenClients.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <cctype>
#include <fstream>
#include <string_view>
#include <system_error>

namespace cimdhcp {

namespace {

namespace fs = std::filesystem;

/// Programs whose processes the live source looks for. Their links are known from these
/// processes alone.
constexpr std::array<std::string_view, 6> clients{"dhclient", "dhcpcd",  "udhcpc",
                                                  "udhcpc6",  "busybox", "dhcp6c"};

bool isProcess(const std::string& name) {
    return std::all_of(name.begin(), name.end(),
                       [](unsigned char letter) { return std::isdigit(letter) != 0; });
}

/// Whether this user may read which network namespace the process is in.
bool canTellNamespace(const fs::path& process) {
    std::error_code error;
    static_cast<void>(fs::read_symlink(process / "ns" / "net", error));
    // A process that has ended meanwhile is not hidden.
    return !error ||
           (error != std::errc::permission_denied && error != std::errc::operation_not_permitted);
}

}  // namespace

HiddenClients findHiddenClients(const fs::path& proc) {
    HiddenClients hidden;
    std::error_code error;
    fs::directory_iterator entry(proc, error);
    if (error) {
        return hidden;
    }
    // Process 1 runs as root; without hidepid every user can see it.
    hidden.otherUsersHidden =
        ::geteuid() != 0 && ::access((proc / "1" / "comm").c_str(), F_OK) != 0;
    for (; !error && entry != end(entry); entry.increment(error)) {
        const std::string number = entry->path().filename();
        if (!isProcess(number)) {
            continue;
        }
        std::ifstream file(entry->path() / "comm");
        std::string name;
        std::getline(file, name);
        if (std::find(clients.begin(), clients.end(), name) != clients.end() &&
            !canTellNamespace(entry->path())) {
            hidden.processes.push_back(name.append(" (process ").append(number).append(")"));
        }
    }
    return hidden;
}

}  // namespace cimdhcp
