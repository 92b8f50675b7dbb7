#include "clients/Networkd.h"

#include <algorithm>
#include <cstddef>
#include <map>
#include <utility>

#include "formats/Files.h"
#include "formats/NetworkFile.h"
#include "formats/NetworkdLease.h"
#include "formats/Numbers.h"
#include "formats/TimeSpan.h"
#include "zrcommon/PropertyFile.h"

namespace ZR::Live {
namespace {

/// The text of a .network file and its drop-ins, each path read once per reading:
/// one file often serves many links.
class NetworkFiles {
  public:
    NetworkFiles(const Roots& roots, ClientFacts& facts) : roots_(roots), facts_(facts) {}

    /// nullopt when the file cannot be read, so that nothing is known.
    const std::optional<NetworkFile>& settings(const std::string& path) {
        const auto known = read_.find(path);
        if (known != read_.end()) {
            return known->second;
        }
        return read_.emplace(path, read(path)).first->second;
    }

  private:
    std::optional<NetworkFile> read(const std::string& path) {
        const std::size_t slash = path.rfind('/');
        if (path.empty() || path.front() != '/') {
            return std::nullopt;
        }
        const std::string_view name = std::string_view{path}.substr(slash + 1);
        watch(std::string_view{path}.substr(0, std::max<std::size_t>(slash, 1)), name);
        const auto text = readOptionalFile(roots_.path(path), facts_.diagnostics);
        if (!text) {
            return std::nullopt;
        }
        NetworkFile settings;
        applyNetworkFile(*text, settings);
        for (const auto& [dropIn, file] : dropIns(name)) {
            if (const auto more = readOptionalFile(file, facts_.diagnostics)) {
                applyNetworkFile(*more, settings);
            }
        }
        return settings;
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
    std::map<std::string, std::optional<NetworkFile>> read_;
};

}  // namespace

bool NetworkdLink::managed() const noexcept {
    // "linger" is a link that is gone.
    return !adminState.empty() && adminState != "unmanaged" && adminState != "linger";
}

NetworkdLink parseNetworkdLink(std::string_view text) {
    NetworkdLink link;
    for (PropertyLine& line : parsePropertyLines(text)) {
        if (line.key == "ADMIN_STATE") {
            link.adminState = std::move(line.value);
        } else if (line.key == "NETWORK_FILE") {
            link.networkFile = std::move(line.value);
        }
    }
    return link;
}

void readNetworkd(const Roots& roots, ClientFacts& facts) {
    NetworkFiles files{roots, facts};
    const std::string links = roots.path(networkdLinksDirectory);
    const std::string leases = roots.path(networkdLeasesDirectory);
    if (facts.runsElsewhere(Client::Networkd)) {
        return;
    }
    std::vector<std::uint32_t> managed;
    for (const std::string& name : listOptionalDirectory(links, facts.diagnostics)) {
        const auto ifindex = parseNumber<std::uint32_t>(name);
        const auto text =
            ifindex ? readOptionalFile(pathIn(links, name), facts.diagnostics) : std::nullopt;
        if (!text) {
            continue;
        }
        const NetworkdLink link = parseNetworkdLink(*text);
        if (!link.managed()) {
            continue;
        }
        managed.push_back(*ifindex);
        LinkConfiguration management{.client = Client::Networkd,
                                     .ifindex = *ifindex,
                                     .dhcp4 = {},
                                     .dhcp6 = {},
                                     .staticAddresses = {},
                                     .origin = pathIn(links, name)};
        if (!link.networkFile.empty()) {
            if (const auto& settings = files.settings(link.networkFile)) {
                management.dhcp4 = settings->dhcp4;
                management.dhcp6 = settings->dhcp6;
                management.staticAddresses = settings->addresses;
                management.linkLocal4 = settings->linkLocal4;
                management.origin = roots.path(link.networkFile);
            }
        }
        facts.managements.push_back(std::move(management));
    }
    for (const std::string& name : listOptionalDirectory(leases, facts.diagnostics)) {
        const auto ifindex = parseNumber<std::uint32_t>(name);
        const auto text =
            ifindex ? readOptionalFile(pathIn(leases, name), facts.diagnostics) : std::nullopt;
        if (!text) {
            continue;
        }
        const NetworkdLease lease = parseNetworkdLease(*text);
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
             .clientAlive = std::find(managed.begin(), managed.end(), *ifindex) != managed.end(),
             // The file says how long, not since when; it goes when the lease goes.
             .expires = endless ? std::optional{Lease::never} : std::nullopt,
             .origin = pathIn(leases, name)});
    }
}

}  // namespace ZR::Live
