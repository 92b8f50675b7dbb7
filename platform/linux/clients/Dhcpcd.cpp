#include "clients/Dhcpcd.h"

#include <sys/stat.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <string>
#include <utility>
#include <variant>

#include "clients/DhcpcdCommand.h"
#include "clients/DhcpcdSettings.h"
#include "formats/DhcpPacket.h"
#include "formats/Files.h"
#include "formats/Trust.h"
#include "formats/ValueFormats.h"
#include "zrcommon/File.h"

namespace ZR::Live {
namespace {

using Role = DhcpcdTitle::Role;

constexpr std::string_view pidDirectory = "/run/dhcpcd";

template <typename Values, typename Value>
bool contains(const Values& values, const Value& value) {
    return std::find(values.begin(), values.end(), value) != values.end();
}

std::span<const std::byte> bytesOf(const std::string& content) {
    return std::as_bytes(std::span{content});
}

std::int64_t after(std::int64_t start, std::uint32_t time) {
    return time == UINT32_MAX ? Lease::never : start + time;
}

std::optional<std::int64_t> after(std::int64_t start, const std::optional<std::uint32_t>& time) {
    return time ? std::optional{after(start, *time)} : std::nullopt;
}

std::vector<std::string_view> wordsOf(std::string_view commandLine) {
    std::vector<std::string_view> words;
    while (!commandLine.empty()) {
        const std::size_t end = std::min(commandLine.find('\0'), commandLine.size());
        words.push_back(commandLine.substr(0, end));
        commandLine.remove_prefix(std::min(end + 1, commandLine.size()));
    }
    return words;
}

/// When a file was last written, in seconds since the epoch; nullopt when it is not there.
std::optional<std::int64_t> timeOf(const std::string& path) {
    struct stat status {};
    return ::stat(path.c_str(), &status) == 0 ? std::optional<std::int64_t>{status.st_mtim.tv_sec}
                                              : std::nullopt;
}

/// One file: the packet, and when it came.
struct LeaseFile {
    std::string path;
    std::int64_t written = 0;  // epoch seconds
    std::vector<InterfaceName> interfaces;
    bool ipv6 = false;
    bool readable = true;
};

/// The files of all known places, and the leases in them.
class LeaseFiles {
  public:
    LeaseFiles(const Roots& roots, ClientFacts& facts) : facts_(facts) {
        for (const ClientProcess& process : facts.processes) {
            if (process.client == Client::Dhcpcd) {
                writers_.push_back(process.user);
            }
        }
        for (const DhcpcdDirectory& place : dhcpcdDirectories) {
            readPlace(roots.path(place.path), place.namePrefix);
        }
    }

    /// Whether there is a file of a link, even one that cannot be read.
    [[nodiscard]] bool has(const InterfaceName& interface, bool ipv6) const {
        return std::any_of(files_.begin(), files_.end(), [&](const LeaseFile& file) {
            return file.ipv6 == ipv6 && contains(file.interfaces, interface);
        });
    }
    /// Whether what the files say of a link's IPv4 leases is all there is.
    [[nodiscard]] bool tellAll(const InterfaceName& interface) const {
        return std::all_of(files_.begin(), files_.end(), [&](const LeaseFile& file) {
            return file.ipv6 || file.readable || !contains(file.interfaces, interface);
        });
    }
    [[nodiscard]] bool lease(const InterfaceName& interface, const IpAddress& address) const {
        return std::any_of(leases_.begin(), leases_.end(), [&](const Lease& lease) {
            return lease.interfaceName == interface && lease.address == address;
        });
    }
    [[nodiscard]] std::vector<InterfaceName> interfaces() const {
        std::vector<InterfaceName> names;
        for (const LeaseFile& file : files_) {
            names.insert(names.end(), file.interfaces.begin(), file.interfaces.end());
        }
        return names;
    }
    std::vector<Lease>& leases() { return leases_; }

