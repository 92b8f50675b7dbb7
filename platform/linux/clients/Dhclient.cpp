#include "clients/Dhclient.h"

#include <sys/stat.h>

#include <algorithm>
#include <cstddef>
#include <ctime>
#include <utility>
#include <vector>

#include "clients/DhclientLease.h"
#include "clients/ProcessFiles.h"
#include "formats/Files.h"
#include "formats/InterfaceName.h"
#include "formats/Trust.h"

namespace ZR::Live {
namespace {

// Options with a value of their own; a value taken for an interface would turn
// "all links" into "this one". The capital ones are additions of distributions.
constexpr std::array<std::string_view, 20> optionsWithValue{"-p",
                                                            "-D",
                                                            "-s",
                                                            "-g",
                                                            "-e",
                                                            "-lf",
                                                            "-pf",
                                                            "-cf",
                                                            "-df",
                                                            "-sf",
                                                            "-C",
                                                            "-F",
                                                            "-H",
                                                            "-V",
                                                            "-timeout",
                                                            "-4o6",
                                                            "--dad-wait-time",
                                                            "--prefix-len-hint",
                                                            "--decline-wait-time",
                                                            "--address-prefix-len"};

/// A lease file, known by what it is and not by which of its names was used.
struct LeaseFileId {
    dev_t device{};
    ino_t inode{};

    bool operator==(const LeaseFileId&) const = default;
};

struct LeaseFile {
    std::string path;   // as it was named
    std::string place;  // without symbolic links
    LeaseFileId id;
    std::pair<std::int64_t, std::int64_t> modified;  // seconds, nanoseconds
    std::vector<const ClientProcess*> keepers;       // clients that keep it now
};

bool isLeaseFileName(std::string_view name, std::string_view prefix) {
    return name.starts_with(prefix) && (name.ends_with(".leases") || name.ends_with(".lease"));
}

/// The lease files of the machine, each once.
class LeaseFiles {
  public:
    explicit LeaseFiles(ClientFacts& facts) : facts_(facts) {}

    /// `root` is the directory for which "/" stands, where that is another than this
    /// process's own.
    void add(const std::string& path, const ClientProcess* keeper, std::string_view root = {}) {
        std::vector<uid_t> writers;
        if (keeper != nullptr) {
            writers.push_back(keeper->user);
        }
        auto found = findFile(path, writers, facts_.diagnostics, root);
        if (!found) {
            return;
        }
        const LeaseFileId id{.device = found->status.st_dev, .inode = found->status.st_ino};
        auto file = std::find_if(files_.begin(), files_.end(),
                                 [&](const LeaseFile& known) { return known.id == id; });
        if (file == files_.end()) {
            std::string named = std::string{root} + path;
            if (!found->doubt.empty()) {
                facts_.diagnostics.push_back(untrusted(named, found->doubt));
                return;
            }
            if (found->path != named) {
                watch(found->path);
            }
            const timespec& written = found->status.st_mtim;
            files_.push_back({.path = std::move(named),
                              .place = std::move(found->path),
                              .id = id,
                              .modified = {written.tv_sec, written.tv_nsec},
                              .keepers = {}});
            file = files_.end() - 1;
        }
        if (keeper != nullptr) {
            file->keepers.push_back(keeper);
        }
    }

    void addDirectory(const std::string& path, std::string_view prefix) {
        for (const std::string& name : listOptionalDirectory(path, facts_.diagnostics)) {
            if (isLeaseFileName(name, prefix)) {
                add(pathIn(path, name), nullptr);
            }
        }
    }

    /// Has changes of one file noticed, also that it comes.
    void watch(const std::string& path) {
        const std::size_t slash = path.rfind('/');
        facts_.places.push_back({.directory = path.substr(0, std::max<std::size_t>(slash, 1)),
                                 .namePrefix = path.substr(slash + 1)});
    }

    [[nodiscard]] std::vector<LeaseFile> newestFirst() && {
        std::stable_sort(files_.begin(), files_.end(), [](const LeaseFile& a, const LeaseFile& b) {
            return a.modified > b.modified;
        });
        return std::move(files_);
    }

