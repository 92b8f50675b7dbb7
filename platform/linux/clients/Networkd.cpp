#include "clients/Networkd.h"

#include <sys/socket.h>

#include <algorithm>
#include <cstddef>
#include <map>
#include <utility>

#include "formats/AddressText.h"
#include "formats/Files.h"
#include "formats/KeyFile.h"
#include "formats/Numbers.h"
#include "zrcommon/PropertyFile.h"
#include "zrcommon/Strings.h"

namespace ZR::Live {
namespace {

struct TimeUnit {
    std::string_view name;
    std::uint64_t microseconds;
};
constexpr std::uint64_t second = 1'000'000;
constexpr std::array<TimeUnit, 10> timeUnits{{
    {"us", 1},
    {"ms", 1'000},
    {"s", second},
    {"", second},
    {"min", 60 * second},
    {"h", 3'600 * second},
    {"d", 86'400 * second},
    {"w", 604'800 * second},
    {"month", 2'629'800 * second},  // 30.44 days, a twelfth of a year
    {"y", 31'557'600 * second},     // 365.25 days
}};
constexpr std::uint64_t infiniteOnTheWire = UINT32_MAX;

constexpr std::string_view digits = "0123456789";
constexpr std::string_view blanks = " \t";

/// Whether a value is a spelling of true, of false, or of neither.
std::optional<bool> truth(std::string_view value) {
    std::string lower{value};
    std::transform(lower.begin(), lower.end(), lower.begin(), [](char letter) {
        return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
    });
    constexpr std::array<std::string_view, 6> yes{"1", "yes", "y", "true", "t", "on"};
    constexpr std::array<std::string_view, 6> no{"0", "no", "n", "false", "f", "off"};
    if (std::find(yes.begin(), yes.end(), lower) != yes.end()) {
        return true;
    }
    if (std::find(no.begin(), no.end(), lower) != no.end()) {
        return false;
    }
    return std::nullopt;
}

void applyDhcp(std::string_view value, NetworkFile& settings) {
    if (const auto both = truth(value)) {
        settings.dhcp4 = settings.dhcp6 = *both;
    } else if (value == "both") {
        settings.dhcp4 = settings.dhcp6 = true;
    } else if (value == "none") {
        settings.dhcp4 = settings.dhcp6 = false;
    } else if (value == "ipv4" || value == "v4") {
        settings.dhcp4 = true;
        settings.dhcp6 = false;
    } else if (value == "ipv6" || value == "v6") {
        settings.dhcp4 = false;
        settings.dhcp6 = true;
    }
    // networkd keeps what it had when it does not know a value, and so do we.
}

void applyAddress(std::string_view section, std::string_view value, NetworkFile& settings) {
    if (value.empty()) {
        if (section == "Network") {
            settings.addresses.clear();
        }
        return;
    }
    if (auto address = canonicalAddress(AF_INET, value.substr(0, value.find('/')))) {
        settings.addresses.push_back(*std::move(address));
    }
}

void applySetting(std::string_view section, std::string_view key, std::string_view value,
                  NetworkFile& settings) {
    if (section == "Match" && key == "Name") {
        settings.matchName = value;
    } else if (key == "Address" && (section == "Network" || section == "Address")) {
        applyAddress(section, value, settings);
    } else if (section != "Network") {
        return;
    } else if (key == "DHCP") {
        applyDhcp(value, settings);
    } else if (key == "LinkLocalAddressing") {
        settings.linkLocal4 = value == "ipv4" || truth(value).value_or(false);
    }
}

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
        const auto text = readOptionalFile(roots_.path(path), facts_.complaints);
        if (!text) {
            return std::nullopt;
        }
        NetworkFile settings;
        applyNetworkFile(*text, settings);
        for (const auto& [dropIn, file] : dropIns(name)) {
            if (const auto more = readOptionalFile(file, facts_.complaints)) {
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
                 listOptionalDirectory(roots_.path(path), facts_.complaints)) {
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

std::optional<std::uint64_t> parseTimeSpan(std::string_view text) {
    text = trim(text);
    if (text == "infinity") {
        return infiniteTime;
    }
    if (text.empty()) {
        return std::nullopt;
    }
    std::uint64_t total = 0;
    while (!text.empty()) {
        const std::size_t numberEnd = std::min(text.find_first_not_of(digits), text.size());
        const auto count = parseNumber<std::uint64_t>(text.substr(0, numberEnd));
        text.remove_prefix(numberEnd);
        text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
        const std::size_t unitEnd = std::min(text.find_first_of(" \t0123456789"), text.size());
        const std::string_view name = text.substr(0, unitEnd);
        text.remove_prefix(unitEnd);
        text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
        const auto* const unit =
            std::find_if(timeUnits.begin(), timeUnits.end(),
                         [&](const TimeUnit& known) { return known.name == name; });
        if (!count || unit == timeUnits.end() ||
            *count > (UINT64_MAX - total) / unit->microseconds) {
            return std::nullopt;
        }
        total += *count * unit->microseconds;
    }
    const std::uint64_t seconds = total / second;
    return seconds == infiniteOnTheWire ? infiniteTime : seconds;
}

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
        } else if (line.key == "DHCP_LEASE") {
            link.leaseFile = std::move(line.value);
        }
    }
    return link;
}

NetworkdLease parseNetworkdLease(std::string_view text) {
    NetworkdLease lease;
    for (const PropertyLine& line : parsePropertyLines(text)) {
        if (line.key == "ADDRESS") {
            lease.address = canonicalIPv4(line.value);
        } else if (line.key == "SERVER_ADDRESS") {
            lease.server = canonicalIPv4(line.value);
        } else if (line.key == "T1") {
            lease.renewal = parseTimeSpan(line.value);
        } else if (line.key == "T2") {
            lease.rebinding = parseTimeSpan(line.value);
        } else if (line.key == "LIFETIME") {
            lease.lifetime = parseTimeSpan(line.value);
        }
    }
    return lease;
}

void applyNetworkFile(std::string_view text, NetworkFile& settings) {
    forEachKey(text, [&](std::string_view section, std::string_view key, std::string_view value) {
        applySetting(section, key, value, settings);
    });
}

void readNetworkd(const Roots& roots, ClientFacts& facts) {
    NetworkFiles files{roots, facts};
    const std::string links = roots.path(networkdLinksDirectory);
    const std::string leases = roots.path(networkdLeasesDirectory);
    if (facts.runsElsewhere(Client::Networkd)) {
        return;
    }
    std::vector<std::uint32_t> managed;
    for (const std::string& name : listOptionalDirectory(links, facts.complaints)) {
        const auto ifindex = parseNumber<std::uint32_t>(name);
        const auto text =
            ifindex ? readOptionalFile(pathIn(links, name), facts.complaints) : std::nullopt;
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
    for (const std::string& name : listOptionalDirectory(leases, facts.complaints)) {
        const auto ifindex = parseNumber<std::uint32_t>(name);
        const auto text =
            ifindex ? readOptionalFile(pathIn(leases, name), facts.complaints) : std::nullopt;
        if (!text) {
            continue;
        }
        NetworkdLease lease = parseNetworkdLease(*text);
        if (lease.address.empty()) {
            continue;
        }
        const bool endless = lease.lifetime == infiniteTime;
        facts.leases.push_back(
            {.client = Client::Networkd,
             .interfaceName = {},
             .ifindex = *ifindex,
             .family = AF_INET,
             .address = std::move(lease.address),
             .server = std::move(lease.server),
             .clientAlive = std::find(managed.begin(), managed.end(), *ifindex) != managed.end(),
             // The file says how long, not since when; it goes when the lease goes.
             .expires = endless ? std::optional{Lease::never} : std::nullopt,
             .origin = pathIn(leases, name)});
    }
}

}  // namespace ZR::Live