  private:
    void readPlace(const std::string& directory, std::string_view prefix) {
        for (const std::string& name : listOptionalDirectory(directory, facts_.diagnostics)) {
            std::string_view stem{name};
            const bool ipv6 = stem.ends_with(".lease6");
            if (!stem.starts_with(prefix) || (!ipv6 && !stem.ends_with(".lease"))) {
                continue;
            }
            stem.remove_prefix(prefix.size());
            stem = stem.substr(0, stem.rfind('.'));
            LeaseFile file{.path = pathIn(directory, name),
                           .interfaces = dhcpcdInterfaces(stem),
                           .ipv6 = ipv6};
            const bool trusted = isTrusted(file.path, writers_, facts_.diagnostics);
            const auto written = trusted ? timeOf(file.path) : std::nullopt;
            if (written) {  // else it is gone meanwhile
                file.written = *written;
                readFile(file);
                files_.push_back(std::move(file));
            }
        }
    }

    void readFile(LeaseFile& file) {
        // The file is rewritten in place: a reading may find half of it. The other half
        // follows at once.
        std::optional<std::string_view> reason;
        for (int attempt = 0; attempt < 2; ++attempt) {
            const auto content = readOptionalFile(file.path, facts_.diagnostics);
            file.readable = content.has_value();
            if (!content || content->empty()) {
                return;
            }
            reason = file.ipv6 ? take6(file, *content) : take4(file, *content);
            if (!reason) {
                return;
            }
        }
        file.readable = false;
        facts_.diagnostics.emplace_back("cannot use " + file.path + ": " + std::string{*reason},
                                        Diagnostic::Kind::Damaged);
    }

    std::optional<std::string_view> take4(const LeaseFile& file, const std::string& content) {
        auto parsed = parseDhcpReply(bytesOf(content));
        if (const auto* const reason = std::get_if<std::string_view>(&parsed)) {
            return *reason;
        }
        auto& reply = std::get<DhcpReply>(parsed);
        // A BOOTP reply has no lease time: the address is for ever (RFC 951). A DHCP reply
        // without one is that to a DHCPINFORM, which gives settings and no address.
        if (reply.address && (reply.leaseTime || reply.bootp)) {
            addForEach(file, {.client = Client::Dhcpcd,
                              .interfaceName = {},
                              .address = *reply.address,
                              .server = reply.server,
                              .bootp = reply.bootp,
                              .expires = after(file.written, reply.leaseTime.value_or(UINT32_MAX)),
                              .obtained = file.written,
                              .renews = after(file.written, reply.renewal),
                              .rebinds = after(file.written, reply.rebinding),
                              .options = std::move(reply.options),
                              .clientIdentifier = std::move(reply.clientIdentifier),
                              .origin = file.path});
        }
        return std::nullopt;
    }

    std::optional<std::string_view> take6(const LeaseFile& file, const std::string& content) {
        auto parsed = parseDhcp6Reply(bytesOf(content));
        if (const auto* const reason = std::get_if<std::string_view>(&parsed)) {
            return *reason;
        }
        const auto& reply = std::get<Dhcp6Reply>(parsed);
        for (const Dhcp6Address& address : reply.addresses) {
            addForEach(file, {.client = Client::Dhcpcd,
                              .interfaceName = {},
                              .address = address.address,
                              .server = {},
                              .expires = after(file.written, address.validLifetime),
                              .obtained = file.written,
                              .renews = after(file.written, address.renewal),
                              .rebinds = after(file.written, address.rebinding),
                              .options = reply.options,
                              .clientIdentifier = reply.clientIdentifier,
                              .origin = file.path});
        }
        return std::nullopt;
    }

    /// The kernel's addresses tell which of the interfaces is meant.
    void addForEach(const LeaseFile& file, Lease&& lease) {
        for (const InterfaceName& interface : file.interfaces) {
            lease.interfaceName = interface;
            leases_.push_back(lease);
        }
    }

    ClientFacts& facts_;
    std::vector<uid_t> writers_;
    std::vector<LeaseFile> files_;
    std::vector<Lease> leases_;
};

/// One running dhcpcd, with what its processes and its files say.
class Daemon {
  public:
    Daemon(const Roots& roots, ClientProcess process, ClientFacts& facts)
        : roots_(roots), process_(std::move(process)), facts_(facts), ipv4_(!process_.ipv6) {
        readSelf();
        readConfiguration();
    }