  private:
    ClientFacts& facts_;
    std::vector<LeaseFile> files_;
};

void addProcessFile(const Roots& roots, const ClientProcess& process, LeaseFiles& files,
                    std::vector<Diagnostic>& diagnostics) {
    if (!process.leaseFile.empty()) {
        if (const auto file = fileOfProcess(roots, process, process.leaseFile, diagnostics)) {
            files.watch(file->root + file->path);
            files.add(file->path, &process, file->root);
        }
        return;
    }
    for (const DhclientDirectory& directory : dhclientDirectories) {
        if (directory.isDefault) {
            const std::string path = std::string{directory.path} +
                                     (process.ipv6 ? "/dhclient6.leases" : "/dhclient.leases");
            if (const auto file = fileOfProcess(roots, process, path, diagnostics)) {
                files.add(file->path, &process, file->root);
            }
        }
    }
}

/// The running client that keeps a lease in a file; nullptr without one.
const ClientProcess* keeperOf(const LeaseFile& file, const DhclientLease& lease) {
    const auto keeper =
        std::find_if(file.keepers.begin(), file.keepers.end(), [&](const ClientProcess* candidate) {
            return candidate->ipv6 == lease.ipv6 && candidate->serves(lease.interfaceName);
        });
    return keeper == file.keepers.end() ? nullptr : *keeper;
}

/// nullopt for a file that cannot be read.
std::optional<DhclientLeases> readLeases(const LeaseFile& file,
                                         std::vector<Diagnostic>& diagnostics) {
    // The client appends to its file: a reading may find a half of the last block. The other
    // half follows at once.
    std::optional<DhclientLeases> found;
    for (int attempt = 0; attempt < 2 && (!found || found->cutOff); ++attempt) {
        const auto content = readOptionalFile(file.place, diagnostics);
        if (!content) {
            return std::nullopt;
        }
        found = parseDhclientLeases(*content);
    }
    return found;
}

void addLeases(const LeaseFile& file, ClientFacts& facts) {
    const auto found = readLeases(file, facts.diagnostics);
    if (!found) {
        return;
    }
    for (const DhclientDamage& damage : found->damage) {
        facts.diagnostics.emplace_back(
            file.path + ", line " + std::to_string(damage.line) + ": " + damage.what,
            Diagnostic::Kind::Damaged);
    }
    for (const DhclientLease& lease : found->leases) {
        const ClientProcess* const keeper = keeperOf(file, lease);
        for (const DhclientAddress& address : lease.addresses) {
            facts.leases.push_back({.client = Client::Dhclient,
                                    .interfaceName = lease.interfaceName,
                                    .address = address.address,
                                    .server = lease.server,
                                    .bootp = lease.bootp,
                                    .released = lease.released,
                                    .clientAlive = keeper != nullptr,
                                    .expires = address.expires,
                                    .obtained = address.obtained,
                                    .renews = address.renews,
                                    .rebinds = address.rebinds,
                                    .options = lease.options,
                                    .clientIdentifier = lease.clientIdentifier,
                                    .pid = keeper == nullptr ? 0 : keeper->pid,
                                    .origin = file.path});
        }
    }
}

}  // namespace

std::optional<ClientProcess> parseDhclientArguments(std::span<const std::string_view> arguments) {
    if (arguments.empty()) {
        return std::nullopt;
    }
    ClientProcess process{
        .client = Client::Dhclient, .interfaces = {}, .leaseFile = {}, .ipv6 = false};
    for (std::size_t i = 1; i < arguments.size(); ++i) {
        const std::string_view argument = arguments[i];
        if (!argument.starts_with('-')) {
            if (const auto name = InterfaceName::from(argument)) {
                process.interfaces.push_back(*name);
            }
        } else if (argument == "-r" || argument == "-x") {
            return std::nullopt;
        } else if (argument == "-6") {
            process.ipv6 = true;
        } else if (std::find(optionsWithValue.begin(), optionsWithValue.end(), argument) !=
                   optionsWithValue.end()) {
            ++i;
            if (argument == "-lf" && i < arguments.size()) {
                process.leaseFile = arguments[i];
            }
        }
    }
    return process;
}

void readDhclient(const Roots& roots, ClientFacts& facts) {
    LeaseFiles files{facts};
    for (const ClientProcess& process : facts.processes) {
        if (process.client == Client::Dhclient) {
            addProcessFile(roots, process, files, facts.diagnostics);
        }
    }
    for (const DhclientDirectory& directory : dhclientDirectories) {
        files.addDirectory(roots.path(directory.path), dhclientNamePrefix);
    }
    files.addDirectory(roots.path(dracutDirectory), dracutPrefix);
    for (const LeaseFile& file : std::move(files).newestFirst()) {
        addLeases(file, facts);
    }
}

}  // namespace ZR::Live
