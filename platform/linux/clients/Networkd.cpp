#include "clients/Networkd.h"

#include <sys/stat.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <map>
#include <span>
#include <utility>
#include <vector>

#include "facts/ClientFacts.h"
#include "formats/Files.h"
#include "formats/NetworkFile.h"
#include "formats/NetworkdLease.h"
#include "formats/Trust.h"
#include "formats/ValueFormats.h"
#include "zrcommon/PropertyFile.h"

namespace ZR::Live {
namespace {

/// When a file was last written, in seconds since the epoch; 0 when it is gone.
std::int64_t timeOf(const std::string& path) {
    struct stat status {};
    return ::stat(path.c_str(), &status) == 0 ? status.st_mtim.tv_sec : 0;
}

/// The text of a .network file and its drop-ins, each path read once per reading:
/// one file often serves many links.
class NetworkFiles {
  public:
    NetworkFiles(const Roots& roots, ClientFacts& facts) : roots_(roots), facts_(facts) {}

    /// nullopt when the file cannot be read, so that nothing is known, and when it or a
    /// drop-in was written later than `applied`: networkd may not have read that.
    std::optional<NetworkFile> settings(const std::string& path, std::int64_t applied) {
        const auto& found = find(path);
        return found && found->written <= applied ? std::optional{found->settings} : std::nullopt;
    }

  private:
    struct Found {
        NetworkFile settings;
        std::int64_t written = 0;  // epoch seconds, of the newest
    };

    const std::optional<Found>& find(const std::string& path) {
        const auto known = read_.find(path);
        if (known != read_.end()) {
            return known->second;
        }
        return read_.emplace(path, read(path)).first->second;
    }

    std::optional<Found> read(const std::string& path) {
        const std::size_t slash = path.rfind('/');
        if (path.empty() || path.front() != '/') {
            return std::nullopt;
        }
        const std::string_view name = std::string_view{path}.substr(slash + 1);
        watch(std::string_view{path}.substr(0, std::max<std::size_t>(slash, 1)), name);
        const auto text = readTrustedFile(roots_.path(path), {}, facts_.diagnostics);
        if (!text) {
            return std::nullopt;
        }
        Found found{.settings = {}, .written = timeOf(roots_.path(path))};
        applyNetworkFile(*text, found.settings);
        for (const auto& [dropIn, file] : dropIns(name)) {
            if (const auto more = readTrustedFile(file, {}, facts_.diagnostics)) {
                applyNetworkFile(*more, found.settings);
                found.written = std::max(found.written, timeOf(file));
            }
        }
        return found;
    }

    /// Drop-in names in the order in which they apply, with their paths.
    std::map<std::string, std::string> dropIns(std::string_view name) {
        std::map<std::string, std::string> found;
        for (const std::string_view directory : networkFileDirectories) {
            const std::string path = std::string{directory} + '/' + std::string{name} + ".d";
            watch(path, "");
            for (const std::string& file :
                 listOptionalDirectory(roots_.path(path), facts_.diagnostics)) {
                if (file.ends_with(".conf")) {
                    found.emplace(file, pathIn(roots_.path(path), file));
                }
            }
        }
        return found;
    }

    void watch(std::string_view directory, std::string_view prefix) {
        facts_.places.push_back(
            {.directory = roots_.path(directory), .namePrefix = std::string{prefix}});
    }

