#include "clients/Connman.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <utility>

#include "facts/ClientFacts.h"
#include "formats/Assignments.h"
#include "formats/Files.h"
#include "formats/Trust.h"

namespace ZR::Live {
namespace {

constexpr std::string_view settingsName = "settings";

/// The texts between commas.
std::vector<std::string> listOf(std::string_view text, const char* behindEach = "") {
    std::vector<std::string> list;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find(','), text.size());
        if (end != 0) {
            list.push_back(std::string{text.substr(0, end)} + behindEach);
        }
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return list;
}

/// Which links connman leaves alone unless it is told otherwise, by how their names begin.
constexpr std::string_view usuallyLeft = "vmnet,vboxnet,virbr,ifb,ve-,vb-";

/// The links that the connmand which runs was told to take, on its command line and in its
/// configuration.
NamePatterns linksOfConnman(const Roots& roots, ClientFacts& facts) {
    const std::string process = std::to_string(pidOfManager(facts, Client::Connman));
    NamePatterns names = connmanLinks(
        readOptionalFile(roots.proc + '/' + process + "/cmdline", facts.diagnostics).value_or(""));
    const std::string directory = roots.path(connmanConfigurationDirectory);
    const auto text =
        readTrustedFile(pathIn(directory, connmanConfigurationFile), {}, facts.diagnostics);
    std::string left{usuallyLeft};
    forEachKey(text.value_or(""),
               [&](std::string_view section, std::string_view key, std::string_view value) {
                   if (section == "General" && key == "NetworkInterfaceBlacklist") {
                       left = value;
                   }
               });
    for (std::string& pattern : listOf(left, "*")) {
        names.left.push_back(std::move(pattern));
    }
    return names;
}

/// Whether links with cables are switched on, which they are before anyone chooses.
bool usesCables(const std::string& directory, ClientFacts& facts) {
    const auto text = readTrustedFile(pathIn(directory, settingsName), {}, facts.diagnostics);
    bool uses = true;
    forEachKey(text.value_or(""),
               [&](std::string_view section, std::string_view key, std::string_view value) {
                   if (section == "Wired" && key == "Enable") {
                       uses = value == "true";
                   }
               });
    return uses;
}

}  // namespace

ConnmanSettings parseConnmanSettings(std::string_view text) {
    ConnmanSettings settings;
    forEachKey(text,
               [&](std::string_view /*section*/, std::string_view key, std::string_view value) {
                   if (key == "IPv4.method") {
                       settings.dhcp4 = value == "dhcp";
                   } else if (key == "AutoConnect") {
                       settings.autoConnect = value == "true";
                   } else if (key == "IPv4.DHCP.LastAddress") {
                       settings.lastAddress = IpAddress::ipv4FromText(value);
                   }
               });
    return settings;
}

std::string connmanHardwareAddress(std::string_view service) {
    constexpr std::string_view prefix = "ethernet_";
    constexpr std::string_view suffix = "_cable";
    constexpr std::size_t digits = 12;
    if (service.size() != prefix.size() + digits + suffix.size() || !service.starts_with(prefix) ||
        !service.ends_with(suffix)) {
        return {};
    }
    return std::string{service.substr(prefix.size(), digits)};
}

NamePatterns connmanLinks(std::string_view commandLine) {
    struct Option {
        std::string_view name;
        std::string_view longName;
        std::vector<std::string> NamePatterns::*list;
    };
    constexpr std::array options{Option{"-i", "--device", &NamePatterns::taken},
                                 Option{"-I", "--nodevice", &NamePatterns::left}};
    NamePatterns names;
    const Option* awaited = nullptr;  // its value is the next argument
    while (!commandLine.empty()) {
        const std::size_t end = std::min(commandLine.find('\0'), commandLine.size());
        const std::string_view argument = commandLine.substr(0, end);
        commandLine.remove_prefix(std::min(end + 1, commandLine.size()));
        if (awaited != nullptr) {
            names.*(awaited->list) = listOf(argument);
            awaited = nullptr;
            continue;
        }
        for (const Option& option : options) {
            if (argument == option.name || argument == option.longName) {
                awaited = &option;
            } else if (argument.starts_with(std::string{option.longName} + '=')) {
                names.*(option.list) = listOf(argument.substr(option.longName.size() + 1));
            } else if (argument.starts_with(option.name)) {
                names.*(option.list) = listOf(argument.substr(option.name.size()));
            }
        }
    }
    return names;
}

void readConnman(const Roots& roots, ClientFacts& facts) {
    if (!facts.runs(Client::Connman)) {
        return;
    }
    const std::string directory = roots.path(connmanDirectory);
    const NamePatterns names = linksOfConnman(roots, facts);
    const bool cables = usesCables(directory, facts);
    for (const std::string& service : listOptionalDirectory(directory, facts.diagnostics)) {
        const std::string ofService = pathIn(directory, service);
        // Other files stand beside the services' directories.
        std::string path = pathIn(ofService, settingsName);
        const auto text = readTrustedFile(path, {}, facts.diagnostics);
        if (!text) {
            continue;
        }
        facts.places.push_back({.directory = ofService, .namePrefix = std::string{settingsName}});
        const ConnmanSettings settings = parseConnmanSettings(*text);
        std::string hardwareAddress = connmanHardwareAddress(service);
        if (settings.dhcp4 && settings.autoConnect && cables && !hardwareAddress.empty()) {
            facts.managements.push_back({.client = Client::Connman,
                                         .hardwareAddress = std::move(hardwareAddress),
                                         .names = names,
                                         .dhcp4 = true,
                                         .dhcp6 = {},
                                         .staticAddresses = {},
                                         .origin = path});
        }
        if (settings.dhcp4 && settings.lastAddress) {
            facts.leases.push_back({.client = Client::Connman,
                                    .interfaceName = {},
                                    .address = *settings.lastAddress,
                                    .server = {},
                                    .clientAlive = true,
                                    .expires = std::nullopt,
                                    .origin = std::move(path)});
        }
    }
}

}  // namespace ZR::Live
