#include "clients/Processes.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "clients/Dhclient.h"
#include "clients/Dhcp6c.h"
#include "clients/Dhcpcd.h"
#include "clients/Udhcpc.h"
#include "formats/Directory.h"
#include "formats/Files.h"
#include "formats/Numbers.h"
#include "formats/SystemErrors.h"
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
constexpr std::array<KnownManager, 4> knownManagers{{
    {"systemd-network", Client::Networkd},  // systemd-networkd, cut off
    {"NetworkManager", Client::NetworkManager},
    {"wickedd-dhcp4", Client::Wicked},
    {"connmand", Client::Connman},
}};

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
/// hidden, which is not an error.
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

/// Takes the next word off a text.
std::string_view nextWord(std::string_view& text) {
    text.remove_prefix(std::min(text.find_first_not_of(' '), text.size()));
    const std::string_view word = text.substr(0, text.find(' '));
    text.remove_prefix(word.size());
    return word;
}

/// Whether a text of the form of /proc/PID/stat is that of a thread of the kernel.
bool isOfKernel(std::string_view status) {
    constexpr std::uint32_t kernelThread = 0x0020'0000;  // PF_KTHREAD
    constexpr int wordsBefore = 6;  // state, parent, group, session, terminal and its group
    // The name may have blanks and parentheses of its own.
    const std::size_t afterName = status.rfind(')');
    if (afterName == std::string_view::npos) {
        return false;
    }
    status.remove_prefix(afterName + 1);
    for (int word = 0; word < wordsBefore; ++word) {
        nextWord(status);
    }
    return (parseNumber<std::uint32_t>(nextWord(status)).value_or(0) & kernelThread) != 0;
}

/// The threads of the kernel, most of the processes of many a machine, sorted: none of
/// them needs to be looked at. They are children of number 2, unless that is a program,
/// as in a container. Empty when the kernel does not tell (CONFIG_PROC_CHILDREN).
std::vector<std::int32_t> kernelThreads(int proc) {
    std::vector<std::int32_t> threads;
    std::array<char, 4096> buffer{};
    if (!isOfKernel(readShort(proc, "2/stat", buffer))) {
        return threads;
    }
    const UniqueFd fd{::openat(proc, "2/task/2/children", O_RDONLY | O_CLOEXEC)};
    if (!fd) {
        return threads;
    }
    std::string text;
    for (ssize_t got = 0; (got = ::read(fd.get(), buffer.data(), buffer.size())) > 0;) {
        text.append(buffer.data(), static_cast<std::size_t>(got));
    }
    std::string_view rest = text;
    for (std::string_view word = nextWord(rest); !word.empty(); word = nextWord(rest)) {
        threads.push_back(numberOf(word));
    }
    std::sort(threads.begin(), threads.end());
    return threads;
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
        facts.diagnostics.emplace_back("cannot tell the links of process " + std::string{process} +
                                       " (" + std::string{nameOf(found->client)} +
                                       "): " + reasonOf(errno));
    }
    if (where == ManagerProcess::Where::Here) {
        found->pid = numberOf(process);
        facts.processes.push_back(*std::move(found));
    }
}

}  // namespace

void readProcesses(const Roots& roots, ClientFacts& facts) {
    Directory directory{roots.proc};
    if (!directory) {
        facts.diagnostics.push_back(unreadable(roots.proc, errno));
        return;
    }
    const int proc = directory.descriptor();
    // Of this thread: namespaces belong to threads, not to processes.
    const std::string ownNamespace = readNamespace(proc, "thread-self/ns/net");
    const std::vector<std::int32_t> ofKernel = kernelThreads(proc);
    for (std::string_view process = directory.next(); !process.empty();
         process = directory.next()) {
        if (process.front() < '1' || process.front() > '9' ||
            std::binary_search(ofKernel.begin(), ofKernel.end(), numberOf(process))) {
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
        facts.diagnostics.push_back(unreadable(roots.proc, errno));
    }
}

}  // namespace ZR::Live