    /// Adds what it does, and what it was told.
    void addTo(const LeaseFiles& files) {
        ClientProcess asks4 = process_;
        asks4.ipv6 = false;
        ClientProcess asks6 = process_;
        asks6.ipv6 = true;
        const bool all = process_.interfaces.empty();
        // Of such a one, a socket may be on a link of which it was told the address.
        const bool byName = !all || helpersKnown_;
        if (all && helpersKnown_) {
            asks4.heardLinks.reset();
            asks6.heardLinks.reset();
        }
        asks4.interfaces.clear();
        asks6.interfaces.clear();
        for (const InterfaceName& interface : all ? candidates(files) : process_.interfaces) {
            const DhcpcdSettings settings = settingsOf(interface);
            if (settings.admits(interface)) {
                if (serves4(interface, settings, all, files) && byName) {
                    asks4.interfaces.push_back(interface);
                }
                if (serves6(interface, settings, files)) {
                    asks6.interfaces.push_back(interface);
                }
            }
        }
        if (!asks4.interfaces.empty() || (!byName && ipv4_)) {
            facts_.processes.push_back(std::move(asks4));
        }
        if (!asks6.interfaces.empty()) {
            facts_.processes.push_back(std::move(asks6));
        }
    }

  private:
    /// The file of a process, without what cannot be read: it may have ended meanwhile.
    [[nodiscard]] std::string ofProcess(std::int32_t pid, std::string_view file) const {
        return File::read(pathIn(pathIn(roots_.proc, std::to_string(pid)), file)).value_or("");
    }
    [[nodiscard]] std::optional<DhcpcdTitle> titleOf(std::int32_t pid) const {
        const std::string line = ofProcess(pid, "cmdline");
        return parseDhcpcdTitle(std::string_view{line}.substr(0, line.find('\0')));
    }
    void readSelf() {
        if (process_.pid == 0) {
            return;
        }
        const auto title = titleOf(process_.pid);
        if (title) {
            ipv4_ = title->ipv4 || !title->ipv6;
            ipv6_ = title->ipv6 || !title->ipv4;
            addHelpers(process_.pid, 2);
            return;
        }
        const std::string line = ofProcess(process_.pid, "cmdline");
        if (auto command = parseDhcpcdCommand(wordsOf(line))) {
            configuration_ = std::move(command->configuration);
            commandLine_ = std::move(command->settings);
        }
    }

    /// The helpers are children of the main process, or of its proxy.
    void addHelpers(std::int32_t pid, int depth) {
        const std::string number = std::to_string(pid);
        const auto children =
            File::read(pathIn(pathIn(roots_.proc, number), "task/" + number + "/children"));
        if (!children) {
            return;  // a kernel without CONFIG_PROC_CHILDREN
        }
        helpersKnown_ = true;
        std::string_view rest = *children;
        while (!rest.empty()) {
            const std::size_t end = std::min(rest.find(' '), rest.size());
            const auto child = parseNumber<std::int32_t>(rest.substr(0, end));
            rest.remove_prefix(std::min(end + 1, rest.size()));
            const auto title = child ? titleOf(*child) : std::nullopt;
            if (!title) {
                continue;
            }
            helpers_.push_back(*title);
            if (title->role == Role::Proxy && depth > 1) {
                addHelpers(*child, depth - 1);
            }
        }
    }

    void readConfiguration() {
        if (configuration_.empty()) {
            configuration_ =
                pathIn(std::string{dhcpcdConfigurationDirectory}, dhcpcdConfigurationFile);
        }
        if (configuration_.front() != '/') {
            return;  // of a directory that is not known
        }
        const std::size_t slash = configuration_.rfind('/');
        facts_.places.push_back(
            {.directory = roots_.path(configuration_.substr(0, std::max<std::size_t>(slash, 1))),
             .namePrefix = configuration_.substr(slash + 1)});
        const std::string path = roots_.path(configuration_);
        const auto written = timeOf(path);
        const auto started = startTime();
        // What was written since it started may not be read yet.
        if (written && (!started || *written <= *started)) {
            text_ = readTrustedFile(path, {}, facts_.diagnostics).value_or("");
        }
        configuration_ = path;
    }

