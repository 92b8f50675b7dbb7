#include "clients/NetworkManager.h"

#include <sys/stat.h>

#include <algorithm>
#include <cstddef>
#include <utility>

#include "facts/ClientFacts.h"
#include "formats/Assignments.h"
#include "formats/Files.h"
#include "formats/NetworkdLease.h"
#include "formats/Trust.h"
#include "formats/ValueFormats.h"

namespace ZR::Live {
namespace {

constexpr std::string_view internalLeasePrefix = "internal-";
constexpr std::string_view leaseSuffix = ".lease";
constexpr std::size_t uuidLength = 36;

/// "address", "address1", "addresses" and so on; "address-data" is another key.
bool isAddressKey(std::string_view key) {
    if (!key.starts_with("address")) {
        return false;
    }
    key.remove_prefix(std::string_view{"address"}.size());
    return key.empty() || key == "es" ||
           key.find_first_not_of("0123456789") == std::string_view::npos;
}

/// Takes "ADDRESS/LENGTH,GATEWAY", or in the older form a list with ";" between.
void addAddresses(std::string_view value, std::vector<IpAddress>& addresses) {
    while (!value.empty()) {
        const std::size_t end = std::min(value.find(';'), value.size());
        const std::string_view item = value.substr(0, end);
        value.remove_prefix(std::min(end + 1, value.size()));
        if (const auto address = IpAddress::ipv4FromText(item.substr(0, item.find(',')))) {
            addresses.push_back(*address);
        }
    }
}

struct ProfileFile {
    std::string path;
    std::int64_t written = 0;  // epoch seconds
    NetworkManagerProfile profile;
};

/// When a file was last written, in seconds since the epoch; 0 when it is gone.
std::int64_t timeOf(const std::string& path) {
    struct stat status {};
    return ::stat(path.c_str(), &status) == 0 ? status.st_mtim.tv_sec : 0;
}

std::vector<ProfileFile> readProfiles(const Roots& roots, ClientFacts& facts) {
    std::vector<ProfileFile> profiles;
    for (const std::string_view directory : networkManagerProfiles) {
        const std::string place = roots.path(directory);
        for (const std::string& name : listOptionalDirectory(place, facts.diagnostics)) {
            std::string path = pathIn(place, name);
            if (const auto text = readTrustedFile(path, {}, facts.diagnostics)) {
                const std::int64_t written = timeOf(path);
                profiles.push_back({.path = std::move(path),
                                    .written = written,
                                    .profile = parseNetworkManagerProfile(*text)});
            }
        }
    }
    return profiles;
}

LinkConfiguration configurationOf(const ProfileFile& file) {
    LinkConfiguration configuration = networkManagerConfiguration(file.profile);
    configuration.origin = file.path;
    return configuration;
}

/// `applied`: when the state of the device was written, which is after its profile was
/// applied. What was written to the profile since then was not.
void addManagement(std::uint32_t ifindex, const NetworkManagerDevice& device,
                   const std::string& origin, std::int64_t applied,
                   const std::vector<ProfileFile>& profiles, ClientFacts& facts) {
    LinkConfiguration management{.client = Client::NetworkManager,
                                 .dhcp4 = {},
                                 .dhcp6 = {},
                                 .staticAddresses = {},
                                 .origin = origin};
    const auto active =
        std::find_if(profiles.begin(), profiles.end(), [&](const ProfileFile& file) {
            return !device.profile.empty() && file.profile.uuid == device.profile;
        });
    if (active != profiles.end()) {
        if (active->profile.external) {
            return;
        }
        if (active->written <= applied) {
            management = configurationOf(*active);
        }
    }
    management.ifindex = ifindex;
    // Without the right to read the profile, a lease tells of it; without a lease,
    // DHCP may still be on its way.
    if (!device.options4.empty()) {
        management.dhcp4 = true;
    }
    // DHCPv6 may have given other things than an address.
    if (device.options6.contains("ip6_address")) {
        management.dhcp6 = true;
    }
    facts.managements.push_back(std::move(management));
}

void readDevices(const Roots& roots, const std::vector<ProfileFile>& profiles, ClientFacts& facts) {
    if (facts.runsElsewhere(Client::NetworkManager)) {
        return;
    }
    const bool alive = facts.runs(Client::NetworkManager);
    const std::string devices = roots.path(networkManagerDevices);
    for (const std::string& name : listOptionalDirectory(devices, facts.diagnostics)) {
        const auto ifindex = parseNumber<std::uint32_t>(name);
        const std::string path = pathIn(devices, name);
        const auto text = ifindex ? readTrustedFile(path, {}, facts.diagnostics) : std::nullopt;
        if (!text) {
            continue;
        }
        const NetworkManagerDevice device = parseNetworkManagerDevice(*text);
        if (alive && device.managed) {
            addManagement(*ifindex, device, path, timeOf(path), profiles, facts);
        } else if (alive) {
            facts.unmanagedLinks.push_back(*ifindex);
        }
        for (const auto& lease :
             {networkManagerLease4(device.options4), networkManagerLease6(device.options6)}) {
            if (lease) {
                Lease& added = facts.leases.emplace_back(*lease);
                added.ifindex = *ifindex;
                added.clientAlive = alive && device.managed;
                added.pid = pidOfManager(facts, Client::NetworkManager);
                added.origin = path;
            }
        }
    }
}

/// The files of the built-in client. Newer versions keep the address alone, in order to
/// request it again: such a file proves nothing, as the address may be another's by now.
void readInternalLeases(const Roots& roots, ClientFacts& facts) {
    const std::string directory = roots.path(networkManagerState);
    for (const std::string& name : listOptionalDirectory(directory, facts.diagnostics)) {
        const auto interface = internalLeaseInterface(name);
        std::string path = pathIn(directory, name);
        struct stat status {};
        if (!interface || ::stat(path.c_str(), &status) != 0) {
            continue;
        }
        const auto text = readTrustedFile(path, {}, facts.diagnostics);
        const NetworkdLease lease = parseNetworkdLease(text.value_or(""));
        if (!lease.address || !lease.lifetime) {
            continue;
        }
        const bool endless = *lease.lifetime >= UINT32_MAX;
        facts.leases.push_back({.client = Client::NetworkManager,
                                .interfaceName = interface,
                                .address = *lease.address,
                                .server = lease.server,
                                .expires = endless ? Lease::never
                                                   : status.st_mtim.tv_sec +
                                                         static_cast<std::int64_t>(*lease.lifetime),
                                .origin = std::move(path)});
    }
}

}  // namespace

NetworkManagerDevice parseNetworkManagerDevice(std::string_view text) {
    constexpr std::string_view prefix4 = "dhcp4.";
    constexpr std::string_view prefix6 = "dhcp6.";
    NetworkManagerDevice device;
    forEachKey(text, [&](std::string_view section, std::string_view key, std::string_view value) {
        if (section == "device") {
            if (key == "managed") {
                device.managed = value == "true";
            } else if (key == "connection-uuid") {
                device.profile = value;
            }
        } else if (section == "dhcp4" && key.starts_with(prefix4)) {
            device.options4.emplace(key.substr(prefix4.size()), value);
        } else if (section == "dhcp6" && key.starts_with(prefix6)) {
            device.options6.emplace(key.substr(prefix6.size()), value);
        }
    });
    return device;
}

NetworkManagerProfile parseNetworkManagerProfile(std::string_view text) {
    NetworkManagerProfile profile;
    forEachKey(text, [&](std::string_view section, std::string_view key, std::string_view value) {
        if (section == "connection") {
            if (key == "uuid") {
                profile.uuid = value;
            } else if (key == "interface-name") {
                profile.interfaceName = InterfaceName::from(value);
            }
        } else if (section == "ipv4") {
            if (key == "method") {
                profile.method4 = value;
            } else if (isAddressKey(key)) {
                addAddresses(value, profile.addresses4);
            }
        } else if (section == "ipv6" && key == "method") {
            profile.method6 = value;
        } else if (section == ".nmmeta" && key == "external") {
            profile.external = value == "true";
        }
    });
    return profile;
}

LinkConfiguration networkManagerConfiguration(const NetworkManagerProfile& profile) {
    LinkConfiguration configuration{.client = Client::NetworkManager,
                                    .dhcp4 = {},
                                    .dhcp6 = {},
                                    .staticAddresses = profile.addresses4};
    const std::string& method = profile.method4;
    if (method == "auto") {
        configuration.dhcp4 = true;
    } else if (method == "manual" || method == "link-local" || method == "shared" ||
               method == "disabled") {
        configuration.dhcp4 = false;
        configuration.linkLocal4 = method == "link-local";
        configuration.other4 = method == "shared";
    }
    // With "auto" the routers of the link decide whether DHCPv6 is used.
    if (profile.method6 == "dhcp") {
        configuration.dhcp6 = true;
    } else if (!profile.method6.empty() && profile.method6 != "auto") {
        configuration.dhcp6 = false;
    }
    return configuration;
}

std::optional<InterfaceName> internalLeaseInterface(std::string_view fileName) {
    if (!fileName.starts_with(internalLeasePrefix) || !fileName.ends_with(leaseSuffix)) {
        return std::nullopt;
    }
    fileName.remove_prefix(internalLeasePrefix.size());
    fileName.remove_suffix(leaseSuffix.size());
    if (fileName.size() <= uuidLength + 1 || fileName[uuidLength] != '-') {
        return std::nullopt;
    }
    return InterfaceName::from(fileName.substr(uuidLength + 1));
}

void readNetworkManager(const Roots& roots, ClientFacts& facts) {
    const std::vector<ProfileFile> profiles = readProfiles(roots, facts);
    readDevices(roots, profiles, facts);
    readInternalLeases(roots, facts);
    for (const ProfileFile& file : profiles) {
        if (file.profile.interfaceName && !file.profile.external) {
            LinkConfiguration configuration = configurationOf(file);
            configuration.interfaceName = file.profile.interfaceName;
            facts.configurations.push_back(std::move(configuration));
        }
    }
}

}  // namespace ZR::Live
