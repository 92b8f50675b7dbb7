#include "clients/Processes.h"

#include <fcntl.h>
#include <linux/capability.h>
#include <linux/magic.h>
#include <sys/stat.h>
#include <sys/vfs.h>
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
#include <utility>
#include <vector>

#include "clients/Dhclient.h"
#include "clients/Dhcp6c.h"
#include "clients/Dhcpcd.h"
#include "clients/Udhcpc.h"
#include "formats/Files.h"
#include "formats/Trust.h"
#include "formats/ValueFormats.h"
#include "kernel/Sockets.h"
#include "zrcommon/Strings.h"
#include "zrcommon/UniqueFd.h"

namespace ZR::Live {
namespace {

constexpr std::string_view dhcpcdName = "dhcpcd";

using ArgumentParser = std::optional<ClientProcess> (*)(std::span<const std::string_view>);

/// What understands the command line of a client; null where the build is without it.
template <Client client>
constexpr ArgumentParser parserOf() {
    if constexpr (!isBuilt(client)) {
        return nullptr;
    } else if constexpr (client == Client::Dhclient) {
        return parseDhclientArguments;
    } else if constexpr (client == Client::Dhcpcd) {
        return parseDhcpcdArguments;
    } else if constexpr (client == Client::Udhcpc) {
        return parseUdhcpcArguments;
    } else {
        static_assert(client == Client::Dhcp6c);
        return parseDhcp6cArguments;
    }
}

/// Which process name is which client, and who understands its command line.
struct KnownClient {
    std::string_view name;  // as /proc/PID/comm has it: at most 15 bytes
    Client client;
    ArgumentParser parse;
};
constexpr std::string_view manyPrograms = "busybox";
constexpr std::array<KnownClient, 6> knownClients{{
    {"dhclient", Client::Dhclient, parserOf<Client::Dhclient>()},
    {dhcpcdName, Client::Dhcpcd, parserOf<Client::Dhcpcd>()},
    {"udhcpc", Client::Udhcpc, parserOf<Client::Udhcpc>()},
    {"udhcpc6", Client::Udhcpc, parserOf<Client::Udhcpc>()},
    {manyPrograms, Client::Udhcpc, parserOf<Client::Udhcpc>()},
    {"dhcp6c", Client::Dhcp6c, parserOf<Client::Dhcp6c>()},
}};

/// Which process name is which program that manages links.
struct KnownManager {
    std::string_view name;  // as /proc/PID/comm has it: at most 15 bytes
    Client client;
    bool built;
};
constexpr std::array<KnownManager, 4> knownManagers{{
    {"systemd-network", Client::Networkd, isBuilt(Client::Networkd)},  // systemd-networkd, cut off
    {"NetworkManager", Client::NetworkManager, isBuilt(Client::NetworkManager)},
    {"wickedd-dhcp4", Client::Wicked, isBuilt(Client::Wicked)},
    {"connmand", Client::Connman, isBuilt(Client::Connman)},
}};

/// Of a program of which nothing is read but that it runs.
Diagnostic notRead(Client client) {
    return Diagnostic{std::string{nameOf(client)} +
                          " runs, which this build does not read: on which links it uses DHCP "
                          "cannot be told",
                      Diagnostic::Kind::Note};
}

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

/// What a symbolic link says. Empty when it cannot be read, for the reason that errno then
/// has.
std::string readLink(int proc, const char* path) {
    std::array<char, 256> target{};
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
    const std::string other = readLink(proc, ProcessPath{process, "/ns/net"}.get());
    if (other.empty() || ownNamespace.empty()) {
        return ManagerProcess::Where::Unknown;
    }
    return other == ownNamespace ? ManagerProcess::Where::Here : ManagerProcess::Where::Elsewhere;
}

std::int32_t numberOf(std::string_view process) {
    return parseNumber<std::int32_t>(process).value_or(0);
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

std::optional<ProcessStatus> readStatus(int proc, std::string_view process) {
    // Much of it may be the list of its groups.
    std::array<char, 16384> buffer{};
    return parseProcessStatus(readShort(proc, ProcessPath{process, "/status"}.get(), buffer));
}

/// Whether a process is in the user namespace of this one. Only there do its capabilities
/// say what it may do to this network namespace: any user has all of them in a user
/// namespace of their own.
bool sharesUserNamespace(int proc, std::string_view process) {
    const std::string own = readLink(proc, "thread-self/ns/user");
    const std::string other = readLink(proc, ProcessPath{process, "/ns/user"}.get());
    if (!own.empty() && !other.empty()) {
        return own == other;
    }
    // Any user may read which users of the parent namespace those of a namespace are. No two
    // namespaces that this process can see have the same, unless root made them so.
    std::array<char, 4096> ownBuffer{};
    std::array<char, 4096> otherBuffer{};
    const std::string_view ownUsers = readShort(proc, "thread-self/uid_map", ownBuffer);
    return !ownUsers.empty() &&
           ownUsers == readShort(proc, ProcessPath{process, "/uid_map"}.get(), otherBuffer);
}

/// Whether its program could be the one of that name. Any user can give the name and the
/// arguments of a client to another program, which may be one that has privileges of its own.
bool hasTheProgram(int proc, std::string_view process, std::string_view name) {
    const std::string program = readLink(proc, ProcessPath{process, "/exe"}.get());
    const std::string_view file = std::string_view{program}.substr(program.rfind('/') + 1);
    return program.empty() || file.starts_with(name) || file.starts_with(manyPrograms);
}

/// Why a process cannot be a DHCP client of this network namespace: it may not open the
/// sockets of one, or anyone could have started it. Empty when it can be one.
std::string doubtOf(int proc, std::string_view process, std::string_view name,
                    const ProcessStatus& status) {
    constexpr std::uint64_t needed = (std::uint64_t{1} << CAP_NET_RAW) |
                                     (std::uint64_t{1} << CAP_NET_BIND_SERVICE) |
                                     (std::uint64_t{1} << CAP_NET_ADMIN);
    struct stat program {};
    const bool known = ::fstatat(proc, ProcessPath{process, "/exe"}.get(), &program, 0) == 0;
    const bool lent = known && (program.st_mode & S_ISUID) != 0;
    if (lent || (status.user == 0 && status.realUser != 0)) {
        return "every user may start its program, which is set-user-ID";
    }
    if (status.user == 0) {
        return {};
    }
    if ((status.capabilities & needed) == 0 || !sharesUserNamespace(proc, process)) {
        return "user " + std::to_string(status.user) + " may not open the sockets of a DHCP client";
    }
    return hasTheProgram(proc, process, name) ? std::string{} : "its program has another name";
}

Diagnostic implausible(std::string_view process, std::string_view name, std::string_view doubt) {
    return untrusted("process " + std::string{process} + " (" + std::string{name} + ")", doubt);
}

/// Reads all processes of a directory like /proc.
class Reader {
  public:
    Reader(const Roots& roots, Directory& directory, std::span<const Client> unread,
           ClientFacts& facts)
        : roots_(roots),
          unread_(unread),
          directory_(directory),
          proc_(directory.descriptor()),
          // Of this thread: namespaces belong to threads, not to processes.
          ownNamespace_(readLink(proc_, "thread-self/ns/net")),
          facts_(facts) {}

    void readAll() {
        const std::vector<std::int32_t> ofKernel = kernelThreads(proc_);
        for (std::string_view process = directory_.next(); !process.empty();
             process = directory_.next()) {
            if (process.front() >= '1' && process.front() <= '9' &&
                !std::binary_search(ofKernel.begin(), ofKernel.end(), numberOf(process))) {
                readProcess(process);
            }
        }
        if (errno != 0) {
            facts_.diagnostics.push_back(unreadable(roots_.proc, errno));
        }
        for (Candidate& candidate : candidates_) {
            judge(candidate);
        }
        findHiding();
    }

  private:
    struct Candidate {
        std::string number;
        std::string_view name;
        ClientProcess process;
        ProcessStatus status;
        std::string doubt;
        bool read = true;  // what it does is known
    };
    /// A process of dhcpcd, which is one program in several processes: what it heard and may
    /// do is spread over them.
    struct Part {
        std::int32_t pid = 0;
        std::int32_t parent = 0;
        bool ofRoot = false;
        bool hearsOthers = false;  // watches the addresses of others by ARP
    };

    void readProcess(std::string_view process) {
        std::array<char, 32> buffer{};
        std::string_view name = readShort(proc_, ProcessPath{process, "/comm"}.get(), buffer);
        name = name.substr(0, name.find('\n'));
        const auto* const client =
            std::find_if(knownClients.begin(), knownClients.end(),
                         [&](const KnownClient& known) { return known.name == name; });
        if (client != knownClients.end()) {
            readClient(process, *client);
            return;
        }
        const auto* const manager =
            std::find_if(knownManagers.begin(), knownManagers.end(),
                         [&](const KnownManager& known) { return known.name == name; });
        if (manager != knownManagers.end()) {
            readManager(process, *manager);
        }
    }

    void readClient(std::string_view process, const KnownClient& client) {
        std::array<char, 32768> buffer{};
        const auto arguments =
            splitArguments(readShort(proc_, ProcessPath{process, "/cmdline"}.get(), buffer));
        const auto status = readStatus(proc_, process);
        if (!status || status->hasEnded()) {
            return;
        }
        std::string doubt = doubtOf(proc_, process, client.name, *status);
        if (client.name == dhcpcdName) {
            parts_.push_back({.pid = numberOf(process),
                              .parent = status->parent,
                              .ofRoot = doubt.empty() && status->user == 0,
                              .hearsOthers = !arguments.empty() &&
                                             arguments.front().starts_with("dhcpcd: [BPF ARP]")});
        }
        const bool read = client.parse != nullptr && isRead(client.client);
        std::optional<ClientProcess> found;
        if (read) {
            found = client.parse(arguments);
        } else if (client.name != manyPrograms || isUdhcpc(arguments)) {
            found = ofAllLinks(client.client, 0, 0);
        }
        if (!found) {
            return;
        }
        found->pid = numberOf(process);
        found->user = status->user;
        candidates_.push_back({.number = std::string{process},
                               .name = client.name,
                               .process = *std::move(found),
                               .status = *status,
                               .doubt = std::move(doubt),
                               .read = read});
    }

    [[nodiscard]] bool isRead(Client client) const {
        return std::find(unread_.begin(), unread_.end(), client) == unread_.end();
    }

    /// A client of which no more is known: any link may be its.
    static ClientProcess ofAllLinks(Client client, std::int32_t pid, std::uint32_t user) {
        return {.client = client, .interfaces = {}, .leaseFile = {}, .pid = pid, .user = user};
    }

    static bool isUdhcpc(std::span<const std::string_view> arguments) {
        return arguments.size() > 1 && arguments[1].starts_with("udhcpc");
    }

    /// Who asks what is known then hears that it is not known, as of a client that is hidden.
    void addUnread(ClientProcess process) {
        facts_.diagnostics.push_back(notRead(process.client));
        facts_.hiddenClients.push_back(std::move(process));
    }

    void readManager(std::string_view process, const KnownManager& manager) {
        const auto status = readStatus(proc_, process);
        if (!status || status->hasEnded()) {
            return;
        }
        const auto where = whereIs(proc_, process, ownNamespace_);
        const std::string doubt = doubtOf(proc_, process, manager.name, *status);
        if (doubt.empty() && !(manager.built && isRead(manager.client))) {
            if (where != ManagerProcess::Where::Elsewhere) {
                addUnread(ofAllLinks(manager.client, numberOf(process), status->user));
            }
        } else if (doubt.empty()) {
            facts_.managers.push_back({.client = manager.client,
                                       .where = where,
                                       .pid = numberOf(process),
                                       .user = status->user});
        } else if (where != ManagerProcess::Where::Elsewhere) {
            facts_.diagnostics.push_back(implausible(process, manager.name, doubt));
        }
    }

    void judge(Candidate& candidate) {
        const auto where = whereIs(proc_, candidate.number, ownNamespace_);
        const int error = errno;
        if (where == ManagerProcess::Where::Elsewhere) {
            return;
        }
        if (!candidate.doubt.empty() && !hasPartOfRoot(candidate)) {
            facts_.diagnostics.push_back(
                implausible(candidate.number, candidate.name, candidate.doubt));
        } else if (where == ManagerProcess::Where::Here && candidate.read) {
            candidate.process.heardLinks = heardBy(candidate);
            facts_.processes.push_back(std::move(candidate.process));
        } else if (where == ManagerProcess::Where::Here) {
            addUnread(std::move(candidate.process));
        } else if (error == EACCES || error == EPERM) {
            facts_.diagnostics.emplace_back(
                "cannot tell the links of process " + candidate.number + " (" +
                    std::string{nameOf(candidate.process.client)} + "): " + reasonOf(error),
                Diagnostic::Kind::Denied);
            facts_.hiddenClients.push_back(std::move(candidate.process));
        }
    }

    /// Whether a process of dhcpcd gave up its rights, and has another one of root for what
    /// needs them. No other user can have such a one.
    [[nodiscard]] bool hasPartOfRoot(const Candidate& candidate) const {
        const std::int32_t parent = candidate.status.parent;
        const bool isPart = std::any_of(parts_.begin(), parts_.end(),
                                        [&](const Part& part) { return part.pid == parent; });
        return candidate.process.client == Client::Dhcpcd &&
               std::any_of(parts_.begin(), parts_.end(), [&](const Part& part) {
                   return part.ofRoot && (part.parent == candidate.process.pid ||
                                          part.pid == parent || (isPart && part.parent == parent));
               });
    }

    /// The processes of which a client consists.
    [[nodiscard]] std::vector<std::int32_t> processesOf(const Candidate& candidate) const {
        std::vector<std::int32_t> pids{candidate.process.pid};
        if (candidate.process.client != Client::Dhcpcd) {
            return pids;
        }
        for (std::size_t i = 0; i < pids.size(); ++i) {
            for (const Part& part : parts_) {
                if (part.parent == pids[i] && !part.hearsOthers &&
                    std::find(pids.begin(), pids.end(), part.pid) == pids.end()) {
                    pids.push_back(part.pid);
                }
            }
        }
        return pids;
    }

    /// The links of a client's packet sockets; nullopt when that is not to be known.
    std::optional<std::vector<std::uint32_t>> heardBy(const Candidate& candidate) {
        if (!packetSockets_) {
            packetSockets_ = readPacketSockets(roots_, facts_.diagnostics);
        }
        std::vector<std::uint32_t> links;
        for (const std::int32_t pid : processesOf(candidate)) {
            Directory descriptors{roots_.proc + '/' + std::to_string(pid) + "/fd"};
            if (!descriptors) {
                return std::nullopt;
            }
            addHeard(descriptors, links);
        }
        return links;
    }

    void addHeard(Directory& descriptors, std::vector<std::uint32_t>& links) const {
        constexpr std::string_view prefix = "socket:[";
        for (std::string_view name = descriptors.next(); !name.empty(); name = descriptors.next()) {
            const std::string target =
                readLink(descriptors.descriptor(), ProcessPath{name, ""}.get());
            if (!target.starts_with(prefix)) {
                continue;
            }
            const auto inode = parseNumber<std::uint64_t>(
                std::string_view{target}.substr(prefix.size(), target.size() - prefix.size() - 1));
            for (const PacketSocket& socket : *packetSockets_) {
                if (socket.inode == inode &&
                    std::find(links.begin(), links.end(), socket.link) == links.end()) {
                    links.push_back(socket.link);
                }
            }
        }
    }

    /// Process 1 is another user's. Where even root may not see it, a mount option of /proc
    /// keeps this process from seeing those of others (hidepid, proc(5)).
    void findHiding() {
        struct statfs system {};
        const bool real = ::fstatfs(proc_, &system) == 0 && system.f_type == PROC_SUPER_MAGIC;
        if (real && ::faccessat(proc_, "1/comm", F_OK, 0) != 0) {
            facts_.processesHidden = true;
            facts_.diagnostics.emplace_back(
                roots_.proc + " hides the processes of other users: a DHCP client among them " +
                    "is not seen",
                Diagnostic::Kind::Denied);
        }
    }

    const Roots& roots_;
    std::span<const Client> unread_;
    Directory& directory_;
    const int proc_;
    const std::string ownNamespace_;
    ClientFacts& facts_;
    std::vector<Candidate> candidates_;
    std::vector<Part> parts_;
    std::optional<std::vector<PacketSocket>> packetSockets_;
};

}  // namespace

void readProcesses(const Roots& roots, ClientFacts& facts) {
    readProcessesExcept({}, roots, facts);
}

void readProcessesExcept(std::span<const Client> unread, const Roots& roots, ClientFacts& facts) {
    Directory directory{roots.proc};
    if (!directory) {
        facts.diagnostics.push_back(unreadable(roots.proc, errno));
        return;
    }
    Reader{roots, directory, unread, facts}.readAll();
}

}  // namespace ZR::Live