    /// It writes its number when it starts.
    [[nodiscard]] std::optional<std::int64_t> startTime() const {
        const std::string directory = roots_.path(pidDirectory);
        if (process_.interfaces.size() != 1) {
            return timeOf(pathIn(directory, "pid"));
        }
        const std::string name{process_.interfaces.front().view()};
        for (const std::string_view protocol : {"", "-4", "-6"}) {
            if (const auto time =
                    timeOf(pathIn(directory, name + std::string{protocol} + ".pid"))) {
                return time;
            }
        }
        return std::nullopt;
    }

    [[nodiscard]] DhcpcdSettings settingsOf(const InterfaceName& interface) const {
        DhcpcdSettings settings = commandLine_;
        // What the command line takes away, the file does not give back.
        DhcpcdSettings file;
        applyDhcpcdConf(text_, interface, file);
        settings.ipv4 = settings.ipv4 && file.ipv4 && ipv4_;
        settings.ipv6 = settings.ipv6 && file.ipv6 && ipv6_;
        settings.dhcp4 = settings.dhcp4 && file.dhcp4;
        settings.dhcp6 = settings.dhcp6 && file.dhcp6;
        if (!settings.isStatic && !settings.inform) {
            settings.isStatic = file.isStatic;
            settings.inform = file.inform;
            settings.address = file.address;
        }
        settings.allowed.insert(settings.allowed.end(), file.allowed.begin(), file.allowed.end());
        settings.denied.insert(settings.denied.end(), file.denied.begin(), file.denied.end());
        return settings;
    }

    /// The links that one for all links may have under DHCP: where it asks, and where it has
    /// or had leases. It deletes the file of a lease that it gives back.
    [[nodiscard]] std::vector<InterfaceName> candidates(const LeaseFiles& files) const {
        std::vector<InterfaceName> names = files.interfaces();
        for (const DhcpcdTitle& helper : helpers_) {
            if (helper.interface) {
                names.push_back(*helper.interface);
            }
        }
        std::sort(names.begin(), names.end());
        names.erase(std::unique(names.begin(), names.end()), names.end());
        return names;
    }

    [[nodiscard]] bool asksOn(const InterfaceName& interface) const {
        return std::any_of(helpers_.begin(), helpers_.end(), [&](const DhcpcdTitle& helper) {
            return helper.role == Role::Asking && helper.interface == interface;
        });
    }
    [[nodiscard]] bool listensAt(const IpAddress& address) const {
        return std::any_of(helpers_.begin(), helpers_.end(), [&](const DhcpcdTitle& helper) {
            return helper.role == Role::Listens && helper.address == address;
        });
    }
    /// The address that it watches over on a link, other than those of 169.254/16 (RFC 3927),
    /// which it takes while no server responds.
    [[nodiscard]] std::optional<IpAddress> defendedOn(const InterfaceName& interface) const {
        for (const DhcpcdTitle& helper : helpers_) {
            if (helper.role == Role::Defends && helper.interface == interface && helper.address &&
                !helper.address->text().starts_with("169.254.")) {
                return helper.address;
            }
        }
        return std::nullopt;
    }

    /// Whether it has a link under DHCPv4. What it does counts before what it was told: of
    /// its command line nothing is left once it runs, and its file may have changed.
    bool serves4(const InterfaceName& interface, const DhcpcdSettings& settings, bool all,
                 const LeaseFiles& files) {
        if (asksOn(interface)) {
            return true;
        }
        const auto defended = defendedOn(interface);
        if (defended && files.tellAll(interface)) {
            if (files.lease(interface, *defended)) {
                return true;
            }
            // It has an address that no server gave.
            const bool informs = settings.inform || listensAt(*defended);
            addTold(interface, informs, *defended);
            return informs;
        }
        if (settings.address) {
            addTold(interface, settings.inform, *settings.address);
        }
        const bool known = !all || settings.inform || files.has(interface, false);
        return known && settings.asks4();
    }

