#include "Processes.h"

#include <dirent.h>
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "Dhclient.h"
#include "Dhcp6c.h"
#include "Dhcpcd.h"
#include "Files.h"
#include "Numbers.h"
#include "Udhcpc.h"
#include "zrcommon/UniqueFd.h"

namespace ZR::Live {
namespace {

/// Which process name is which client, and who understands its command line.
struct KnownClient {
    std::string_view name;  // as /proc/PID/comm has it: at most 15 bytes
    std::optional<ClientProcess> (*parse)(std::span<const std::string_view> arguments);
};
constexpr std::array<KnownClient, 6> knownClients{{
    {"dhclient", parseDhclientArguments},
    {"dhcpcd", parseDhcpcdArguments},
    {"udhcpc", parseUdhcpcArguments},
    {"udhcpc6", parseUdhcpcArguments},
    {"busybox", parseUdhcpcArguments},
    {"dhcp6c", parseDhcp6cArguments},
}};

/// Which process name is which program that manages links.
struct KnownManager {
    std::string_view name;  // as /proc/PID/comm has it: at most 15 bytes
    Client client;
};
constexpr std::array<KnownManager, 3> knownManagers{{
    {"systemd-network", Client::Networkd},  // systemd-networkd, cut off
    {"NetworkManager", Client::NetworkManager},
    {"wickedd-dhcp4", Client::Wicked},
}};

struct CloseDirectory {
    void operator()(DIR* directory) const noexcept {
        // Nothing was written through it that a failing close could lose.
        static_cast<void>(::closedir(directory));
    }
};

/// A path below /proc without an allocation: there are many processes.
class ProcessPath {
  public:
    ProcessPath(std::string_view process, std::string_view file) {
        append(process);
        append(file);
    }
    [[nodiscard]] const char* get() const noexcept { return text_.data(); }

  private:
    void append(std::string_view part) {
        const std::size_t room = text_.size() - 1 - length_;
        const std::size_t taken = part.copy(text_.data() + length_, room);
        length_ += taken;
    }

    std::array<char, 64> text_{};
    std::size_t length_ = 0;
};

/// Reads from the beginning of a file of /proc; empty when the process is gone or
/// hidden, which is no failure.
std::string_view readShort(int proc, const char* path, std::span<char> buffer) {
    const UniqueFd fd{::openat(proc, path, O_RDONLY | O_CLOEXEC)};
    if (!fd) {
        return {};
    }
    const ssize_t got = ::read(fd.get(), buffer.data(), buffer.size());
    return got <= 0 ? std::string_view{}
                    : std::string_view{buffer.data(), static_cast<std::size_t>(got)};
}

/// Empty when it cannot be read, for the reason that errno then has.
std::string readNamespace(int proc, const char* path) {
    std::array<char, 64> target{};
    errno = 0;
    const ssize_t length = ::readlinkat(proc, path, target.data(), target.size());
    return length <= 0 ? std::string{}
                       : std::string(target.data(), static_cast<std::size_t>(length));
}

std::vector<std::string_view> splitArguments(std::string_view commandLine) {
    std::vector<std::string_view> arguments;
    while (!commandLine.empty()) {
        const std::size_t end = commandLine.find('\0');
        arguments.push_back(commandLine.substr(0, end));
        commandLine.remove_prefix(end == std::string_view::npos ? commandLine.size() : end + 1);
    }
    return arguments;
}

/// Where a process runs, seen from this network namespace.
ManagerProcess::Where whereIs(int proc, std::string_view process, const std::string& ownNamespace) {
    const std::string other = readNamespace(proc, ProcessPath{process, "/ns/net"}.get());
    if (other.empty() || ownNamespace.empty()) {
        return ManagerProcess::Where::Unknown;
    }
    return other == ownNamespace ? ManagerProcess::Where::Here : ManagerProcess::Where::Elsewhere;
}

std::int32_t numberOf(std::string_view process) {
    return parseNumber<std::int32_t>(process).value_or(0);
}

void readClient(int proc, std::string_view process, const KnownClient& client,
                const std::string& ownNamespace, ClientFacts& facts) {
    std::array<char, 4096> buffer{};
    // A process that has ended but was not waited for keeps its name and has no
    // arguments; it parses to nothing.
    const auto arguments =
        splitArguments(readShort(proc, ProcessPath{process, "/cmdline"}.get(), buffer));
    auto found = client.parse(arguments);
    if (!found) {
        return;
    }
    const auto where = whereIs(proc, process, ownNamespace);
    if (where == ManagerProcess::Where::Unknown && (errno == EACCES || errno == EPERM)) {
        facts.complaints.push_back("cannot tell the links of process " + std::string{process} +
                                   " (" + std::string{nameOf(found->client)} +
                                   "): " + std::generic_category().message(errno));
    }
    if (where == ManagerProcess::Where::Here) {
        found->pid = numberOf(process);
        facts.processes.push_back(*std::move(found));
    }
}

}  // namespace

void readProcesses(const Roots& roots, ClientFacts& facts) {
    const std::unique_ptr<DIR, CloseDirectory> directory{::opendir(roots.proc.c_str())};
    if (!directory) {
        facts.complaints.push_back(unreadable(roots.proc, errno));
        return;
    }
    const int proc = ::dirfd(directory.get());
    // Of this thread: namespaces belong to threads, not to processes.
    const std::string ownNamespace = readNamespace(proc, "thread-self/ns/net");
    for (;;) {
        errno = 0;
        const dirent* const entry = ::readdir(directory.get());
        if (entry == nullptr) {
            break;
        }
        const std::string_view process{&entry->d_name[0]};
        if (process.front() < '1' || process.front() > '9') {
            continue;
        }
        std::array<char, 32> buffer{};
        std::string_view name = readShort(proc, ProcessPath{process, "/comm"}.get(), buffer);
        name = name.substr(0, name.find('\n'));
        const auto* const client =
            std::find_if(knownClients.begin(), knownClients.end(),
                         [&](const KnownClient& known) { return known.name == name; });
        if (client != knownClients.end()) {
            readClient(proc, process, *client, ownNamespace, facts);
            continue;
        }
        const auto* const manager =
            std::find_if(knownManagers.begin(), knownManagers.end(),
                         [&](const KnownManager& known) { return known.name == name; });
        if (manager != knownManagers.end()) {
            facts.managers.push_back({.client = manager->client,
                                      .where = whereIs(proc, process, ownNamespace),
                                      .pid = numberOf(process)});
        }
    }
    if (errno != 0) {
        facts.complaints.push_back(unreadable(roots.proc, errno));
    }
}

}  // namespace ZR::Live
