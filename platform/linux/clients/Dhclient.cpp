#include "clients/Dhclient.h"

#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <tuple>
#include <utility>
#include <vector>

#include "clients/DhclientLease.h"
#include "formats/Files.h"
#include "formats/InterfaceName.h"
#include "formats/SystemErrors.h"

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
    std::string path;
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

    void add(const std::string& path, const ClientProcess* keeper) {
        struct stat status {};
        if (::stat(path.c_str(), &status) != 0) {
            if (!isAbsent(errno)) {
                facts_.diagnostics.push_back(unreadable(path, errno));
            }
            return;
        }
        const LeaseFileId id{.device = status.st_dev, .inode = status.st_ino};
        auto file = std::find_if(files_.begin(), files_.end(),
                                 [&](const LeaseFile& known) { return known.id == id; });
        if (file == files_.end()) {
            files_.push_back({.path = path,
                              .id = id,
                              .modified = {status.st_mtim.tv_sec, status.st_mtim.tv_nsec},
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
                    std::vector<WatchedPlace>& places) {
    if (process.leaseFile.empty()) {
        for (const DhclientDirectory& directory : dhclientDirectories) {
            if (directory.isDefault) {
                files.add(roots.path(directory.path) +
                              (process.ipv6 ? "/dhclient6.leases" : "/dhclient.leases"),
                          &process);
            }
        }
        return;
    }
    // A relative name depends on the directory in which the client was started, which is
    // not known.
    if (process.leaseFile.front() != '/') {
        return;
    }
    const std::string path = roots.path(process.leaseFile);
    const std::size_t slash = path.rfind('/');
    places.push_back({.directory = path.substr(0, std::max<std::size_t>(slash, 1)),
                      .namePrefix = path.substr(slash + 1)});
    files.add(path, &process);
}

bool keeps(const LeaseFile& file, const DhclientLease& lease) {
    return std::any_of(file.keepers.begin(), file.keepers.end(), [&](const ClientProcess* keeper) {
        return keeper->ipv6 == lease.ipv6 && keeper->serves(lease.interfaceName);
    });
}

void addLeases(const LeaseFile& file, ClientFacts& facts) {
    const auto content = readOptionalFile(file.path, facts.diagnostics);
    if (!content) {
        return;
    }
    // A file that ends within a block is being written: the rest shows as a change.
    for (const DhclientLease& lease : parseDhclientLeases(*content)) {
        const bool alive = keeps(file, lease);
        for (const DhclientAddress& address : lease.addresses) {
            if (!address.expires) {
                continue;  // a claim without an end cannot be told from a stale one
            }
            facts.leases.push_back({.client = Client::Dhclient,
                                    .interfaceName = lease.interfaceName,
                                    .address = address.address,
                                    .server = lease.server,
                                    .bootp = lease.bootp,
                                    .released = lease.released,
                                    .clientAlive = alive,
                                    .expires = address.expires,
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
            addProcessFile(roots, process, files, facts.places);
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
