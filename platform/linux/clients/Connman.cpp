#include "clients/Connman.h"

#include <utility>

#include "formats/Files.h"
#include "formats/KeyFile.h"
#include "formats/Trust.h"

namespace ZR::Live {
namespace {

constexpr std::string_view settingsName = "settings";

}  // namespace

ConnmanSettings parseConnmanSettings(std::string_view text) {
    ConnmanSettings settings;
    forEachKey(text,
               [&](std::string_view /*section*/, std::string_view key, std::string_view value) {
                   if (key == "IPv4.method") {
                       settings.dhcp4 = value == "dhcp";
                   } else if (key == "IPv4.DHCP.LastAddress") {
                       settings.lastAddress = IpAddress::ipv4FromText(value);
                   }
               });
    return settings;
}

void readConnman(const Roots& roots, ClientFacts& facts) {
    if (!facts.runs(Client::Connman)) {
        return;
    }
    const std::string directory = roots.path(connmanDirectory);
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