    const Roots& roots_;
    ClientFacts& facts_;
    std::map<std::string, std::optional<Found>> read_;
};

/// The user as whom networkd runs, or ran: root, who alone can have made its directory in
/// /run/systemd, has given it to that one.
std::vector<uid_t> writersOf(const Roots& roots) {
    struct stat status {};
    return ::stat(roots.path(networkdStateDirectory).c_str(), &status) == 0
               ? std::vector<uid_t>{status.st_uid}
               : std::vector<uid_t>{};
}

void tellDamage(const std::string& path, const std::string& damage, ClientFacts& facts) {
    facts.diagnostics.emplace_back("cannot use all of " + path + ": " + damage,
                                   Diagnostic::Kind::Damaged);
}

/// What networkd says of one link in its state file, and of how it was told to configure it.
std::optional<LinkConfiguration> readLink(const Roots& roots, const std::string& path,
                                          std::uint32_t ifindex, std::span<const uid_t> writers,
                                          NetworkFiles& files, ClientFacts& facts) {
    const auto text = readTrustedFile(path, writers, facts.diagnostics);
    if (!text) {
        return std::nullopt;
    }
    const NetworkdLink link = parseNetworkdLink(*text);
    if (!link.damage.empty()) {
        tellDamage(path, link.damage, facts);
    }
    if (!link.managed()) {
        return std::nullopt;
    }
    LinkConfiguration found{.client = Client::Networkd,
                            .ifindex = ifindex,
                            .dhcp4 = {},
                            .dhcp6 = {},
                            .staticAddresses = {},
                            .origin = path};
    if (link.networkFile.empty()) {
        return found;
    }
    if (auto settings = files.settings(link.networkFile, timeOf(path))) {
        found.dhcp4 = settings->dhcp4;
        found.dhcp6 = settings->dhcp6;
        found.staticAddresses = std::move(settings->addresses);
        found.linkLocal4 = settings->linkLocal4;
        found.origin = roots.path(link.networkFile);
    }
    return found;
}

}  // namespace

bool NetworkdLink::managed() const noexcept {
    // "linger" is a link that is gone.
    return !adminState.empty() && adminState != "unmanaged" && adminState != "linger";
}

NetworkdLink parseNetworkdLink(std::string_view text) {
    NetworkdLink link;
    for (PropertyLine& line : parsePropertyLines(text)) {
        if (line.key.empty() && link.damage.empty()) {
            link.damage = "line " + std::to_string(line.line) + ": not of the form KEY=value";
        } else if (line.key == "ADMIN_STATE") {
            link.adminState = std::move(line.value);
        } else if (line.key == "NETWORK_FILE") {
            link.networkFile = std::move(line.value);
        }
    }
    if (link.adminState.empty() && link.damage.empty()) {
        link.damage = "no ADMIN_STATE";
    }
    return link;
}

void readNetworkd(const Roots& roots, ClientFacts& facts) {
    const std::vector<uid_t> writers = writersOf(roots);
    NetworkFiles files{roots, facts};
    const std::string links = roots.path(networkdLinksDirectory);
    const std::string leases = roots.path(networkdLeasesDirectory);
    if (facts.runsElsewhere(Client::Networkd)) {
        return;
    }
    const bool alive = facts.runs(Client::Networkd);
    std::vector<std::uint32_t> managed;
    for (const std::string& name : listOptionalDirectory(links, facts.diagnostics)) {
        const auto ifindex = parseNumber<std::uint32_t>(name);
        auto found = ifindex ? readLink(roots, pathIn(links, name), *ifindex, writers, files, facts)
                             : std::nullopt;
        if (found) {
            managed.push_back(*ifindex);
            (alive ? facts.managements : facts.configurations).push_back(*std::move(found));
        }
    }
    for (const std::string& name : listOptionalDirectory(leases, facts.diagnostics)) {
        const auto ifindex = parseNumber<std::uint32_t>(name);
        const std::string path = pathIn(leases, name);
        const auto text =
            ifindex ? readTrustedFile(path, writers, facts.diagnostics) : std::nullopt;
        if (!text) {
            continue;
        }
        NetworkdLease lease = parseNetworkdLease(*text);
        if (!lease.damage.empty()) {
            tellDamage(path, lease.damage, facts);
        } else if (!lease.address) {
            tellDamage(path, "no ADDRESS", facts);
        }
        if (!lease.address) {
            continue;
        }
        const bool endless = lease.lifetime == infiniteTime;
        facts.leases.push_back(
            {.client = Client::Networkd,
             .interfaceName = {},
             .ifindex = *ifindex,
             .address = *lease.address,
             .server = lease.server,
             .clientAlive =
                 alive && std::find(managed.begin(), managed.end(), *ifindex) != managed.end(),
             // The file says how long, not since when; it goes when the lease goes.
             .expires = endless ? std::optional{Lease::never} : std::nullopt,
             .options = std::move(lease.options),
             .clientIdentifier = std::move(lease.clientIdentifier),
             .pid = pidOfManager(facts, Client::Networkd),
             .origin = path});
    }
}

}  // namespace ZR::Live