    /// Of DHCPv6 no helper tells. Beside DHCPv4 the routers of the link decide whether it is
    /// used, so that only a lease shows it.
    [[nodiscard]] bool serves6(const InterfaceName& interface, const DhcpcdSettings& settings,
                               const LeaseFiles& files) const {
        const bool alone = !settings.ipv4 && !process_.interfaces.empty();
        return settings.asks6() && (alone || files.has(interface, true));
    }

    void addTold(const InterfaceName& interface, bool informs, const IpAddress& address) {
        facts_.managements.push_back({.client = Client::Dhcpcd,
                                      .interfaceName = interface,
                                      .dhcp4 = informs,
                                      .dhcp6 = {},
                                      .staticAddresses = {address},
                                      .origin = configuration_});
    }

    const Roots& roots_;
    ClientProcess process_;
    ClientFacts& facts_;
    bool ipv4_;
    bool ipv6_ = true;
    bool helpersKnown_ = false;
    std::vector<DhcpcdTitle> helpers_;
    std::string configuration_;  // the path of its file
    std::string text_;           // what is in the file
    DhcpcdSettings commandLine_;
};

/// Takes the processes of dhcpcd out of the facts, and puts those in that are DHCP clients.
void replaceProcesses(const Roots& roots, const LeaseFiles& files, ClientFacts& facts) {
    const auto isOther = [](const ClientProcess& process) {
        return process.client != Client::Dhcpcd;
    };
    const auto first =
        std::stable_partition(facts.processes.begin(), facts.processes.end(), isOther);
    std::vector<ClientProcess> found(std::make_move_iterator(first),
                                     std::make_move_iterator(facts.processes.end()));
    facts.processes.erase(first, facts.processes.end());
    for (ClientProcess& process : found) {
        // Its sockets are known to have an owner, on whatever links it asks.
        facts.managers.push_back({.client = Client::Dhcpcd,
                                  .where = ManagerProcess::Where::Here,
                                  .pid = process.pid,
                                  .user = process.user});
        Daemon{roots, std::move(process), facts}.addTo(files);
    }
}

}  // namespace

std::optional<ClientProcess> parseDhcpcdArguments(std::span<const std::string_view> arguments) {
    if (arguments.empty()) {
        return std::nullopt;
    }
    ClientProcess process{.client = Client::Dhcpcd, .interfaces = {}, .leaseFile = {}};
    if (const auto title = parseDhcpcdTitle(arguments.front())) {
        if (title->role != Role::Main) {
            return std::nullopt;
        }
        if (title->interface) {
            process.interfaces.push_back(*title->interface);
        }
        process.ipv6 = title->ipv6 && !title->ipv4;
        return process;
    }
    auto command = parseDhcpcdCommand(arguments);
    if (!command) {
        return std::nullopt;
    }
    process.interfaces = std::move(command->interfaces);
    process.ipv6 = !command->settings.ipv4;
    return process;
}

std::vector<InterfaceName> dhcpcdInterfaces(std::string_view stem) {
    std::vector<InterfaceName> interfaces;
    for (std::size_t length = stem.size(); length != 0 && length != std::string_view::npos;
         length = stem.rfind('-', length - 1)) {
        if (const auto name = InterfaceName::from(stem.substr(0, length))) {
            interfaces.push_back(*name);
        }
    }
    return interfaces;
}

void readDhcpcd(const Roots& roots, ClientFacts& facts) {
    LeaseFiles files{roots, facts};
    replaceProcesses(roots, files, facts);
    for (Lease& lease : files.leases()) {
        const auto keeper = std::find_if(
            facts.processes.begin(), facts.processes.end(), [&](const ClientProcess& process) {
                return process.client == Client::Dhcpcd && process.ipv6 != lease.address.isIPv4() &&
                       process.serves(*lease.interfaceName);
            });
        if (keeper != facts.processes.end()) {
            lease.clientAlive = true;
            lease.pid = keeper->pid;
        }
        facts.leases.push_back(std::move(lease));
    }
}

}  // namespace ZR::Live
