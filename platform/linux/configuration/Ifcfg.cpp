#include "configuration/ConfigurationFiles.h"

#include <algorithm>
#include <cstddef>
#include <utility>

#include "formats/Assignments.h"
#include "formats/Files.h"
#include "formats/InterfaceName.h"

namespace ZR::Live {
namespace {

constexpr std::array<std::string_view, 8> leftOverSuffixes{".bak",  "~",    ".rpmsave", ".rpmnew",
                                                           ".orig", ".old", ".tmp",     ".swp"};

std::string lowerCase(std::string_view text) {
    std::string lower{text};
    std::transform(lower.begin(), lower.end(), lower.begin(), [](char letter) {
        return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
    });
    return lower;
}

/// IPADDR, IPADDR0, IPADDR_office: one address each.
bool isAddressName(std::string_view name) {
    constexpr std::string_view stem = "IPADDR";
    if (!name.starts_with(stem)) {
        return false;
    }
    name.remove_prefix(stem.size());
    return name.empty() || name.front() == '_' ||
           name.find_first_not_of("0123456789") == std::string_view::npos;
}

/// What a file says. nullopt in dhcp4 for an unknown protocol.
LinkConfiguration configurationOf(IfcfgFile&& file) {
    LinkConfiguration configuration{.client = Client::Ifcfg,
                                    .dhcp4 = {},
                                    .dhcp6 = {},
                                    .staticAddresses = std::move(file.addresses)};
    const std::string& protocol = file.bootProtocol;
    if (protocol == "dhcp" || protocol == "dhcp4" || protocol == "dhcp+autoip") {
        configuration.dhcp4 = true;
    } else if (protocol.empty()) {
        // A file with an address is of a static one. One without may be there for other
        // settings, such as the configuration's name, and leave the rest to others.
        if (!configuration.staticAddresses.empty()) {
            configuration.dhcp4 = false;
        }
    } else if (protocol == "none" || protocol.starts_with("static") || protocol == "bootp" ||
               protocol == "autoip" || protocol == "shared" || protocol == "dhcp6" ||
               protocol == "auto6" || protocol == "6to4") {
        configuration.dhcp4 = false;
        configuration.bootp4 = protocol == "bootp";
        configuration.linkLocal4 = protocol == "autoip";
        configuration.other4 = protocol == "shared";
    }
    if (file.dhcp6 || protocol == "dhcp6") {
        configuration.dhcp6 = true;
    }
    return configuration;
}

}  // namespace

IfcfgFile parseIfcfg(std::string_view text) {
    const auto assignments = parseShellAssignments(text);
    IfcfgFile file;
    file.device = lastValue(assignments, "DEVICE");
    file.hardware = lastValue(assignments, "HWADDR");
    file.bootProtocol = lowerCase(lastValue(assignments, "BOOTPROTO"));
    const std::string dhcp6 = lowerCase(lastValue(assignments, "DHCPV6C"));
    file.dhcp6 = dhcp6 == "yes" || dhcp6 == "true" || dhcp6 == "1";
    for (const ShellAssignment& assignment : assignments) {
        if (isAddressName(assignment.name)) {
            if (const auto address = IpAddress::ipv4FromText(assignment.value)) {
                file.addresses.push_back(*address);
            }
        }
    }
    return file;
}

bool isIfcfgName(std::string_view name) noexcept {
    return name.starts_with(ifcfgPrefix) && name.size() > ifcfgPrefix.size() &&
           std::none_of(leftOverSuffixes.begin(), leftOverSuffixes.end(),
                        [&](std::string_view suffix) { return name.ends_with(suffix); });
}

void readIfcfg(const Roots& roots, ClientFacts& facts) {
    for (const std::string_view place : ifcfgDirectories) {
        const std::string directory = roots.path(place);
        for (const std::string& name : listOptionalDirectory(directory, facts.diagnostics)) {
            if (!isIfcfgName(name)) {
                continue;
            }
            std::string path = pathIn(directory, name);
            const auto text = readOptionalFile(path, facts.diagnostics);
            if (!text) {
                continue;
            }
            IfcfgFile file = parseIfcfg(*text);
            // A file that names its device by hardware address bears any name.
            if (file.device.empty() && file.hardware.empty()) {
                file.device = name.substr(ifcfgPrefix.size());
            }
            const auto device = InterfaceName::from(file.device);
            if (!device) {
                continue;
            }
            LinkConfiguration configuration = configurationOf(std::move(file));
            configuration.interfaceName = device;
            configuration.origin = std::move(path);
            facts.configurations.push_back(std::move(configuration));
        }
    }
}

}  // namespace ZR::Live
